#include "reference/libsupport/db.h"

#include "reference/libsupport/refobject.h"
#include "sorvik/rovoapi.h"

#include <QFile>

#include <sqlite3.h>

namespace sorvik::rovo {

namespace status = cv::rovo::status;

Db::Db(const QString &file, bool create, int busyMilliseconds) : m_file(file)
{
    const int flags = SQLITE_OPEN_READWRITE | (create ? SQLITE_OPEN_CREATE : 0) | SQLITE_OPEN_FULLMUTEX;
    const int result = sqlite3_open_v2(QFile::encodeName(file).constData(), &m_db, flags, nullptr);
    if (result != SQLITE_OK) {
        const QString message = m_db ? QString::fromUtf8(sqlite3_errmsg(m_db)) : QStringLiteral("out of memory");
        sqlite3_close_v2(m_db);
        m_db = nullptr;
        ref::Fail(result == SQLITE_NOMEM ? status::OutOfMemory : status::StoreUnavailable,
                  QStringLiteral("the Sorvik store %1 cannot be opened: %2").arg(file, message).toStdU16String());
    }
    sqlite3_extended_result_codes(m_db, 1);
    SetBusyTimeout(busyMilliseconds);
}

Db::~Db()
{
    sqlite3_close_v2(m_db);
}

void Db::Exec(const char *sql)
{
    const int result = sqlite3_exec(m_db, sql, nullptr, nullptr, nullptr);
    if (result != SQLITE_OK)
        Raise(result, sql);
}

std::int64_t Db::Changes() const
{
    return sqlite3_changes64(m_db);
}

void Db::SetBusyTimeout(int milliseconds)
{
    sqlite3_busy_timeout(m_db, milliseconds);
}

void Db::Raise(int result, const char *what) const
{
    const QString text = QStringLiteral("the Sorvik store %1: %2 (%3)")
                             .arg(m_file, QString::fromUtf8(sqlite3_errmsg(m_db)), QString::fromUtf8(what));
    std::int32_t code = status::StoreUnavailable;
    switch (result & 0xFF) {
    case SQLITE_NOMEM:
        code = status::OutOfMemory;
        break;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
    case SQLITE_FORMAT:
        code = status::StoreCorrupt;
        break;
    case SQLITE_CONSTRAINT:
        code = status::Conflict;
        break;
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        code = status::UpdateTimedOut;
        break;
    default:
        break;
    }
    ref::Fail(code, text.toStdU16String());
}

Statement::Statement(Db &db, const char *sql) : m_db(db)
{
    const int result = sqlite3_prepare_v2(db.Handle(), sql, -1, &m_statement, nullptr);
    if (result != SQLITE_OK)
        db.Raise(result, sql);
}

Statement::~Statement()
{
    sqlite3_finalize(m_statement);
}

Statement &Statement::Bind(int index, const QString &text)
{
    const QByteArray utf8 = text.toUtf8();
    const int result = sqlite3_bind_text(m_statement, index, utf8.constData(), int(utf8.size()), SQLITE_TRANSIENT);
    if (result != SQLITE_OK)
        m_db.Raise(result, sqlite3_sql(m_statement));
    return *this;
}

Statement &Statement::Bind(int index, std::int64_t value)
{
    const int result = sqlite3_bind_int64(m_statement, index, value);
    if (result != SQLITE_OK)
        m_db.Raise(result, sqlite3_sql(m_statement));
    return *this;
}

Statement &Statement::BindUtf8(int index, std::string_view text)
{
    const int result = sqlite3_bind_text(m_statement, index, text.data(), int(text.size()), SQLITE_STATIC);
    if (result != SQLITE_OK)
        m_db.Raise(result, sqlite3_sql(m_statement));
    return *this;
}

Statement &Statement::BindNull(int index)
{
    const int result = sqlite3_bind_null(m_statement, index);
    if (result != SQLITE_OK)
        m_db.Raise(result, sqlite3_sql(m_statement));
    return *this;
}

bool Statement::Step()
{
    const int result = sqlite3_step(m_statement);
    if (result == SQLITE_ROW)
        return true;
    if (result == SQLITE_DONE)
        return false;
    m_db.Raise(result, sqlite3_sql(m_statement));
}

void Statement::Run()
{
    while (Step()) {
    }
}

void Statement::Reset()
{
    sqlite3_reset(m_statement);
    sqlite3_clear_bindings(m_statement);
}

QString Statement::Text(int column) const
{
    const auto *text = reinterpret_cast<const char *>(sqlite3_column_text(m_statement, column));
    return text ? QString::fromUtf8(text, sqlite3_column_bytes(m_statement, column)) : QString();
}

std::string Statement::Utf8(int column) const
{
    const auto *text = reinterpret_cast<const char *>(sqlite3_column_text(m_statement, column));
    return text ? std::string(text, std::size_t(sqlite3_column_bytes(m_statement, column))) : std::string();
}

std::int64_t Statement::Int(int column) const
{
    return sqlite3_column_int64(m_statement, column);
}

bool Statement::IsNull(int column) const
{
    return sqlite3_column_type(m_statement, column) == SQLITE_NULL;
}

Transaction::Transaction(Db &db, Kind kind, std::int32_t timeoutCode) : m_db(db), m_timeoutCode(timeoutCode)
{
    const char *begin = kind == Kind::Write ? "BEGIN IMMEDIATE" : "BEGIN";
    const int result = sqlite3_exec(db.Handle(), begin, nullptr, nullptr, nullptr);
    if ((result & 0xFF) == SQLITE_BUSY || (result & 0xFF) == SQLITE_LOCKED)
        ref::Fail(timeoutCode, QStringLiteral("the Sorvik store %1 stayed locked by another writer")
                                   .arg(db.File())
                                   .toStdU16String());
    if (result != SQLITE_OK)
        db.Raise(result, begin);
    m_open = true;
}

Transaction::~Transaction()
{
    if (m_open)
        sqlite3_exec(m_db.Handle(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void Transaction::Commit()
{
    const int result = sqlite3_exec(m_db.Handle(), "COMMIT", nullptr, nullptr, nullptr);
    if (result == SQLITE_OK) {
        m_open = false;
        return;
    }
    // A commit that did not go through is rolled back by the destructor.
    if ((result & 0xFF) == SQLITE_BUSY)
        ref::Fail(m_timeoutCode, QStringLiteral("the Sorvik store %1 stayed locked while committing")
                                     .arg(m_db.File())
                                     .toStdU16String());
    m_db.Raise(result, "COMMIT");
}

} // namespace sorvik::rovo
