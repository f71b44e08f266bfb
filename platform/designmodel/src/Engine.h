//===-- Engine.h - the SQLite connection and statements behind the models ------===//
//
// Thin owners of SQLite handles that turn every refusal of the engine into an
// Nmod_Exception::Database carrying the engine's message.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <sqlite3.h>

#include <string>

namespace Nmod_Detail {

/// The name handed to the engine for a file name: relative names get a "./" in front,
/// so that a file called "file:..." is always a file and never read as a URI.
std::string EnginePath(const std::string& fileName);

/// Calls the hook a test set with Nmod_Testing::BeforeMoveIntoPlace, if any.
void RunBeforeMoveHook(const std::string& finalPath);

/// Counts one write step and throws the injected failure when it is the chosen one.
void CountWriteStep();

class Connection {
public:
    Connection() = default;
    ~Connection();
    Connection(Connection&& other) noexcept;
    Connection& operator=(Connection&& other) noexcept;
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    /// Opens an existing file for reading only, with the defences for files that come
    /// from outside (no schema-defined functions with side effects, no writable schema).
    /// Nothing is written beside the file, not even in a write-ahead-log database; a file
    /// with unfinished changes in a log or journal beside it is refused (Format).
    static Connection OpenForReading(const std::string& fileName);
    /// Opens a file for writing (an empty file becomes a new database).
    static Connection OpenForWriting(const std::string& fileName);

    sqlite3* Get() const { return m_db; }
    /// Runs statements that return no rows.
    void Exec(const char* sql, const std::string& context) const;
    /// Closes and reports a failure to close (unfinished statements, a failing device).
    void Close(const std::string& context);
    /// Closes whatever state the connection is in; for paths that already failed.
    void Abandon() noexcept;
    /// Throws Database for `code` with the engine's message for it.
    [[noreturn]] void Fail(int code, const std::string& context) const;

private:
    explicit Connection(sqlite3* db) : m_db(db) {}
    sqlite3* m_db = nullptr;
};

class Statement {
public:
    Statement(const Connection& connection, const char* sql, std::string context);
    ~Statement();
    Statement(const Statement&) = delete;
    Statement& operator=(const Statement&) = delete;

    void Bind(int index, const std::string& text);
    void Bind(int index, long long number);
    /// True when a row is ready; false when the statement is done.
    bool Step();
    void Reset();

    bool IsNull(int column) const;
    /// The engine's storage class of the column's value (SQLITE_INTEGER, SQLITE_TEXT...):
    /// a table declared without STRICT may hold any type in any column.
    int Type(int column) const;
    long long Int(int column) const;
    /// The column as bytes (a NUL inside stays).
    std::string Text(int column) const;

private:
    const Connection& m_connection;
    sqlite3_stmt* m_stmt = nullptr;
    std::string m_context;
};

} // namespace Nmod_Detail
