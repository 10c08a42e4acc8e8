#include "SendUsingSSL.h"

CrvC_SendUsingSSL::CrvC_SendUsingSSL() = default;

void CrvC_SendUsingSSL::SendFile(const QString &file)
{
    Q_UNUSED(file);
    deleteLater();
}

void CrvC_SendUsingSSL::LaunchSSLProcess() {}
