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

constexpr std::uint16_t IDD_SORVIK_PROPERTIES = 2101;
constexpr int IDC_PROPERTY_TABS = 1201;
constexpr int IDC_IMPORT = 1202;
constexpr int IDC_EXPORT = 1203;
constexpr int IDC_CONFIG_ERROR_TEXT = 1204;
constexpr int IDC_CONFIG_ERROR_ICON = 1205;

constexpr std::uint16_t IDD_SEARCH_AREAS = 3101;
constexpr int IDC_SEARCH_AREA_TREE = 1301;
constexpr int IDC_SEARCH_AREAS_TOOLBAR = 1302; // the placeholder the toolbar is placed by

// Commands of the Search Areas page's toolbar and of its tree's context menu.
constexpr int ID_ADD_SEARCH_AREA = 32771;
constexpr int ID_EXCLUDE_SUBFOLDER = 32772;
constexpr int ID_REMOVE_SEARCH_AREA = 32773;
constexpr int ID_SEARCH_AREA_UP = 32774;
constexpr int ID_SEARCH_AREA_DOWN = 32775;
constexpr int ID_RENAME_SEARCH_AREA = 32776;
constexpr int ID_EXPLORE_FOLDER = 32777;

constexpr std::uint16_t IDD_WAIT = 4401;
constexpr int IDC_WAIT_PLACEHOLDER = 1401;
constexpr int IDC_WAIT_ANIMATION = 1402;

using sharedsource::IDCANCEL;
using sharedsource::IDHELP;
using sharedsource::IDOK;

} // namespace resources
