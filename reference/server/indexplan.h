#pragma once

#include "reference/rovoapi/catalogueinfo.h"
#include "reference/rovoapi/config.h"

#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace sorvik::server {

// What the committed configuration says is to be indexed: the search areas
// without their excluded folders, and for each extension the Parselet that
// reads its files (the first active one in priority order, by the rules the
// configuration view answers with).
struct IndexPlan
{
    struct Area
    {
        std::string path;                      // local bytes, as the file system names it
        std::vector<QString> excludedKeys;     // case folded, as the store compares paths
    };

    std::vector<Area> areas;
    // Case-folded extension (UTF-8, without "*.") -> Parselet name.
    std::map<std::string, std::string> parselets;

    // The Parselet that reads a file of this name; null when none does.
    const std::string *ParseletFor(std::string_view fileName) const;
    // Whether a folder (local bytes) is excluded from its search area.
    static bool IsExcluded(const Area &area, std::string_view folder);

    // A text that differs whenever the plan does; kept with the index, so a
    // server that starts can tell whether its index is outdated.
    std::string Fingerprint() const;

    bool operator==(const IndexPlan &other) const { return Fingerprint() == other.Fingerprint(); }
};

IndexPlan MakePlan(const rovo::Configuration &configuration, const rovo::CatalogueInfo &catalogue);

// The case-folded extension of a file name (after its last dot), as UTF-8;
// empty when it has none.
std::string ExtensionKey(std::string_view fileName);

} // namespace sorvik::server
