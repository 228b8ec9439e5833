#pragma once

// The name a new search area gets from its folder: the last path component,
// grown by one component at a time from the right while the name is taken.

#include <QString>

struct IInputTester;

namespace pages {

// currentName when path is empty; path itself when it is only separators.
QString DefaultAreaName(const QString &path, const QString &currentName, IInputTester &tester);

} // namespace pages
