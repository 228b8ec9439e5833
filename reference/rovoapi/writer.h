#pragma once

// Applies configuration changes to the store inside the caller's write
// transaction. Each change checks itself against the store as it is at that
// point of the transaction; Finish checks what must hold once all changes
// are in (no search area inside another, every excluded folder inside its
// search area). Any failure leaves the caller to roll back.

#include "reference/rovoapi/catalogueinfo.h"
#include "reference/rovoapi/config.h"
#include "reference/libsupport/db.h"

#include <QString>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

namespace sorvik::rovo {

// The policy of the store: kAreaNotAllowed when path or clientPath lies
// inside a forbidden prefix of the table area_policy.
std::int32_t AreaPolicy(Db &db, const QString &path, const QString &clientPath);

class ConfigWriter
{
public:
    // The catalogue is read only when a change needs it.
    using CatalogueSource = std::function<std::shared_ptr<const CatalogueInfo>()>;
    ConfigWriter(Db &db, CatalogueSource catalogue) : m_db(db), m_catalogueSource(std::move(catalogue)) {}

    void AddArea(const Folder &area);
    void AddExcluded(const Folder &folder);
    void RemoveFolder(const QString &path, std::int32_t flags);
    void UpdateFolder(const QString &path, const QString &clientPath, const QString &alias, bool isArea);
    void MoveFolder(const QString &oldPath, const QString &clientPath, const QString &newPath);
    void SetAreaOrder(const std::vector<QString> &paths);

    // Reads, changes and writes the settings as one.
    template <typename Change>
    void ChangeSettings(Change &&change)
    {
        Settings settings = ReadSettings(m_db);
        change(settings);
        WriteSettings(m_db, settings);
    }

    void SetParseletActive(const QString &name, bool active);
    void SetExtensionParselets(const QString &extension, const std::vector<QString> &names);
    void Request(const QString &kind, const QString &argument);

    // Replaces the whole configuration (policy and requests stay).
    void Replace(const Configuration &configuration);

    void Finish();

private:
    struct Row
    {
        std::int64_t id;
        std::optional<std::int64_t> area; // the owner of an excluded folder
        QString path;
    };
    std::optional<Row> Find(const QString &path);
    void CheckPolicy(const QString &path, const QString &clientPath);
    const CatalogueInfo &Catalogue();

    Db &m_db;
    CatalogueSource m_catalogueSource;
    std::shared_ptr<const CatalogueInfo> m_catalogue;
};

} // namespace sorvik::rovo
