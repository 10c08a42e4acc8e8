#include "VantorPath.h"

#include <QByteArray>
#include <QDir>
#include <QFileInfo>

#include <dlfcn.h>

namespace Port {

std::string VantorPath::installationRoot()
{
    // The host library lives in <root>/lib; find it through one of its own symbols.
    Dl_info info{};
    if (dladdr(reinterpret_cast<void *>(&VantorPath::installationRoot), &info) && info.dli_fname) {
        const QFileInfo library(QString::fromLocal8Bit(info.dli_fname));
        return QDir::cleanPath(library.absolutePath() + QLatin1String("/..")).toStdString();
    }
    return QDir::currentPath().toStdString();
}

VantorPath VantorPath::GetInstance()
{
    VantorPath path;
    const QByteArray env = qgetenv("VANTOR");
    for (const QByteArray &dir : env.split(':')) {
        if (!dir.isEmpty())
            path.m_roots.push_back(dir.toStdString());
    }
    path.m_roots.push_back(installationRoot());
    return path;
}

bool File::exist(const char *path)
{
    return path && *path && QFileInfo::exists(QString::fromUtf8(path));
}

} // namespace Port
