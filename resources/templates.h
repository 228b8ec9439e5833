#pragma once

// The module's dialog templates.

#include "resources/resourceids.h"
#include "sharedsource/dialogtemplate.h"

namespace resources {

sharedsource::DialogTemplate AddSearchAreaTemplate();
sharedsource::DialogTemplate IndexMonitoringTemplate();

inline constexpr sharedsource::TemplateRef kAddSearchAreaTemplate{IDD_ADD_SEARCH_AREA, &AddSearchAreaTemplate};
inline constexpr sharedsource::TemplateRef kIndexMonitoringTemplate{IDD_INDEX_MONITORING, &IndexMonitoringTemplate};

} // namespace resources
