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
// the sub-section to `access`, and releases everything again: the
// sub-section through its section, then the repository object is closed.
template<typename Access>
void withSubSection(const QString &projectFile, const char *section, const char *subSection,
                    int subSectionMode, Access access)
{
    CitP::Factory::LoadLibraryFactory(RepositoryLibrary);
    Prjrep::AutoRelease<CitI::IInterface> object(
        CitP::Factory::CreateInstance(Prjrep::IRepository::objectId()));
    if (!object)
        return;
    auto *repository =
        static_cast<Prjrep::IRepository *>(object->GetInterface(Prjrep::IRepository::iid()));
    if (!repository)
        return;
    CitI::IInterface *sectionObject = nullptr;
    const int status = repository->openSection(String::convert(projectFile), section,
                                               ReadWriteCreate, &sectionObject);
    auto *regSection = status == 1 && sectionObject
                           ? static_cast<Prjrep::IRegSection *>(
                                 sectionObject->GetInterface(Prjrep::IRegSection::iid()))
                           : nullptr;
    if (regSection) {
        Prjrep::IRegSection *sub = nullptr;
        if (regSection->openSubSection(subSection, subSectionMode, &sub) == 1 && sub) {
            access(*sub);
            regSection->releaseSubSection(sub);
        }
    }
    repository->close();
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
    static ProjectRepositoryValues values;
    return values;
}

QString ProjectRepositoryValues::getValue(const QString &projectFile, const QString &key) const
{
    QString value;
    if (projectFile.isEmpty())
        return value;
    withSubSection(projectFile, CorvidSection, CorvidSubSection, ReadWriteCreate,
                   [&](Prjrep::IRegSection &sub) {
                       Port::StringBase text;
                       sub.getValue(String::convert(key), text);
                       value = String::convert(text);
                   });
    return value;
}

void ProjectRepositoryValues::setValue(const QString &projectFile, const QString &key,
                                       const QString &value) const
{
    if (projectFile.isEmpty())
        return;
    withSubSection(projectFile, CorvidSection, CorvidSubSection, ReadWriteCreate,
                   [&](Prjrep::IRegSection &sub) {
                       sub.setValue(String::convert(key), String::convert(value));
                   });
}

QString ProjectRepositoryValues::projectAgeInDays(const QString &projectFile) const
{
    return projectAgeInDays(projectFile, QDate::currentDate());
}

QString ProjectRepositoryValues::projectAgeInDays(const QString &projectFile,
                                                  const QDate &today) const
{
    QString stamp = QLatin1String(Uninitialized);
    if (!projectFile.isEmpty()) {
        withSubSection(projectFile, ConsoleSection, ConsoleSubSection, ReadOnly,
                       [&](Prjrep::IRegSection &sub) {
                           Port::StringBase text;
                           if (sub.getValue(CreationKey, text) == 1)
                               stamp = String::convert(text);
                       });
    }
    if (stamp == QLatin1String(Uninitialized))
        return QString();
    const QDate created = QDate::fromString(stamp, Qt::ISODate);
    if (!created.isValid() || !today.isValid())
        return QString();
    return QString::number(created.daysTo(today));
}

QString ProjectRepositoryValues::projectIdentifier(const QString &projectFile,
                                                  const QString &fresh) const
{
    if (!fileExists(projectFile))
        return fresh;
    const QString stored = getValue(projectFile, QLatin1String(ProjectIdKey));
    if (!stored.isEmpty())
        return stored;
    setValue(projectFile, QLatin1String(ProjectIdKey), fresh);
    return fresh;
}

QString ProjectRepositoryValues::sendIteration(const QString &projectFile) const
{
    qlonglong number = 1;
    if (fileExists(projectFile)) {
        const QString stored = getValue(projectFile, QLatin1String(SendIterationKey));
        if (!stored.isEmpty() && !parseCounter(stored, &number))
            number = 1;
    }
    return QString::number(number);
}

void ProjectRepositoryValues::countSend(const QString &projectFile,
                                        const QString &shownIteration) const
{
    qlonglong number = 0;
    if (!fileExists(projectFile) || !parseCounter(shownIteration, &number)
        || number == std::numeric_limits<qlonglong>::max())
        return;
    // A stored counter that does not parse was shown as 1; it is left as it
    // is rather than overwritten with 2.
    const QString stored = getValue(projectFile, QLatin1String(SendIterationKey));
    qlonglong storedNumber = 0;
    if (!stored.isEmpty() && !parseCounter(stored, &storedNumber))
        return;
    setValue(projectFile, QLatin1String(SendIterationKey), QString::number(number + 1));
}
