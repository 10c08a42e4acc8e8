#pragma once

#include "ProjectModel.h"

#include "host/Interface.h"

namespace OrbProject {

// The design data of `model` (answers Dpm::IDesignData) with one reference
// for the caller. Its data store answers Dpm::IDataStore,
// Dpm::IPropertyTemplateStore and Dpm::IPropertyUITemplateStore:
//  - the property instances are the project's design properties
//    (ProjectDocument::effectiveProperties), one template each, an instance
//    when the property has a value;
//  - the property templates are found by name among the design properties,
//    then among the process properties;
//  - the UI templates are the process properties whose conditions hold under
//    the filter, in file order.
CitI::IInterface *createDesignData(const ModelPointer &model);

} // namespace OrbProject
