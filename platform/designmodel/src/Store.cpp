//===-- Store.cpp - the all-or-nothing writer of a netlist database file --------===//
#include "Port/UnitStartup.h"

#include "Store.h"

#include "Schema.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"

#include <sys/stat.h>

namespace Nmod_Detail {

namespace {

std::string Quoted(const std::string& text) {
    return "\"" + text + "\"";
}

bool Exists(const std::string& path) {
    struct stat info {};
    return ::lstat(path.c_str(), &info) == 0;
}

// The writer's reason, which names the file as given, as this library words it.
std::string CannotWrite(const std::string& finalPath, std::string why) {
    const std::string prefix = "cannot write " + finalPath + ": ";
    if (why.rfind(prefix, 0) == 0) {
        why.erase(0, prefix.size());
    }
    return "cannot write netlist database " + Quoted(finalPath) + ": " + why;
}

} // namespace

Store::Store(const std::string& finalPath, bool ngd, bool overwrite, const std::string& modelName,
             const std::string& toolName, const std::string& toolVersion)
    : m_finalPath(finalPath), m_overwrite(overwrite) {
    try {
        MakePrivateFile();
        m_db = Connection::OpenForWriting(m_tempPath);
        // The private file is thrown away on any failure, so the engine's rollback
        // journal only needs to live in memory: no second file appears in the folder.
        Exec("PRAGMA journal_mode=MEMORY");
        Exec("PRAGMA synchronous=FULL");
        Exec("BEGIN IMMEDIATE");
        Exec(kSchemaSql);
        CountWriteStep();
        Statement format(m_db,
                         "INSERT INTO nmod_format(id, kind, version, model_name, tool, "
                         "tool_version) VALUES (1, ?, ?, ?, ?, ?)",
                         "cannot write netlist database " + Quoted(m_finalPath));
        format.Bind(1, std::string(ngd ? kKindNgd : kKindNgc));
        format.Bind(2, Nmod_Model::kFormatVersion);
        format.Bind(3, modelName);
        format.Bind(4, toolName);
        format.Bind(5, toolVersion);
        format.Step();
    } catch (...) {
        m_failed = true;
        Discard();
        throw;
    }
}

void Store::RefuseAfterFailure() const {
    throw Nmod_Exception::Usage("an earlier write of netlist database " + Quoted(m_finalPath) +
                                " failed; it will not be written");
}

void Store::MakePrivateFile() {
    const auto mode =
        m_overwrite ? Port::SafeWriter::Mode::Replace : Port::SafeWriter::Mode::CreateOnly;
    std::string why;
    if (!m_writer.emplace().Open(m_finalPath, why, {}, mode)) {
        if (!m_overwrite && Exists(m_finalPath)) {
            // A dangling link or a file that came after the caller looked: never followed.
            throw Nmod_Exception::Usage("netlist database " + Quoted(m_finalPath) +
                                        " exists already; it was left as it is");
        }
        throw Nmod_Exception::Database(CannotWrite(m_finalPath, why), SQLITE_CANTOPEN);
    }
    if (m_writer->Direct()) {
        // A database is written by name and read back by pages: a device or a pipe
        // cannot hold one.
        throw Nmod_Exception::Database("cannot write netlist database " + Quoted(m_finalPath) +
                                           ": not a regular file",
                                       SQLITE_CANTOPEN);
    }
    m_tempPath = m_writer->WorkingPath();
}

void Store::Exec(const char* sql) {
    CountWriteStep();
    m_db.Exec(sql, "cannot write netlist database " + Quoted(m_finalPath));
}

long long Store::InsertDesign(const std::string& name) {
    return Guarded([&] {
        CountWriteStep();
        Statement insert(m_db, "INSERT INTO nmod_design(name) VALUES (?)",
                         "cannot store design " + Quoted(name));
        insert.Bind(1, name);
        insert.Step();
        return static_cast<long long>(sqlite3_last_insert_rowid(m_db.Get()));
    });
}

long long Store::InsertView(long long designId, const std::string& name) {
    return Guarded([&] {
        CountWriteStep();
        Statement insert(m_db, "INSERT INTO nmod_view(design_id, name) VALUES (?, ?)",
                         "cannot store view " + Quoted(name));
        insert.Bind(1, designId);
        insert.Bind(2, name);
        insert.Step();
        return static_cast<long long>(sqlite3_last_insert_rowid(m_db.Get()));
    });
}

void Store::SetViewProperty(long long viewId, const std::string& name, const std::string& value) {
    Guarded([&] {
        CountWriteStep();
        Statement insert(m_db,
                         "INSERT INTO nmod_view_property(view_id, name, value) VALUES (?, ?, ?) "
                         "ON CONFLICT(view_id, name) DO UPDATE SET value = excluded.value",
                         "cannot store property " + Quoted(name));
        insert.Bind(1, viewId);
        insert.Bind(2, name);
        insert.Bind(3, value);
        insert.Step();
    });
}

long long Store::InsertBlock(long long viewId, const std::string& name, unsigned int type) {
    return Guarded([&] {
        CountWriteStep();
        Statement insert(m_db, "INSERT INTO nmod_block(view_id, name, type) VALUES (?, ?, ?)",
                         "cannot store block " + Quoted(name));
        insert.Bind(1, viewId);
        insert.Bind(2, name);
        insert.Bind(3, static_cast<long long>(type));
        insert.Step();
        return static_cast<long long>(sqlite3_last_insert_rowid(m_db.Get()));
    });
}

void Store::Finish() {
    if (m_done) {
        return;
    }
    try {
        Guarded([&] {
            Exec("COMMIT");
            m_db.Close("cannot finish netlist database " + Quoted(m_finalPath));
            CountWriteStep();
            RunBeforeMoveHook(m_finalPath);
            MoveIntoPlace();
        });
    } catch (...) {
        Discard();
        throw;
    }
    m_done = true;
}

void Store::MoveIntoPlace() {
    std::string why;
    if (m_writer->Commit(why)) {
        return;
    }
    // Another run may have finished first, and its file is as good as ours.
    if (!m_overwrite && Exists(m_finalPath)) {
        throw Nmod_Exception::Usage("netlist database " + Quoted(m_finalPath) +
                                    " appeared while it was being written; it was left as it is");
    }
    throw Nmod_Exception::Database(
        "cannot put netlist database " + Quoted(m_finalPath) + " in place: " + why, SQLITE_IOERR);
}

void Store::Discard() noexcept {
    m_db.Abandon();
    if (!m_done) {
        m_writer.reset();
        m_tempPath.clear();
    }
}

} // namespace Nmod_Detail
