#include "ProjectRepositoryValues.h"

#include "host/AutoRelease.h"
#include "host/Factory.h"
#include "host/Repository.h"
#include "host/String.h"

#include <QFileInfo>
#include <QUuid>

#include <limits>

using Gui::Clip::String;

const char *const ProjectRepositoryValues::ProjectIdKey = "Corvid-DataCollection-Project-ID";
const char *const ProjectRepositoryValues::SendIterationKey = "Corvid-DataCollection-Send-Iteration";

namespace {

const char RepositoryLibrary[] = "libPrjrep_Repository";
const char CorvidSection[] = "Corvid";
const char CorvidSubSection[] = "DesignDataCollection";
const char ConsoleSection[] = "ProjectConsole";
const char ConsoleSubSection[] = "/_ProjRepoInternal_";
const char CreationKey[] = "PROJECT_CREATION_TIMESTAMP";
const char Uninitialized[] = "UNINITIALIZED";
const int ReadWriteCreate = 43;
const int ReadOnly = 1;

// Opens the repository of `projectFile`, its section and sub-section, hands
// the sub-section to `access` (which answers a status), and releases
// everything again: the sub-section through its section, then the repository
// object is closed. Answers the status of the step that failed, or the one
// `access` answered.
template<typename Access>
int withSubSection(const QString &projectFile, const char *section, const char *subSection, int sectionMode,
                   int subSectionMode, Access access)
{
    CitP::Factory::LoadLibraryFactory(RepositoryLibrary);
    Prjrep::AutoRelease<CitI::IInterface> object(
        CitP::Factory::CreateInstance(Prjrep::IRepository::objectId()));
    if (!object)
        return Prjrep::StatusFailed;
    auto *repository = static_cast<Prjrep::IRepository *>(object->GetInterface(Prjrep::IRepository::iid()));
    if (!repository)
        return Prjrep::StatusFailed;
    CitI::IInterface *sectionObject = nullptr;
    int status = repository->openSection(String::convert(projectFile), section, sectionMode, &sectionObject);
    auto *regSection =
        status == Prjrep::StatusOk && sectionObject
            ? static_cast<Prjrep::IRegSection *>(sectionObject->GetInterface(Prjrep::IRegSection::iid()))
            : nullptr;
    if (regSection) {
        Prjrep::IRegSection *sub = nullptr;
        status = regSection->openSubSection(subSection, subSectionMode, &sub);
        if (status == Prjrep::StatusOk && sub) {
            status = access(*sub);
            regSection->releaseSubSection(sub);
        } else if (status == Prjrep::StatusOk) {
            status = Prjrep::StatusFailed;
        }
    } else if (status == Prjrep::StatusOk) {
        status = Prjrep::StatusFailed;
    }
    repository->close();
    return status;
}

bool fileExists(const QString &projectFile)
{
    return !projectFile.isEmpty() && QFileInfo::exists(projectFile);
}

bool parseCounter(const QString &text, qlonglong *number)
{
    bool ok = false;
    *number = text.toLongLong(&ok, 10);
    return ok;
}

} // namespace

ProjectRepositoryValues &ProjectRepositoryValues::instance()
{
    static ProjectRepositoryValues values(true);
    return values;
}

const ProjectRepositoryValues &ProjectRepositoryValues::readOnly()
{
    static const ProjectRepositoryValues values(false);
    return values;
}

ProjectRepositoryValues::Lookup ProjectRepositoryValues::lookup(const QString &projectFile,
                                                                const QString &key, QString *value) const
{
    value->clear();
    if (projectFile.isEmpty())
        return Lookup::Absent;
    const int mode = m_writes ? ReadWriteCreate : ReadOnly;
    const int status = withSubSection(projectFile, CorvidSection, CorvidSubSection, mode, mode,
                                      [&](Prjrep::IRegSection &sub) {
                                          Port::StringBase text;
                                          const int found = sub.getValue(String::convert(key), text);
                                          *value = String::convert(text);
                                          return found;
                                      });
    if (status == Prjrep::StatusOk)
        return Lookup::Found;
    value->clear();
    return status == Prjrep::StatusNotFound ? Lookup::Absent : Lookup::Failed;
}

int ProjectRepositoryValues::replace(const QString &projectFile, const QString &key, bool found,
                                     const QString &expected, const QString &value) const
{
    if (!m_writes || projectFile.isEmpty())
        return Prjrep::StatusDenied;
    return withSubSection(projectFile, CorvidSection, CorvidSubSection, ReadWriteCreate, ReadWriteCreate,
                          [&](Prjrep::IRegSection &sub) {
                              const Port::StringBase old = String::convert(expected);
                              return sub.replaceValue(String::convert(key), found ? &old : nullptr,
                                                      String::convert(value));
                          });
}

QString ProjectRepositoryValues::getValue(const QString &projectFile, const QString &key) const
{
    QString value;
    lookup(projectFile, key, &value);
    return value;
}

void ProjectRepositoryValues::setValue(const QString &projectFile, const QString &key,
                                       const QString &value) const
{
    if (!m_writes || projectFile.isEmpty())
        return;
    withSubSection(
        projectFile, CorvidSection, CorvidSubSection, ReadWriteCreate, ReadWriteCreate,
        [&](Prjrep::IRegSection &sub) { return sub.setValue(String::convert(key), String::convert(value)); });
}

QString ProjectRepositoryValues::projectAgeInDays(const QString &projectFile) const
{
    return projectAgeInDays(projectFile, QDate::currentDate());
}

QString ProjectRepositoryValues::projectAgeInDays(const QString &projectFile, const QDate &today) const
{
    QString stamp = QLatin1String(Uninitialized);
    if (!projectFile.isEmpty()) {
        withSubSection(projectFile, ConsoleSection, ConsoleSubSection, m_writes ? ReadWriteCreate : ReadOnly,
                       ReadOnly, [&](Prjrep::IRegSection &sub) {
                           Port::StringBase text;
                           const int status = sub.getValue(CreationKey, text);
                           if (status == Prjrep::StatusOk)
                               stamp = String::convert(text);
                           return status;
                       });
    }
    if (stamp == QLatin1String(Uninitialized))
        return QString();
    const QDate created = QDate::fromString(stamp, Qt::ISODate);
    if (!created.isValid() || !today.isValid())
        return QString();
    return QString::number(created.daysTo(today));
}

QString ProjectRepositoryValues::projectIdentifier(const QString &projectFile, const QString &fresh) const
{
    if (!fileExists(projectFile))
        return fresh;
    const QString key = QLatin1String(ProjectIdKey);
    QString stored;
    const Lookup found = lookup(projectFile, key, &stored);
    if (found == Lookup::Failed)
        return QString();
    if (!stored.isEmpty())
        return stored;
    if (!m_writes)
        return fresh;
    // Stored only where there is still none: two reports made at once agree.
    const int status = replace(projectFile, key, found == Lookup::Found, stored, fresh);
    if (status == Prjrep::StatusOk)
        return fresh;
    if (status == Prjrep::StatusConflict && lookup(projectFile, key, &stored) == Lookup::Found)
        return stored;
    return QString();
}

QString ProjectRepositoryValues::sendIteration(const QString &projectFile) const
{
    qlonglong number = 1;
    if (fileExists(projectFile)) {
        QString stored;
        if (lookup(projectFile, QLatin1String(SendIterationKey), &stored) == Lookup::Failed)
            return QString();
        if (!stored.isEmpty() && !parseCounter(stored, &number))
            number = 1;
    }
    return QString::number(number);
}

void ProjectRepositoryValues::countSend(const QString &projectFile, const QString &shownIteration) const
{
    qlonglong shown = 0;
    if (!m_writes || !fileExists(projectFile) || !parseCounter(shownIteration, &shown))
        return;
    const QString key = QLatin1String(SendIterationKey);
    // Read, then store only if nobody stored another value in between;
    // otherwise count again from what was stored.
    for (int attempt = 0; attempt < 8; ++attempt) {
        QString stored;
        const Lookup found = lookup(projectFile, key, &stored);
        if (found == Lookup::Failed)
            return;
        // A stored counter that does not parse was shown as 1; it is left as
        // it is rather than overwritten with 2.
        qlonglong storedNumber = 0;
        if (!stored.isEmpty() && !parseCounter(stored, &storedNumber))
            return;
        const qlonglong larger = qMax(shown, storedNumber);
        if (larger == std::numeric_limits<qlonglong>::max())
            return;
        if (replace(projectFile, key, found == Lookup::Found, stored, QString::number(larger + 1))
            != Prjrep::StatusConflict)
            return;
    }
}
