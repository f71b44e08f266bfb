//===-- Engine.cpp --------------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "Engine.h"

#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Testing.h"

#include <atomic>
#include <cerrno>
#include <sys/stat.h>
#include <utility>

namespace {
std::atomic<long> g_stepsTaken{0};
std::atomic<long> g_failingStep{-1};
std::atomic<void (*)(const char*)> g_beforeMove{nullptr};
} // namespace

void Nmod_Testing::BeforeMoveIntoPlace(void (*hook)(const char* finalPath)) {
    g_beforeMove = hook;
}

void Nmod_Testing::FailWriteStep(long step) {
    g_stepsTaken = 0;
    g_failingStep = step;
}

long Nmod_Testing::WriteStepsTaken() {
    return g_stepsTaken;
}

namespace Nmod_Detail {

std::string EnginePath(const std::string& fileName) {
    if (!fileName.empty() && fileName.front() != '/') {
        return "./" + fileName;
    }
    return fileName;
}

void RunBeforeMoveHook(const std::string& finalPath) {
    if (auto* hook = g_beforeMove.load()) {
        hook(finalPath.c_str());
    }
}

void CountWriteStep() {
    const long step = g_stepsTaken++;
    if (step == g_failingStep) {
        throw Nmod_Exception::Database("injected failure: database or disk is full", SQLITE_FULL);
    }
}

Connection::~Connection() {
    Abandon();
}

Connection::Connection(Connection&& other) noexcept : m_db(std::exchange(other.m_db, nullptr)) {}

Connection& Connection::operator=(Connection&& other) noexcept {
    if (this != &other) {
        Abandon();
        m_db = std::exchange(other.m_db, nullptr);
    }
    return *this;
}

namespace {

sqlite3* Open(const std::string& fileName, int flags, const char* context) {
    sqlite3* db = nullptr;
    const int rc = sqlite3_open_v2(EnginePath(fileName).c_str(), &db, flags, nullptr);
    if (rc != SQLITE_OK) {
        // The engine hands out a handle even when opening fails, for its message.
        std::string message = std::string(context) + " \"" + fileName +
                              "\": " + (db != nullptr ? sqlite3_errmsg(db) : sqlite3_errstr(rc));
        sqlite3_close(db);
        throw Nmod_Exception::Database(std::move(message), rc & 0xff);
    }
    sqlite3_extended_result_codes(db, 0);
    return db;
}

} // namespace

namespace {

// The engine's name for a file that it may only read and that nobody changes meanwhile:
// a URI with immutable=1, so that it neither locks the file nor opens or creates the
// -wal and -shm files of a write-ahead-log database beside it. Every byte of the path
// that could mean something in a URI is escaped.
std::string ImmutableUri(const std::string& fileName) {
    static const char kHex[] = "0123456789ABCDEF";
    std::string uri = "file:";
    for (const unsigned char c : EnginePath(fileName)) {
        const bool plain = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                           (c >= '0' && c <= '9') || c == '/' || c == '.' || c == '-' || c == '_' ||
                           c == '~';
        if (plain) {
            uri += static_cast<char>(c);
        } else {
            uri += '%';
            uri += kHex[c >> 4];
            uri += kHex[c & 0xF];
        }
    }
    return uri + "?immutable=1";
}

// Read as immutable, a file whose last changes still sit in a log beside it would be
// read without them, and a file beside a rollback journal may be half written. Such a
// file is refused rather than read wrong.
void RefuseUnfinishedChanges(const std::string& fileName) {
    for (const char* suffix : {"-wal", "-journal"}) {
        struct stat info {};
        const std::string beside = fileName + suffix;
        if (::stat(beside.c_str(), &info) == 0 && info.st_size > 0) {
            std::string message = "netlist database \"";
            message.append(fileName).append("\" has changes in \"").append(beside);
            message.append("\" that were never written into it");
            throw Nmod_Exception::Format(std::move(message));
        }
    }
}

} // namespace

Connection Connection::OpenForReading(const std::string& fileName) {
    RefuseUnfinishedChanges(fileName);
    sqlite3* db = nullptr;
    const int rc =
        sqlite3_open_v2(ImmutableUri(fileName).c_str(), &db,
                        SQLITE_OPEN_READONLY | SQLITE_OPEN_URI | SQLITE_OPEN_NOMUTEX, nullptr);
    if (rc != SQLITE_OK) {
        std::string message = "cannot open netlist database \"" + fileName +
                              "\": " + (db != nullptr ? sqlite3_errmsg(db) : sqlite3_errstr(rc));
        sqlite3_close(db);
        throw Nmod_Exception::Database(std::move(message), rc & 0xff);
    }
    sqlite3_extended_result_codes(db, 0);
    Connection connection(db);
    // A netlist file may come from anywhere: functions named in its schema must not get
    // to run with side effects, and the schema itself stays out of reach.
    sqlite3_db_config(connection.m_db, SQLITE_DBCONFIG_DEFENSIVE, 1, nullptr);
    sqlite3_db_config(connection.m_db, SQLITE_DBCONFIG_TRUSTED_SCHEMA, 0, nullptr);
    sqlite3_db_config(connection.m_db, SQLITE_DBCONFIG_ENABLE_TRIGGER, 0, nullptr);
    sqlite3_db_config(connection.m_db, SQLITE_DBCONFIG_ENABLE_VIEW, 0, nullptr);
    return connection;
}

Connection Connection::OpenForWriting(const std::string& fileName) {
    return Connection(Open(fileName, SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX,
                           "cannot write netlist database"));
}

void Connection::Exec(const char* sql, const std::string& context) const {
    const int rc = sqlite3_exec(m_db, sql, nullptr, nullptr, nullptr);
    if (rc != SQLITE_OK) {
        Fail(rc, context);
    }
}

void Connection::Close(const std::string& context) {
    if (m_db == nullptr) {
        return;
    }
    const int rc = sqlite3_close(m_db);
    if (rc != SQLITE_OK) {
        std::string message = context + ": " + sqlite3_errmsg(m_db);
        Abandon();
        throw Nmod_Exception::Database(std::move(message), rc & 0xff);
    }
    m_db = nullptr;
}

void Connection::Abandon() noexcept {
    if (m_db != nullptr) {
        sqlite3_close_v2(m_db);
        m_db = nullptr;
    }
}

void Connection::Fail(int code, const std::string& context) const {
    const char* words = m_db != nullptr ? sqlite3_errmsg(m_db) : sqlite3_errstr(code);
    throw Nmod_Exception::Database(context + ": " + words, code & 0xff);
}

Statement::Statement(const Connection& connection, const char* sql, std::string context)
    : m_connection(connection), m_context(std::move(context)) {
    const int rc = sqlite3_prepare_v2(connection.Get(), sql, -1, &m_stmt, nullptr);
    if (rc != SQLITE_OK) {
        sqlite3_finalize(m_stmt);
        m_stmt = nullptr;
        connection.Fail(rc, m_context);
    }
}

Statement::~Statement() {
    sqlite3_finalize(m_stmt);
}

void Statement::Bind(int index, const std::string& text) {
    const int rc = sqlite3_bind_text(m_stmt, index, text.data(), static_cast<int>(text.size()),
                                     SQLITE_TRANSIENT);
    if (rc != SQLITE_OK) {
        m_connection.Fail(rc, m_context);
    }
}

void Statement::Bind(int index, long long number) {
    const int rc = sqlite3_bind_int64(m_stmt, index, number);
    if (rc != SQLITE_OK) {
        m_connection.Fail(rc, m_context);
    }
}

bool Statement::Step() {
    const int rc = sqlite3_step(m_stmt);
    if (rc == SQLITE_ROW) {
        return true;
    }
    if (rc == SQLITE_DONE) {
        return false;
    }
    m_connection.Fail(rc, m_context);
}

void Statement::Reset() {
    sqlite3_reset(m_stmt);
    sqlite3_clear_bindings(m_stmt);
}

bool Statement::IsNull(int column) const {
    return sqlite3_column_type(m_stmt, column) == SQLITE_NULL;
}

int Statement::Type(int column) const {
    return sqlite3_column_type(m_stmt, column);
}

long long Statement::Int(int column) const {
    return sqlite3_column_int64(m_stmt, column);
}

std::string Statement::Text(int column) const {
    const auto* bytes = reinterpret_cast<const char*>(sqlite3_column_text(m_stmt, column));
    const int length = sqlite3_column_bytes(m_stmt, column);
    return bytes != nullptr ? std::string(bytes, static_cast<size_t>(length)) : std::string();
}

} // namespace Nmod_Detail
