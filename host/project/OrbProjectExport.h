#pragma once

#include <QtCore/qglobal.h>

#if defined(ORBPROJECT_LIBRARY)
#define ORBPROJECT_EXPORT Q_DECL_EXPORT
#else
#define ORBPROJECT_EXPORT Q_DECL_IMPORT
#endif
