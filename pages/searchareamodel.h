#pragma once

// What the Search Areas page knows of the configuration: the search areas in
// their configured order, each with its excluded folders named by their
// place below it. Names and paths are compared as the user reads them: in
// the user's locale, without regard to case.

#include "sorvik/rovoapi.h"

#include <QString>

#include <cstdint>
#include <vector>

class QTreeWidgetItem;

namespace pages {

struct NoCaseLess
{
    bool operator()(QStringView a, QStringView b) const;
};

bool EqualsNoCase(const QString &a, const QString &b);
// True when inner is outer itself or lies below it; an empty path is inside
// nothing and contains nothing.
bool IsInside(const QString &inner, const QString &outer);

// Excluded folders: the path below the search area (no leading or trailing
// separator) to the absolute path, ordered by NoCaseLess. A sorted array:
// a search area has a handful, and thousands of areas load at once.
class ExclusionMap
{
public:
    struct Entry
    {
        QString relative;
        QString absolute;
    };

    // False when relative is there already; it keeps its absolute path.
    bool Add(const QString &relative, const QString &absolute);
    // The absolute path of relative, or null.
    const QString *Find(QStringView relative) const;
    // The absolute path of relative, which is no longer there; empty when it never was.
    QString Erase(QStringView relative);

    void Reserve(std::size_t count) { m_entries.reserve(count); }
    std::size_t Size() const { return m_entries.size(); }
    std::vector<Entry>::const_iterator begin() const { return m_entries.begin(); }
    std::vector<Entry>::const_iterator end() const { return m_entries.end(); }

private:
    std::vector<Entry> m_entries;
};

struct SearchAreaRecord
{
    QString name;        // the alias
    QString path;        // the folder as the configuration knows it: its key
    QString clientPath;  // the folder as this computer opens it
    QString displayText; // the text of its tree item
    ExclusionMap excluded;
    QTreeWidgetItem *item = nullptr;
};

using SearchAreaList = std::vector<SearchAreaRecord>;

// The excluded folder's path below area: one trailing separator dropped,
// area's length cut off the front, one leading separator dropped.
QString RelativeName(const QString &excluded, const QString &area);

// Replaces areas by the search areas of view. 0, or a negative result when
// the view failed; the search areas read until then stay.
std::int32_t LoadSearchAreas(cv::rovo::IConfigurationView &view, SearchAreaList &areas);

enum class PathKind
{
    Path,
    ClientPath,
};

// The first search area that path meets, by its path or its client path:
// 1 the same folder, 2 path lies inside it, -1 path contains it, 0 none.
// name receives that search area's name.
int TestPathAgainst(const SearchAreaList &areas, PathKind kind, const QString &path, QString &name);

// Where area lies below a new search area (path, clientPath): the part of
// its path after path when it lies inside by path, else the part of its
// client path after clientPath, without a leading separator; empty when it
// lies in neither, or is that same folder.
QString PlaceBelow(const SearchAreaRecord &area, const QString &path, const QString &clientPath);

} // namespace pages
