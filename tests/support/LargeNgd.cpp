//===-- tests/support/LargeNgd.cpp - large netlist files, written fast ----------===//
#include "LargeNgd.h"

#include "designmodel/Nmod_Model.h"

#include <sqlite3.h>

#include <memory>
#include <stdexcept>

namespace VnTest {

namespace {

struct CloseDb {
    void operator()(sqlite3* db) const { sqlite3_close(db); }
};
struct Finalize {
    void operator()(sqlite3_stmt* row) const { sqlite3_finalize(row); }
};
using Db = std::unique_ptr<sqlite3, CloseDb>;
using Statement = std::unique_ptr<sqlite3_stmt, Finalize>;

[[noreturn]] void Throw(sqlite3* db, const std::string& doing) {
    throw std::runtime_error(doing + ": " + (db != nullptr ? sqlite3_errmsg(db) : "no memory"));
}

void Exec(sqlite3* db, const std::string& sql) {
    if (sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr) != SQLITE_OK) {
        Throw(db, sql);
    }
}

void Text(sqlite3_stmt* row, int column, const std::string& value) {
    sqlite3_bind_text(row, column, value.data(), static_cast<int>(value.size()), SQLITE_TRANSIENT);
}

// Runs `sql` `count` times, `bind` filling in row i's values.
template <class Bind> void InsertAll(sqlite3* db, const char* sql, long count, Bind bind) {
    sqlite3_stmt* raw = nullptr;
    if (sqlite3_prepare_v2(db, sql, -1, &raw, nullptr) != SQLITE_OK) {
        Throw(db, sql);
    }
    const Statement row(raw);
    for (long i = 0; i < count; ++i) {
        bind(raw, i);
        if (sqlite3_step(raw) != SQLITE_DONE) {
            Throw(db, sql);
        }
        sqlite3_reset(raw);
    }
}

} // namespace

void WriteLargeNgd(const std::string& path, long designs, long extraViews, long extraProperties) {
    sqlite3* raw = nullptr;
    const int opened =
        sqlite3_open_v2(path.c_str(), &raw, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, nullptr);
    const Db db(raw);
    if (opened != SQLITE_OK) {
        Throw(raw, "opening " + path);
    }
    // Nobody waits for these files to be durable, and waiting for the disk dominates.
    Exec(raw, "PRAGMA journal_mode = OFF; PRAGMA synchronous = OFF; BEGIN;");
    Exec(raw, kOutsideSchema);
    Exec(raw, "INSERT INTO nmod_format VALUES (1, 'NGD', " +
                  std::to_string(Nmod_Model::kFormatVersion) + ", 'large', 'venlomer-tests', '1')");
    // A letter and a row number; appended, since GCC 12 at -O3 warns falsely (-Wrestrict)
    // on a literal put in front of a temporary string.
    const auto named = [](char letter, long i) {
        std::string name(1, letter);
        name += std::to_string(i);
        return name;
    };
    InsertAll(raw, "INSERT INTO nmod_design(id, name) VALUES (?, ?)", designs,
              [&](sqlite3_stmt* row, long i) {
                  sqlite3_bind_int64(row, 1, i + 1);
                  Text(row, 2, named('D', i));
              });
    InsertAll(raw, "INSERT INTO nmod_view(id, design_id, name) VALUES (?, ?, 'EXPANDED')", designs,
              [&](sqlite3_stmt* row, long i) {
                  sqlite3_bind_int64(row, 1, i + 1);
                  sqlite3_bind_int64(row, 2, i + 1);
              });
    InsertAll(raw, "INSERT INTO nmod_view(design_id, name) VALUES (1, ?)", extraViews,
              [&](sqlite3_stmt* row, long i) { Text(row, 1, named('V', i)); });
    InsertAll(raw, "INSERT INTO nmod_view_property(view_id, name, value) VALUES (?, 'PART', ?)",
              designs, [&](sqlite3_stmt* row, long i) {
                  sqlite3_bind_int64(row, 1, i + 1);
                  Text(row, 2, named('P', i));
              });
    InsertAll(raw, "INSERT INTO nmod_view_property(view_id, name, value) VALUES (1, ?, ?)",
              extraProperties, [&](sqlite3_stmt* row, long i) {
                  Text(row, 1, named('N', i));
                  Text(row, 2, named('v', i));
              });
    InsertAll(raw, "INSERT INTO nmod_block(view_id, name, type) VALUES (?, ?, 0)", designs,
              [&](sqlite3_stmt* row, long i) {
                  sqlite3_bind_int64(row, 1, i + 1);
                  Text(row, 2, named('B', i));
              });
    Exec(raw, "COMMIT");
}

} // namespace VnTest
