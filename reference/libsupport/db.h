#pragma once

// A thin layer over SQLite: one connection, prepared statements and
// transactions that roll back unless committed. SQLite failures become
// ref::Failure with the library's status codes.

#include <QString>

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

struct sqlite3;
struct sqlite3_stmt;

namespace sorvik::rovo {

class Db;

class Statement
{
public:
    Statement(Db &db, const char *sql);
    ~Statement();
    Statement(const Statement &) = delete;
    Statement &operator=(const Statement &) = delete;

    Statement &Bind(int index, const QString &text);
    Statement &Bind(int index, std::int64_t value);
    Statement &BindNull(int index);
    // UTF-8 (or any bytes) as text, without a copy: they must stay as they
    // are until the statement has been stepped.
    Statement &BindUtf8(int index, std::string_view text);
    // True while a row is available.
    bool Step();
    // Runs a statement that returns no rows.
    void Run();
    void Reset();

    QString Text(int column) const;
    std::string Utf8(int column) const;
    std::int64_t Int(int column) const;
    bool IsNull(int column) const;

private:
    Db &m_db;
    sqlite3_stmt *m_statement = nullptr;
};

class Db
{
public:
    // Opens (and with create, makes) the database file; waits up to
    // busyMilliseconds for locks held by others.
    Db(const QString &file, bool create, int busyMilliseconds);
    ~Db();
    Db(const Db &) = delete;
    Db &operator=(const Db &) = delete;

    sqlite3 *Handle() const { return m_db; }
    const QString &File() const { return m_file; }
    std::mutex &Lock() { return m_lock; }

    void Exec(const char *sql);
    std::int64_t Changes() const;
    void SetBusyTimeout(int milliseconds);

    // Raises the Failure matching SQLite's result code.
    [[noreturn]] void Raise(int result, const char *what) const;

private:
    QString m_file;
    sqlite3 *m_db = nullptr;
    std::mutex m_lock;
};

class Transaction
{
public:
    enum class Kind { Read, Write };
    // A write transaction that cannot get the lock in time fails with
    // timeoutCode (the commit time-out for commits).
    Transaction(Db &db, Kind kind, std::int32_t timeoutCode);
    ~Transaction();
    Transaction(const Transaction &) = delete;
    Transaction &operator=(const Transaction &) = delete;

    void Commit();

private:
    Db &m_db;
    std::int32_t m_timeoutCode;
    bool m_open = false;
};

} // namespace sorvik::rovo
