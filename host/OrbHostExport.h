#pragma once

#include <QtCore/qglobal.h>

#if defined(ORBHOST_LIBRARY)
#define ORBHOST_EXPORT Q_DECL_EXPORT
#else
#define ORBHOST_EXPORT Q_DECL_IMPORT
#endif

#if defined(ORBHOSTGUI_LIBRARY)
#define ORBHOSTGUI_EXPORT Q_DECL_EXPORT
#else
#define ORBHOSTGUI_EXPORT Q_DECL_IMPORT
#endif
