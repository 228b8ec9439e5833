#pragma once

// The module's dialog templates.

#include "resources/resourceids.h"
#include "sharedsource/dialogtemplate.h"

namespace resources {

sharedsource::DialogTemplate AddSearchAreaTemplate();
sharedsource::DialogTemplate IndexMonitoringTemplate();
sharedsource::DialogTemplate SorvikPropertiesTemplate();
sharedsource::DialogTemplate SearchAreasTemplate();
sharedsource::DialogTemplate WaitTemplate();

inline constexpr sharedsource::TemplateRef kAddSearchAreaTemplate{IDD_ADD_SEARCH_AREA, &AddSearchAreaTemplate};
inline constexpr sharedsource::TemplateRef kIndexMonitoringTemplate{IDD_INDEX_MONITORING, &IndexMonitoringTemplate};
inline constexpr sharedsource::TemplateRef kSorvikPropertiesTemplate{IDD_SORVIK_PROPERTIES, &SorvikPropertiesTemplate};
inline constexpr sharedsource::TemplateRef kSearchAreasTemplate{IDD_SEARCH_AREAS, &SearchAreasTemplate};
inline constexpr sharedsource::TemplateRef kWaitTemplate{IDD_WAIT, &WaitTemplate};

} // namespace resources
