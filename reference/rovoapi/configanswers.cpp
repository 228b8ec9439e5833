#include "reference/rovoapi/configanswers.h"

namespace sorvik::rovo {

std::vector<QString> ConfigAnswers::SearchAreas() const
{
    std::vector<QString> paths;
    for (const SearchArea &area : m_configuration.areas)
        paths.push_back(area.path);
    return paths;
}

const SearchArea *ConfigAnswers::FindArea(const QString &key) const
{
    for (const SearchArea &area : m_configuration.areas) {
        if (Key(area.path) == key)
            return &area;
    }
    return nullptr;
}

std::optional<std::vector<QString>> ConfigAnswers::ExcludedFolders(const QString &areaKey) const
{
    const SearchArea *area = FindArea(areaKey);
    if (!area)
        return std::nullopt;
    std::vector<QString> paths;
    for (const Folder &folder : area->excluded)
        paths.push_back(folder.path);
    return paths;
}

const Folder *ConfigAnswers::FindFolder(const QString &key) const
{
    for (const SearchArea &area : m_configuration.areas) {
        if (Key(area.path) == key)
            return &area;
        for (const Folder &folder : area.excluded) {
            if (Key(folder.path) == key)
                return &folder;
        }
    }
    return nullptr;
}

bool ConfigAnswers::IsSearchArea(const QString &key) const
{
    return FindArea(key) != nullptr;
}

bool ConfigAnswers::IsExcludedFolder(const QString &key) const
{
    const Folder *folder = FindFolder(key);
    return folder && !FindArea(key);
}

bool ConfigAnswers::IsActive(const ParseletInfo &parselet) const
{
    for (const ParseletSetting &setting : m_configuration.parselets) {
        if (Key(setting.name) == Key(parselet.name))
            return setting.active;
    }
    return parselet.ActiveByDefault();
}

std::vector<QString> ConfigAnswers::ExtensionParselets(const QString &extensionKey) const
{
    std::vector<QString> explicitOrder;
    for (const ExtensionPriority &priority : m_configuration.priorities) {
        if (Key(priority.extension) == extensionKey)
            explicitOrder.insert(explicitOrder.end(), priority.parselets.begin(), priority.parselets.end());
    }
    std::vector<QString> names;
    for (const ParseletInfo *parselet : rovo::ExtensionParselets(m_catalogue, extensionKey, explicitOrder,
                                                                 [this](const ParseletInfo &p) { return IsActive(p); }))
        names.push_back(parselet->name);
    return names;
}

} // namespace sorvik::rovo
