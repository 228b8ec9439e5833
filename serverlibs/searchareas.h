#pragma once

// Search-area changes recorded in a configuration editor, shared by the
// service object's operations and the dialogs that add and edit search
// areas. Nothing here commits; the caller commits once it is done.

#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"
#include "sorvik/wstring.h"

#include <functional>
#include <span>
#include <string_view>

namespace cv::vek::rovo::serverlibs {

using SorvikOpener = std::function<krn::RefPtr<cv::rovo::ISorvik>(const krn::WString &connection)>;

// Opens Sorvik objects through the module's bindings.
SorvikOpener ModuleSorvikOpener();

// The server objects of one operation on the configuration.
struct SorvikConfiguration
{
    krn::RefPtr<cv::rovo::ISorvik> sorvik;
    krn::RefPtr<cv::rovo::IConfigurationView> view;
    krn::RefPtr<cv::rovo::IConfigurationEditor> editor;
};

// Opens the Sorvik object and takes its view and editor. A missing one
// raises -800 "out of memory"; what was taken is released again.
SorvikConfiguration OpenConfiguration(const SorvikOpener &open, const krn::WString &connection);
// The same for operations that need the editor only (view stays null).
SorvikConfiguration OpenConfigurationEditor(const SorvikOpener &open, const krn::WString &connection);

struct SearchAreaNames
{
    krn::WString clientPath;
    krn::WString alias;
};

// The texts of a string list (none for a null list), valid while it is held.
std::span<const krn::WString> Texts(cv::vekex::IStringList *list);

krn::RefPtr<cv::vekex::IStringList> ListSearchAreas(cv::rovo::IConfigurationView &view);
// Null when area is not a search area.
krn::RefPtr<cv::vekex::IStringList> ListExcludedFolders(cv::rovo::IConfigurationView &view,
                                                        std::u16string_view area);
SearchAreaNames GetSearchArea(cv::rovo::IConfigurationView &view, const krn::WString &path);
bool IsSearchArea(cv::rovo::IConfigurationView &view, const krn::WString &path);
bool IsExcludedFolder(cv::rovo::IConfigurationView &view, const krn::WString &path);

// Records a new search area and lets it absorb every existing search area
// that lies inside it (by path, else by client path): each such area is
// removed and its excluded folders become excluded folders of the new area
// at the same places, named by their path relative to the new area.
void AddSearchArea(cv::rovo::IConfigurationEditor &editor, cv::rovo::IConfigurationView &view,
                   std::u16string_view path, std::u16string_view alias, std::u16string_view clientPath);

// Records the edit of the search area oldPath: a new alias, and when
// newPath differs (case ignored) a move of the area and of its excluded
// folders, which keep their places below it.
void EditSearchArea(cv::rovo::IConfigurationEditor &editor, cv::rovo::IConfigurationView &view,
                    std::u16string_view oldPath, std::u16string_view clientPath, std::u16string_view oldAlias,
                    std::u16string_view newPath, std::u16string_view newAlias);

// Records path as an excluded folder named after its last component.
void ExcludeFolder(cv::rovo::IConfigurationEditor &editor, std::u16string_view path);

void RemoveFolder(cv::rovo::IConfigurationEditor &editor, std::u16string_view path);

void Commit(cv::rovo::IConfigurationEditor &editor);

} // namespace cv::vek::rovo::serverlibs
