#include "RepositoryAccess.h"

#include "host/AutoRelease.h"
#include "host/Factory.h"
#include "host/Repository.h"
#include "host/String.h"

#include <functional>

using Gui::Clip::String;

const char *const RepositoryAccess::CreationSection = "ProjectConsole";
const char *const RepositoryAccess::CreationSubSection = "/_ProjRepoInternal_";
const char *const RepositoryAccess::CreationKey = "PROJECT_CREATION_TIMESTAMP";

namespace {

const char LibraryName[] = "libPrjrep_Repository";

QString statusText(int status)
{
    switch (status) {
    case Prjrep::StatusNotFound:
        return QStringLiteral("not found");
    case Prjrep::StatusDenied:
        return QStringLiteral("not allowed");
    default:
        return QStringLiteral("the repository cannot be read or written");
    }
}

bool fail(QString *error, const QString &message)
{
    if (error)
        *error = message;
    return false;
}

// Opens section and sub-section with `mode`, runs `operation` on the
// sub-section and closes everything in order.
bool withSubSection(const QString &projectFile, const QString &section, const QString &subSection, int mode,
                    const std::function<int(Prjrep::IRegSection &)> &operation, const QString &what,
                    QString *error)
{
    const QString where = QStringLiteral("%1: repository %2/%3").arg(projectFile, section, subSection);
    if (!CitP::Factory::LoadLibraryFactory(LibraryName))
        return fail(error, QStringLiteral("%1: the component library %2 is not installed")
                               .arg(projectFile, QLatin1String(LibraryName)));
    Prjrep::AutoRelease<CitI::IInterface> object(
        CitP::Factory::CreateInstance(Prjrep::IRepository::objectId()));
    auto *repository =
        object ? static_cast<Prjrep::IRepository *>(object->GetInterface(Prjrep::IRepository::iid()))
               : nullptr;
    if (!repository)
        return fail(error, QStringLiteral("%1: %2 provides no repository object")
                               .arg(projectFile, QLatin1String(LibraryName)));

    CitI::IInterface *sectionObject = nullptr;
    int status =
        repository->openSection(String::convert(projectFile), String::convert(section), mode, &sectionObject);
    auto *opened =
        status == Prjrep::StatusOk && sectionObject
            ? static_cast<Prjrep::IRegSection *>(sectionObject->GetInterface(Prjrep::IRegSection::iid()))
            : nullptr;
    bool done = false;
    if (!opened) {
        fail(error, QStringLiteral("%1: section: %2").arg(where, statusText(status)));
    } else {
        Prjrep::IRegSection *sub = nullptr;
        status = opened->openSubSection(String::convert(subSection), mode, &sub);
        if (status != Prjrep::StatusOk || !sub) {
            fail(error, QStringLiteral("%1: sub-section: %2").arg(where, statusText(status)));
        } else {
            status = operation(*sub);
            done = status == Prjrep::StatusOk;
            if (!done)
                fail(error, QStringLiteral("%1: %2: %3").arg(where, what, statusText(status)));
            opened->releaseSubSection(sub);
        }
    }
    repository->close();
    return done;
}

} // namespace

bool RepositoryAccess::read(const QString &projectFile, const QString &section, const QString &subSection,
                            const QString &key, QString *value, QString *error)
{
    Port::StringBase text;
    const bool found = withSubSection(
        projectFile, section, subSection, Prjrep::ModeReadOnly,
        [&](Prjrep::IRegSection &sub) { return sub.getValue(String::convert(key), text); },
        QStringLiteral("key %1").arg(key), error);
    if (value)
        *value = found ? String::convert(text) : QString();
    return found;
}

bool RepositoryAccess::write(const QString &projectFile, const QString &section, const QString &subSection,
                             const QString &key, const QString &value, QString *error)
{
    return withSubSection(
        projectFile, section, subSection, Prjrep::ModeReadWriteCreate,
        [&](Prjrep::IRegSection &sub) { return sub.setValue(String::convert(key), String::convert(value)); },
        QStringLiteral("key %1").arg(key), error);
}
