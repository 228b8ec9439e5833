#pragma once

// Selection paths of the query interface:
//   "/#data_store_manager.storetypes" [filter]   every store type
//   "filefilters" [filter]                      file filters of a store type
// filter: "(" term { blank term } ")", term: attribute "=" value, value bare
// or in single quotes. A quoted value ends at a quote followed by a blank or
// ")", so a name holding a quote still selects.

#include <QString>

#include <utility>
#include <vector>

namespace sorvik::vekex {

struct QueryPath
{
    enum class Collection { StoreTypes, FileFilters };

    Collection collection = Collection::StoreTypes;
    bool absolute = false;
    std::vector<std::pair<QString, QString>> terms; // attribute, value
};

// Raises Failure with InvalidQuery and a text that says where the path breaks.
QueryPath ParseQueryPath(const QString &path);

} // namespace sorvik::vekex
