//===-- tools/editor/EditLock.h - one editor per constraint file ----------===//
//
// \file
// A lock file beside the constraint file ("P.lock", or a cut name with a hash for names
// too long for that) holding the editor's process id and port. A second editor on the
// same file is refused with both named; a lock whose process is gone (a killed editor)
// or is no venlomer any more (its pid reused) is stale and taken over. The lock is
// published whole through the safe writer's create-only mode, so two editors starting
// at once cannot both take it.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>

namespace VnTool {

class EditLock {
public:
    EditLock() = default;
    ~EditLock(); ///< removes the lock if this process holds it
    EditLock(const EditLock&) = delete;
    EditLock& operator=(const EditLock&) = delete;

    /// Takes the lock of `pcf` for this process serving on `port`. False with a reason
    /// naming the holder's pid and port when another live editor holds it.
    bool Take(const std::string& pcf, int port, std::string& error);
    /// Where the lock is.
    const std::string& Path() const { return m_path; }
    /// Whether the last Take() found a stale lock and took it over.
    bool TookOverStale() const { return m_stale; }

private:
    std::string m_path;
    std::string m_text; // what this process wrote
    bool m_held = false;
    bool m_stale = false;
};

} // namespace VnTool
