#include "pages/searchareamodel.h"

#include "krn/nocase.h"
#include "pages/propertypage.h"
#include "serverlibs/searchareas.h"
#include "serverlibs/serverpaths.h"
#include "sorvik/vekexception.h"
#include "sorvik/wstringqt.h"

#include <algorithm>

namespace pages {

namespace serverlibs = cv::vek::rovo::serverlibs;
using cv::krn::ToQString;
using cv::krn::ToView;

namespace {

std::u16string_view View(QStringView text)
{
    return std::u16string_view(text.utf16(), std::size_t(text.size()));
}

// The first entry whose name is not before relative (const or not).
template <typename Entries>
auto LowerBound(Entries &entries, QStringView relative)
{
    return std::lower_bound(
        entries.begin(), entries.end(), relative,
        [](const ExclusionMap::Entry &entry, QStringView key) { return NoCaseLess()(entry.relative, key); });
}

} // namespace

bool NoCaseLess::operator()(QStringView a, QStringView b) const
{
    return cv::krn::CompareNoCase(View(a), View(b)) < 0;
}

bool ExclusionMap::Add(const QString &relative, const QString &absolute)
{
    const auto at = LowerBound(m_entries, relative);
    if (at != m_entries.end() && !NoCaseLess()(relative, at->relative))
        return false;
    m_entries.insert(at, Entry{relative, absolute});
    return true;
}

const QString *ExclusionMap::Find(QStringView relative) const
{
    const auto at = LowerBound(m_entries, relative);
    return at != m_entries.end() && !NoCaseLess()(relative, at->relative) ? &at->absolute : nullptr;
}

QString ExclusionMap::Erase(QStringView relative)
{
    const auto at = LowerBound(m_entries, relative);
    if (at == m_entries.end() || NoCaseLess()(relative, at->relative))
        return QString();
    QString absolute = std::move(at->absolute);
    m_entries.erase(at);
    return absolute;
}

bool EqualsNoCase(const QString &a, const QString &b)
{
    return cv::krn::EqualsNoCase(ToView(a), ToView(b));
}

bool IsInside(const QString &inner, const QString &outer)
{
    return serverlibs::IsFolderPrefix(ToView(outer), ToView(inner));
}

QString RelativeName(const QString &excluded, const QString &area)
{
    std::u16string_view relative = serverlibs::WithoutTrailingSeparator(ToView(excluded));
    relative.remove_prefix(std::min(relative.size(), std::size_t(area.size())));
    return ToQString(serverlibs::WithoutLeadingSeparator(relative));
}

std::int32_t LoadSearchAreas(cv::rovo::IConfigurationView &view, SearchAreaList &areas)
{
    areas.clear();
    try {
        const auto paths = serverlibs::ListSearchAreas(view);
        areas.reserve(serverlibs::Texts(paths.get()).size());
        for (const cv::krn::WString &path : serverlibs::Texts(paths.get())) {
            const serverlibs::SearchAreaNames names = serverlibs::GetSearchArea(view, path);
            SearchAreaRecord area;
            area.path = ToQString(path);
            area.clientPath = ToQString(names.clientPath);
            area.name = ToQString(names.alias);
            area.displayText = area.name;
            const auto excluded = serverlibs::ListExcludedFolders(view, path);
            area.excluded.Reserve(serverlibs::Texts(excluded.get()).size());
            for (const cv::krn::WString &folder : serverlibs::Texts(excluded.get())) {
                const QString absolute = ToQString(folder);
                area.excluded.Add(RelativeName(absolute, area.path), absolute);
            }
            areas.push_back(std::move(area));
        }
    } catch (const cv::vek::Exception &) {
        return kLoadFailed;
    }
    return 0;
}

int TestPathAgainst(const SearchAreaList &areas, PathKind kind, const QString &path, QString &name)
{
    for (const SearchAreaRecord &area : areas) {
        const QString &existing = kind == PathKind::Path ? area.path : area.clientPath;
        int result = 0;
        // Two empty paths say nothing about being the same folder.
        if (!path.isEmpty() && EqualsNoCase(existing, path))
            result = 1;
        else if (IsInside(path, existing))
            result = 2;
        else if (IsInside(existing, path))
            result = -1;
        if (result != 0) {
            name = area.name;
            return result;
        }
    }
    return 0;
}

QString PlaceBelow(const SearchAreaRecord &area, const QString &path, const QString &clientPath)
{
    std::u16string_view below;
    if (IsInside(area.path, path))
        below = ToView(area.path).substr(std::size_t(path.size()));
    else if (IsInside(area.clientPath, clientPath))
        below = ToView(area.clientPath).substr(std::size_t(clientPath.size()));
    return ToQString(serverlibs::WithoutLeadingSeparator(below));
}

} // namespace pages
