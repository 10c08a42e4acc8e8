#include "DataCollectionEmail.h"

const char *const CrvC_DataCollectionEmail::CollectionMailbox = "usage-statistics@vantor.example";

CrvC_DataCollectionEmail::CrvC_DataCollectionEmail() = default;

QStringList CrvC_DataCollectionEmail::emailTools()
{
    return QStringList();
}

void CrvC_DataCollectionEmail::send(const QString &, const QString &, const QString &,
                                    const QString &, const QString &)
{
}

void CrvC_DataCollectionEmail::onProcessError(QProcess::ProcessError) {}
