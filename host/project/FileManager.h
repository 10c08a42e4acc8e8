#pragma once

#include "ProjectModel.h"

#include "host/Interface.h"

namespace OrbProject {

// The file manager of `model` (answers Dpm::IFileManager) with one reference
// for the caller. Its iterator walks the source files in file order; a file's
// type is its listed type (or the one its suffix gives), its association an
// object answering Prjrep::IName when the file is listed with one.
CitI::IInterface *createFileManager(const ModelPointer &model);

} // namespace OrbProject
