#include "reference/rovoapi/store.h"

#include "reference/libsupport/refobject.h"
#include "reference/rovoapi/config.h"
#include "sorvik/rovoapi.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace sorvik::rovo {

namespace status = cv::rovo::status;

namespace {

constexpr std::int64_t kApplicationId = 0x534F5256; // "SORV"
constexpr std::int64_t kSchemaVersion = 1;
constexpr int kReadTimeoutMilliseconds = 5000;

const char *const kSchema[] = {
    "CREATE TABLE meta(name TEXT PRIMARY KEY, value TEXT NOT NULL) WITHOUT ROWID",
    // Search areas have no area_id and a unique alias key; excluded folders
    // belong to their search area and go with it.
    "CREATE TABLE folders("
    " id INTEGER PRIMARY KEY,"
    " path_key TEXT NOT NULL UNIQUE,"
    " path TEXT NOT NULL,"
    " client_path TEXT NOT NULL,"
    " alias TEXT NOT NULL,"
    " alias_key TEXT UNIQUE,"
    " tag TEXT NOT NULL,"
    " area_id INTEGER REFERENCES folders(id) ON DELETE CASCADE,"
    " position INTEGER NOT NULL DEFAULT 0,"
    " CHECK ((area_id IS NULL) = (alias_key IS NOT NULL)))",
    "CREATE INDEX folders_area ON folders(area_id)",
    "CREATE TABLE settings(name TEXT PRIMARY KEY, value TEXT NOT NULL) WITHOUT ROWID",
    "CREATE TABLE parselets(name_key TEXT PRIMARY KEY, name TEXT NOT NULL,"
    " active INTEGER NOT NULL CHECK (active IN (0, 1))) WITHOUT ROWID",
    "CREATE TABLE extension_priorities(extension TEXT NOT NULL, rank INTEGER NOT NULL, parselet TEXT NOT NULL,"
    " PRIMARY KEY (extension, rank)) WITHOUT ROWID",
    "CREATE TABLE requests(id INTEGER PRIMARY KEY AUTOINCREMENT, kind TEXT NOT NULL, argument TEXT NOT NULL,"
    " requested TEXT NOT NULL)",
    "CREATE TABLE area_policy(id INTEGER PRIMARY KEY, prefix TEXT NOT NULL, note TEXT NOT NULL DEFAULT '')",
};

const char *const kTables[] = {"meta", "folders", "settings", "parselets", "extension_priorities", "requests",
                               "area_policy"};

QString EncodeName(const QString &name)
{
    QString encoded;
    for (const char byte : Key(name).toUtf8()) {
        const auto c = static_cast<unsigned char>(byte);
        if ((c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '.' || c == '_' || c == '-')
            encoded += QChar(c);
        else
            encoded += QString::asprintf("%%%02X", c);
    }
    return encoded;
}

std::int64_t Pragma(Db &db, const char *sql)
{
    Statement statement(db, sql);
    return statement.Step() ? statement.Int(0) : 0;
}

Settings DefaultSettings(const QString &file)
{
    Settings settings;
    const QFileInfo info(file);
    settings.indexPath = info.absoluteDir().absoluteFilePath(info.completeBaseName() + QStringLiteral("-index"));
    return settings;
}

void Initialise(Db &db)
{
    // WAL lets readers in other processes see the last commit while a new one is written.
    Pragma(db, "PRAGMA journal_mode=WAL");
    Transaction transaction(db, Transaction::Kind::Write, status::StoreUnavailable);
    // Another process may have initialised it meanwhile.
    if (Pragma(db, "SELECT count(*) FROM sqlite_master") != 0)
        return;
    for (const char *sql : kSchema)
        db.Exec(sql);
    WriteSettings(db, DefaultSettings(db.File()));
    Statement meta(db, "INSERT INTO meta(name, value) VALUES ('index_generation', '0'), ('config_generation', '0')");
    meta.Run();
    db.Exec("PRAGMA application_id=1397707350");
    db.Exec("PRAGMA user_version=1");
    transaction.Commit();
}

void Verify(Db &db, bool full)
{
    const std::int64_t application = Pragma(db, "PRAGMA application_id");
    const std::int64_t version = Pragma(db, "PRAGMA user_version");
    if (application != kApplicationId)
        ref::Fail(status::StoreCorrupt,
                  QStringLiteral("%1 is not a Sorvik store").arg(db.File()).toStdU16String());
    if (version != kSchemaVersion)
        ref::Fail(status::StoreCorrupt, QStringLiteral("the Sorvik store %1 has version %2, this library reads %3")
                                            .arg(db.File())
                                            .arg(version)
                                            .arg(kSchemaVersion)
                                            .toStdU16String());
    for (const char *table : kTables) {
        Statement find(db, "SELECT count(*) FROM sqlite_master WHERE type = 'table' AND name = ?");
        find.Bind(1, QString::fromLatin1(table));
        if (!find.Step() || find.Int(0) != 1)
            ref::Fail(status::StoreCorrupt, QStringLiteral("the Sorvik store %1 lacks the table %2")
                                                .arg(db.File(), QString::fromLatin1(table))
                                                .toStdU16String());
    }
    if (full) {
        Statement check(db, "PRAGMA quick_check");
        if (!check.Step() || check.Text(0) != QStringLiteral("ok"))
            ref::Fail(status::StoreCorrupt, QStringLiteral("the Sorvik store %1 is damaged: %2")
                                                .arg(db.File(), check.Text(0))
                                                .toStdU16String());
        Transaction read(db, Transaction::Kind::Read, status::StoreUnavailable);
        ReadSettings(db);
    }
}

} // namespace

QString StoreFolder()
{
    const QString overridden = qEnvironmentVariable("CORVANE_SORVIK_STORE");
    if (!overridden.isEmpty())
        return overridden;
    QString data = qEnvironmentVariable("XDG_DATA_HOME");
    if (data.isEmpty())
        data = QDir::homePath() + QStringLiteral("/.local/share");
    return data + QStringLiteral("/corvane/sorvik");
}

QString StoreFile(const QString &sorvikName)
{
    const QString stem = sorvikName.isEmpty() ? QStringLiteral("local") : QStringLiteral("sorvik-") + EncodeName(sorvikName);
    return QDir(StoreFolder()).absoluteFilePath(stem + QStringLiteral(".sorvikdb"));
}

int CommitTimeoutMilliseconds()
{
    bool ok = false;
    const int value = qEnvironmentVariableIntValue("CORVANE_SORVIK_COMMIT_TIMEOUT_MS", &ok);
    return ok && value >= 0 ? value : 10000;
}

std::unique_ptr<Db> OpenStore(const QString &file, bool verify)
{
    const QFileInfo info(file);
    if (!QDir().mkpath(info.absolutePath()))
        ref::Fail(status::StoreUnavailable,
                  QStringLiteral("the store folder %1 cannot be created").arg(info.absolutePath()).toStdU16String());
    auto db = std::make_unique<Db>(file, true, kReadTimeoutMilliseconds);
    db->Exec("PRAGMA foreign_keys=ON");
    // An empty file (new, or created by an earlier attempt) becomes a store;
    // any other content must already be one.
    if (Pragma(*db, "PRAGMA application_id") == 0 && Pragma(*db, "SELECT count(*) FROM sqlite_master") == 0)
        Initialise(*db);
    Verify(*db, verify);
    return db;
}

void ResetConfiguration(Db &db)
{
    db.Exec("DELETE FROM folders");
    db.Exec("DELETE FROM parselets");
    db.Exec("DELETE FROM extension_priorities");
    WriteSettings(db, DefaultSettings(db.File()));
}

void AddRequest(Db &db, const QString &kind, const QString &argument)
{
    Statement insert(db, "INSERT INTO requests(kind, argument, requested) VALUES (?, ?, ?)");
    insert.Bind(1, kind).Bind(2, argument).Bind(3, QDateTime::currentDateTimeUtc().toString(Qt::ISODateWithMs)).Run();
}

std::int64_t ConfigGeneration(Db &db)
{
    Statement select(db, "SELECT CAST(value AS INTEGER) FROM meta WHERE name = 'config_generation'");
    return select.Step() ? select.Int(0) : 0;
}

std::int64_t AdvanceConfigGeneration(Db &db)
{
    // Stores made before the generation existed lack the row.
    db.Exec("INSERT INTO meta(name, value) VALUES ('config_generation', '1') "
            "ON CONFLICT(name) DO UPDATE SET value = CAST(value AS INTEGER) + 1");
    return ConfigGeneration(db);
}

QString CommitMarkerFile(const QString &storeFile)
{
    return storeFile + QStringLiteral("-commit");
}

void AnnounceCommit(const QString &storeFile, std::int64_t generation)
{
    QFile marker(CommitMarkerFile(storeFile));
    if (marker.open(QIODevice::WriteOnly | QIODevice::Truncate))
        marker.write(QByteArray::number(qlonglong(generation)) + '\n');
}

std::vector<StoreRequest> ReadRequests(Db &db, std::int64_t afterId)
{
    Statement select(db, "SELECT id, kind, argument FROM requests WHERE id > ? ORDER BY id");
    select.Bind(1, afterId);
    std::vector<StoreRequest> requests;
    while (select.Step())
        requests.push_back({select.Int(0), select.Text(1), select.Text(2)});
    return requests;
}

} // namespace sorvik::rovo
