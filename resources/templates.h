#pragma once

// The module's dialog templates.

#include "resources/resourceids.h"
#include "sharedsource/dialogtemplate.h"

namespace resources {

sharedsource::DialogTemplate AddSearchAreaTemplate();
sharedsource::DialogTemplate IndexMonitoringTemplate();

// Makes every template of the module known to the toolkit (once).
void RegisterDialogTemplates();

} // namespace resources
