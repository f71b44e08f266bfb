//===-- Store.h - the all-or-nothing writer of a netlist database file ----------===//
//
// A writing model puts every row through one Store; the file appears under its final
// name only when the store finishes, so a crash or a failed write never leaves a
// half-written database where a later run would take it for a finished one.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Engine.h"

#include "Port/SafeFile.h"

#include <optional>
#include <string>

namespace Nmod_Detail {

/// The file a writing model fills: a private file beside the final one, one database
/// transaction, and the move into place at the end. Without `overwrite` the move never
/// replaces a file that took the final name in the meantime.
class Store {
public:
    Store(const std::string& finalPath, bool ngd, bool overwrite, const std::string& modelName,
          const std::string& toolName, const std::string& toolVersion);
    ~Store() { Discard(); }
    Store(const Store&) = delete;
    Store& operator=(const Store&) = delete;

    long long InsertDesign(const std::string& name);
    long long InsertView(long long designId, const std::string& name);
    void SetViewProperty(long long viewId, const std::string& name, const std::string& value);
    long long InsertBlock(long long viewId, const std::string& name, unsigned int type);

    /// Commits, syncs and moves the file into place; returns only when this store's own
    /// file is under the final name. On failure nothing is left and it throws.
    void Finish();
    /// Drops the private file; the final name is not touched.
    void Discard() noexcept;
    bool IsFailed() const { return m_failed; }

private:
    /// Runs one write; any failure poisons the store, so that the file is discarded
    /// rather than finished with a hole in it.
    template <class Write> auto Guarded(Write&& write) -> decltype(write()) {
        if (m_failed) {
            RefuseAfterFailure();
        }
        try {
            return write();
        } catch (...) {
            m_failed = true;
            throw;
        }
    }
    [[noreturn]] void RefuseAfterFailure() const;
    void Exec(const char* sql);
    void MakePrivateFile();
    void MoveIntoPlace();

    std::string m_finalPath;
    std::optional<Port::SafeWriter> m_writer; // the private file and its publication
    std::string m_tempPath;
    bool m_overwrite;
    Connection m_db;
    bool m_failed = false;
    bool m_done = false;
};

} // namespace Nmod_Detail
