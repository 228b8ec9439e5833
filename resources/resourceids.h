#pragma once

// Ids of the module's dialog templates and of their controls.

#include "sharedsource/dialogtemplate.h"

#include <cstdint>

namespace resources {

constexpr std::uint16_t IDD_ADD_SEARCH_AREA = 3301;
constexpr int IDC_ALIAS_LABEL = 1001;
constexpr int IDC_ALIAS = 1002;
constexpr int IDC_PATH_LABEL = 1003;
constexpr int IDC_PATH = 1004;
constexpr int IDC_BROWSE = 1005;

constexpr std::uint16_t IDD_INDEX_MONITORING = 3501;
constexpr int IDC_TRIGGER_NONE = 1101;
constexpr int IDC_TRIGGER_FILE_CHANGES = 1102;
constexpr int IDC_TRIGGER_ICON = 1103;
constexpr int IDC_TRIGGER_EXPLANATION = 1104;

using sharedsource::IDCANCEL;
using sharedsource::IDHELP;
using sharedsource::IDOK;

} // namespace resources
