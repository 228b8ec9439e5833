#include "reference/rovoapi/writer.h"

#include "reference/libsupport/refobject.h"
#include "reference/rovoapi/store.h"

#include <algorithm>

namespace sorvik::rovo {

namespace status = cv::rovo::status;

namespace {

[[noreturn]] void Bad(std::int32_t code, const QString &text)
{
    ref::Fail(code, text.toStdU16String());
}

} // namespace

std::int32_t AreaPolicy(Db &db, const QString &path, const QString &clientPath)
{
    Statement select(db, "SELECT prefix FROM area_policy");
    while (select.Step()) {
        const QString prefix = select.Text(0);
        if (IsInside(path, prefix) || IsInside(clientPath, prefix))
            return cv::rovo::kAreaNotAllowed;
    }
    return cv::rovo::kAreaAllowed;
}

std::optional<ConfigWriter::Row> ConfigWriter::Find(const QString &path)
{
    Statement select(m_db, "SELECT id, area_id, path FROM folders WHERE path_key = ?");
    select.Bind(1, Key(path));
    if (!select.Step())
        return std::nullopt;
    Row row{select.Int(0), std::nullopt, select.Text(2)};
    if (!select.IsNull(1))
        row.area = select.Int(1);
    return row;
}

const CatalogueInfo &ConfigWriter::Catalogue()
{
    if (!m_catalogue)
        m_catalogue = m_catalogueSource();
    return *m_catalogue;
}

void ConfigWriter::CheckPolicy(const QString &path, const QString &clientPath)
{
    if (AreaPolicy(m_db, path, clientPath) == cv::rovo::kAreaNotAllowed)
        Bad(status::NotAllowed, QStringLiteral("the policy of this Sorvik forbids a search area at %1").arg(path));
}

void ConfigWriter::AddArea(const Folder &area)
{
    if (Find(area.path))
        Bad(status::Conflict, QStringLiteral("%1 is already a search area or an excluded folder").arg(area.path));
    Statement alias(m_db, "SELECT path FROM folders WHERE alias_key = ?");
    alias.Bind(1, Key(area.alias));
    if (alias.Step())
        Bad(status::Conflict,
            QStringLiteral("the alias \"%1\" is already used by the search area %2").arg(area.alias, alias.Text(0)));
    CheckPolicy(area.path, area.clientPath);
    Statement insert(m_db, "INSERT INTO folders(path_key, path, client_path, alias, alias_key, tag, area_id, position) "
                           "VALUES (?, ?, ?, ?, ?, ?, NULL, "
                           "(SELECT coalesce(max(position), -1) + 1 FROM folders WHERE area_id IS NULL))");
    insert.Bind(1, Key(area.path)).Bind(2, area.path).Bind(3, area.clientPath).Bind(4, area.alias);
    insert.Bind(5, Key(area.alias)).Bind(6, area.tag).Run();
}

void ConfigWriter::AddExcluded(const Folder &folder)
{
    if (Find(folder.path))
        Bad(status::Conflict, QStringLiteral("%1 is already a search area or an excluded folder").arg(folder.path));
    // The innermost search area that contains the folder owns it. Only the
    // folder's enclosing folders can be that area: a look-up each, however
    // many search areas there are.
    std::optional<std::int64_t> owner;
    Statement area(m_db, "SELECT id, path FROM folders WHERE path_key = ? AND area_id IS NULL");
    for (const QString &enclosing : EnclosingFolders(folder.path)) {
        area.Reset();
        area.Bind(1, Key(enclosing));
        if (area.Step() && IsInside(folder.path, area.Text(1))) {
            owner = area.Int(0);
            break;
        }
    }
    if (!owner)
        Bad(status::NotFound, QStringLiteral("the excluded folder %1 lies in no search area").arg(folder.path));
    Statement insert(m_db, "INSERT INTO folders(path_key, path, client_path, alias, alias_key, tag, area_id) "
                           "VALUES (?, ?, ?, ?, NULL, ?, ?)");
    insert.Bind(1, Key(folder.path)).Bind(2, folder.path).Bind(3, folder.clientPath).Bind(4, folder.alias);
    insert.Bind(5, folder.tag).Bind(6, *owner).Run();
}

void ConfigWriter::RemoveFolder(const QString &path, std::int32_t flags)
{
    const std::optional<Row> row = Find(path);
    if (!row)
        Bad(status::NotFound, QStringLiteral("%1 is neither a search area nor an excluded folder").arg(path));
    if (!row->area && flags == 0) {
        Statement children(m_db, "SELECT count(*) FROM folders WHERE area_id = ?");
        children.Bind(1, row->id);
        if (children.Step() && children.Int(0) != 0)
            Bad(status::Conflict, QStringLiteral("the search area %1 still has excluded folders").arg(path));
    }
    Statement remove(m_db, "DELETE FROM folders WHERE id = ?");
    remove.Bind(1, row->id).Run();
}

void ConfigWriter::UpdateFolder(const QString &path, const QString &clientPath, const QString &alias, bool isArea)
{
    const std::optional<Row> row = Find(path);
    if (!row || row->area.has_value() == isArea)
        Bad(status::NotFound,
            QStringLiteral("%1 is not %2").arg(path, isArea ? QStringLiteral("a search area") : QStringLiteral("an excluded folder")));
    if (isArea) {
        Statement other(m_db, "SELECT path FROM folders WHERE alias_key = ? AND id <> ?");
        other.Bind(1, Key(alias)).Bind(2, row->id);
        if (other.Step())
            Bad(status::Conflict,
                QStringLiteral("the alias \"%1\" is already used by the search area %2").arg(alias, other.Text(0)));
        CheckPolicy(row->path, clientPath);
    }
    Statement update(m_db, "UPDATE folders SET client_path = ?, alias = ?, "
                           "alias_key = CASE WHEN area_id IS NULL THEN ? END WHERE id = ?");
    update.Bind(1, clientPath).Bind(2, alias).Bind(3, Key(alias)).Bind(4, row->id).Run();
}

void ConfigWriter::MoveFolder(const QString &oldPath, const QString &clientPath, const QString &newPath)
{
    const std::optional<Row> row = Find(oldPath);
    if (!row)
        Bad(status::NotFound, QStringLiteral("%1 is neither a search area nor an excluded folder").arg(oldPath));
    const std::optional<Row> target = Find(newPath);
    if (target && target->id != row->id)
        Bad(status::Conflict, QStringLiteral("%1 is already a search area or an excluded folder").arg(newPath));
    if (!row->area)
        CheckPolicy(newPath, clientPath);
    Statement update(m_db, "UPDATE folders SET path_key = ?, path = ?, "
                           "client_path = CASE WHEN ? = '' THEN client_path ELSE ? END WHERE id = ?");
    update.Bind(1, Key(newPath)).Bind(2, newPath).Bind(3, clientPath).Bind(4, clientPath).Bind(5, row->id).Run();
}

void ConfigWriter::SetAreaOrder(const std::vector<QString> &paths)
{
    std::vector<std::int64_t> order;
    for (const QString &path : paths) {
        const std::optional<Row> row = Find(path);
        if (!row || row->area)
            Bad(status::NotFound, QStringLiteral("%1 is not a search area").arg(path));
        order.push_back(row->id);
    }
    Statement rest(m_db, "SELECT id FROM folders WHERE area_id IS NULL ORDER BY position, id");
    while (rest.Step()) {
        if (std::find(order.begin(), order.end(), rest.Int(0)) == order.end())
            order.push_back(rest.Int(0));
    }
    Statement update(m_db, "UPDATE folders SET position = ? WHERE id = ?");
    for (std::size_t i = 0; i < order.size(); ++i) {
        update.Bind(1, std::int64_t(i)).Bind(2, order[i]).Run();
        update.Reset();
    }
}

void ConfigWriter::SetParseletActive(const QString &name, bool active)
{
    const ParseletInfo &parselet = Catalogue().Require(name, status::NotFound);
    Statement write(m_db, "INSERT OR REPLACE INTO parselets(name_key, name, active) VALUES (?, ?, ?)");
    write.Bind(1, Key(parselet.name)).Bind(2, parselet.name).Bind(3, std::int64_t(active ? 1 : 0)).Run();
}

void ConfigWriter::SetExtensionParselets(const QString &extension, const std::vector<QString> &names)
{
    const QString key = Key(extension);
    Statement clear(m_db, "DELETE FROM extension_priorities WHERE extension = ?");
    clear.Bind(1, key).Run();
    Statement insert(m_db, "INSERT INTO extension_priorities(extension, rank, parselet) VALUES (?, ?, ?)");
    for (std::size_t rank = 0; rank < names.size(); ++rank) {
        const ParseletInfo &parselet = Catalogue().Require(names[rank], status::NotFound);
        if (!parselet.Reads(key))
            Bad(status::InvalidArgument, QStringLiteral("the Parselet %1 does not read *.%2").arg(parselet.name, extension));
        insert.Bind(1, key).Bind(2, std::int64_t(rank)).Bind(3, parselet.name).Run();
        insert.Reset();
    }
}

void ConfigWriter::Request(const QString &kind, const QString &argument)
{
    AddRequest(m_db, kind, argument);
}

void ConfigWriter::Replace(const Configuration &configuration)
{
    m_db.Exec("DELETE FROM folders");
    m_db.Exec("DELETE FROM parselets");
    m_db.Exec("DELETE FROM extension_priorities");
    for (const SearchArea &area : configuration.areas) {
        AddArea(area);
        for (const Folder &folder : area.excluded)
            AddExcluded(folder);
    }
    WriteSettings(m_db, configuration.settings);
    for (const ParseletSetting &parselet : configuration.parselets)
        SetParseletActive(parselet.name, parselet.active);
    for (const ExtensionPriority &priority : configuration.priorities)
        SetExtensionParselets(priority.extension, priority.parselets);
}

void ConfigWriter::Finish()
{
    // A search area inside another: in the sorted containment keys a key
    // that starts with another one follows it, or follows a key that also
    // starts with it, so comparing neighbours finds every nesting.
    std::vector<std::pair<QString, QString>> areas; // containment key, path
    Statement select(m_db, "SELECT path FROM folders WHERE area_id IS NULL");
    while (select.Step()) {
        const QString path = select.Text(0);
        areas.emplace_back(ContainmentKey(path), path);
    }
    std::sort(areas.begin(), areas.end());
    for (std::size_t i = 1; i < areas.size(); ++i) {
        if (areas[i].first.startsWith(areas[i - 1].first))
            Bad(status::Conflict, QStringLiteral("the search area %1 lies inside the search area %2")
                                      .arg(areas[i].second, areas[i - 1].second));
    }
    Statement excluded(m_db, "SELECT e.path, a.path FROM folders e JOIN folders a ON e.area_id = a.id");
    while (excluded.Step()) {
        const QString folder = excluded.Text(0), area = excluded.Text(1);
        if (!IsInside(folder, area) || Key(folder) == Key(area))
            Bad(status::Conflict,
                QStringLiteral("the excluded folder %1 does not lie inside its search area %2").arg(folder, area));
    }
}

} // namespace sorvik::rovo
