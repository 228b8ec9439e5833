#pragma once

// The configuration view's answers from a configuration value instead of the
// store: what views show while an import waits in an editor of their Sorvik.

#include "reference/rovoapi/catalogueinfo.h"
#include "reference/rovoapi/config.h"

#include <QString>

#include <optional>
#include <vector>

namespace sorvik::rovo {

class ConfigAnswers final
{
public:
    ConfigAnswers(const Configuration &configuration, const CatalogueInfo &catalogue)
        : m_configuration(configuration), m_catalogue(catalogue)
    {}

    std::vector<QString> SearchAreas() const;
    // Nothing when key names no search area.
    std::optional<std::vector<QString>> ExcludedFolders(const QString &areaKey) const;
    // The search area or excluded folder key names, if any.
    const Folder *FindFolder(const QString &key) const;
    bool IsSearchArea(const QString &key) const;
    bool IsExcludedFolder(const QString &key) const;
    const Settings &CurrentSettings() const { return m_configuration.settings; }
    bool IsActive(const ParseletInfo &parselet) const;
    // Active readers of the extension: in their set order, then in catalogue order.
    std::vector<QString> ExtensionParselets(const QString &extensionKey) const;

private:
    const SearchArea *FindArea(const QString &key) const;

    const Configuration &m_configuration;
    const CatalogueInfo &m_catalogue;
};

} // namespace sorvik::rovo
