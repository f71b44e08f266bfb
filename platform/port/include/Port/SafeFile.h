//===-- Port/SafeFile.h - writing files whole, reading only what can be read -----===//
//
// \file
// Every file the tool and the stand-ins write goes through SafeWriter, and every file
// they read through InputFile, so that the same guarantees hold everywhere:
//
// Writing a regular file (new or replaced):
//   - the bytes go to a temporary in the target's folder with a unique name
//     (".venlomer-PPPPPPPP-RRRRRRRR.tmp": owner pid and a random part, 30 bytes, so any
//     legal target name works), created exclusively and never through a link;
//   - Commit() syncs the temporary, renames it over the target and syncs the folder: a
//     crash or a kill leaves either the old file or the new one, whole;
//   - a replaced file keeps its mode, owner and group (a group that cannot be given
//     back is the writer's); a new one gets 0666 less the umask;
//   - a file its mode does not let the user write (0444; another owner's 0644 in a
//     writable folder) is refused, although the folder would allow replacing it, and
//     so is another owner's file whose owner could not be kept; for the superuser only
//     a file with no write bit at all is refused;
//   - a link to a regular file replaces the file it points to and the link stays;
//   - a target that is the same file as one of the inputs (same device and inode, however
//     it is spelled) is refused before anything is written;
//   - without Commit() the temporary is removed; temporaries left by killed runs are
//     removed by the next write to that folder once their run is gone.
// A character device or a FIFO (/dev/null, /dev/stdout) is written directly, as any
// Unix tool does. Directories, block devices, sockets and links to nothing are refused.
//
//   Port::SafeWriter out;
//   std::string error;
//   if (!out.Open("plan.svg", error, {"chipdb.txt"}) || !out.Write(text, error) ||
//       !out.Commit(error)) { report(error); }
//
// Reading: InputFile opens without blocking (a FIFO without writer cannot hang the
// reader), refuses anything that is not a regular file ("-" names standard input only
// where the caller allows it) and stops at a size limit with a message that names it.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstdint>
#include <istream>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace Port {

/// The largest input read by default: 512 MiB. The largest real chip database is under
/// 100 MB; everything else read is far smaller.
inline constexpr std::uint64_t kMaxInputBytes = std::uint64_t{512} << 20;

/// What identifies a file whatever its name: device and inode.
struct FileIdentity {
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    bool operator==(const FileIdentity&) const = default;
};

class VN_PORT_API SafeWriter {
public:
    enum class Mode {
        Replace,   ///< a new file, or replace the existing one
        CreateOnly ///< publish only if no file of that name exists; never replace
    };

    SafeWriter();
    ~SafeWriter(); ///< removes the temporary unless committed
    SafeWriter(const SafeWriter&) = delete;
    SafeWriter& operator=(const SafeWriter&) = delete;

    /// Prepares writing `target`. Refuses (false, reason in `error`) a target that is
    /// the same file as one of `inputs` (names) or `inputIds`, a target that cannot be
    /// written, and in CreateOnly mode a target that exists.
    bool Open(const std::string& target, std::string& error,
              const std::vector<std::string>& inputs = {}, Mode mode = Mode::Replace,
              const std::vector<FileIdentity>& inputIds = {});

    /// Appends bytes. False with a reason (a full disk, a closed pipe) in `error`.
    bool Write(std::string_view bytes, std::string& error);

    /// Publishes what was written under the target's name (see above).
    bool Commit(std::string& error);

    /// The file the bytes go to before Commit(): the temporary, or the device itself. A
    /// caller whose library writes by name (SQLite) writes here and then commits.
    const std::string& WorkingPath() const;

    /// True when the target is a device or FIFO written in place.
    bool Direct() const;

private:
    struct State;
    std::unique_ptr<State> m_state;
};

/// Writes `bytes` to `target` through a SafeWriter in one call.
VN_PORT_API bool WriteFileSafely(const std::string& target, std::string_view bytes,
                                 std::string& error, const std::vector<std::string>& inputs = {});

/// Removes the leftover temporaries of runs that are gone from `folder`; returns how many
/// were removed. Done by every Open(); public so that tests and tools can ask for it.
VN_PORT_API int CleanLeftoverTemporaries(const std::string& folder);

/// A file opened for reading under the guards above.
class VN_PORT_API InputFile {
public:
    InputFile();
    ~InputFile();
    InputFile(const InputFile&) = delete;
    InputFile& operator=(const InputFile&) = delete;

    /// Opens `path`. False with a reason naming the path when it is not a regular file,
    /// is larger than `limit`, or cannot be opened. "-" is standard input when
    /// `allowStdin`, and then may be a pipe.
    bool Open(const std::string& path, std::string& error, std::uint64_t limit = kMaxInputBytes,
              bool allowStdin = false);

    /// The contents, read in chunks. Reading stops (the stream fails) at the limit even if
    /// the file grows after Open(); ask Failed() for the reason afterwards.
    std::istream& Stream();

    /// After reading: true with a reason when the read stopped at an error or the limit.
    bool Failed(std::string& error) const;

    /// The device and inode of the open file, for SafeWriter's same-file check.
    FileIdentity Identity() const;

    /// The size seen when opened (0 for a pipe).
    std::uint64_t Size() const;

private:
    struct State;
    std::unique_ptr<State> m_state;
};

/// Reads a whole regular file into `out` under the guards of InputFile.
VN_PORT_API bool ReadRegularFile(const std::string& path, std::string& out, std::string& error,
                                 std::uint64_t limit = kMaxInputBytes);

/// `text` with bytes a terminal would act on (control characters, DEL) shown as \xHH, so
/// that a name read from a file cannot drive the terminal a message is printed on.
VN_PORT_API std::string Printable(std::string_view text);

} // namespace Port
