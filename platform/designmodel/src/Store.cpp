//===-- Store.cpp - the all-or-nothing writer of a netlist database file --------===//
#include "Port/UnitStartup.h"

#include "Store.h"

#include "Schema.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

namespace Nmod_Detail {

namespace {

std::string Quoted(const std::string& text) {
    return "\"" + text + "\"";
}

[[noreturn]] void FailSystem(const std::string& context, int error) {
    throw Nmod_Exception::Database(context + ": " + std::strerror(error), SQLITE_CANTOPEN);
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
    static std::atomic<unsigned long> s_serial{0};
    const std::filesystem::path final(m_finalPath);
    std::string base = final.filename().string();
    // Keep the private name within the folder's name length whatever the final name.
    if (base.size() > 160) {
        base.resize(160);
    }
    for (int attempt = 0;; ++attempt) {
        const std::string name =
            "." + base + ".tmp-" + std::to_string(::getpid()) + "-" + std::to_string(s_serial++);
        m_tempPath = (final.parent_path() / name).string();
        const int fd = ::open(m_tempPath.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (fd >= 0) {
            ::close(fd);
            return;
        }
        const int error = errno;
        if (error != EEXIST || attempt >= 100) {
            m_tempPath.clear();
            FailSystem("cannot write netlist database " + Quoted(m_finalPath), error);
        }
    }
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
            SyncPrivateFile();
            CountWriteStep();
            RunBeforeMoveHook(m_finalPath);
            MoveIntoPlace();
        });
    } catch (...) {
        Discard();
        throw;
    }
    m_done = true;
    // The move is only as durable as the folder entry that records it.
    const std::filesystem::path folder = std::filesystem::path(m_finalPath).parent_path();
    const int fd =
        ::open(folder.empty() ? "." : folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd >= 0) {
        ::fsync(fd);
        ::close(fd);
    }
}

void Store::SyncPrivateFile() {
    // The move must not reach the disk before the content it names: after a crash the
    // final name would hold a file with pages missing.
    const int fd = ::open(m_tempPath.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0 || ::fsync(fd) != 0) {
        const int error = errno;
        if (fd >= 0) {
            ::close(fd);
        }
        throw Nmod_Exception::Database("cannot finish netlist database " + Quoted(m_finalPath) +
                                           ": " + std::strerror(error),
                                       SQLITE_IOERR);
    }
    ::close(fd);
}

void Store::MoveIntoPlace() {
    const std::string context = "cannot put netlist database " + Quoted(m_finalPath) + " in place";
    if (m_overwrite) {
        if (std::rename(m_tempPath.c_str(), m_finalPath.c_str()) != 0) {
            FailSystem(context, errno);
        }
        return;
    }
    // Never replace a file that appeared under the final name since Create: another run
    // may have finished first, and its file is as good as ours.
    if (::renameat2(AT_FDCWD, m_tempPath.c_str(), AT_FDCWD, m_finalPath.c_str(),
                    RENAME_NOREPLACE) == 0) {
        return;
    }
    int error = errno;
    if (error == EINVAL || error == ENOSYS || error == ENOTSUP) {
        // File systems without the no-replace move still refuse to link over a file.
        if (::link(m_tempPath.c_str(), m_finalPath.c_str()) == 0) {
            ::unlink(m_tempPath.c_str());
            return;
        }
        error = errno;
    }
    if (error == EEXIST) {
        throw Nmod_Exception::Usage("netlist database " + Quoted(m_finalPath) +
                                    " appeared while it was being written; it was left as it is");
    }
    FailSystem(context, error);
}

void Store::Discard() noexcept {
    m_db.Abandon();
    if (!m_done && !m_tempPath.empty()) {
        ::unlink(m_tempPath.c_str());
        m_tempPath.clear();
    }
}

} // namespace Nmod_Detail
