//===-- SafeFile.cpp ------------------------------------------------------------===//
#include "Port/SafeFile.h"

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <random>
#include <streambuf>

#include <dirent.h>
#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Port {

namespace {

constexpr char kTempPrefix[] = ".venlomer-";
constexpr char kTempSuffix[] = ".tmp";
constexpr std::size_t kHexDigits = 8;
// A run that is gone cannot be told from one in another pid namespace writing to a shared
// folder, so a leftover must also have been left alone this long before it is removed;
// after a day it goes whatever its pid says (the pid may have been reused).
constexpr std::time_t kLeftoverQuiet = 60;
constexpr std::time_t kLeftoverStale = std::time_t{24} * 60 * 60;

std::string Reason(int error) {
    return std::strerror(error);
}

std::string Hex(std::uint32_t value) {
    char text[kHexDigits + 1];
    std::snprintf(text, sizeof text, "%08x", value);
    return text;
}

std::string Octal(unsigned value) {
    char text[16];
    std::snprintf(text, sizeof text, "%04o", value);
    return text;
}

std::string FolderOf(const std::string& path) {
    const auto slash = path.find_last_of('/');
    if (slash == std::string::npos) {
        return ".";
    }
    return slash == 0 ? "/" : path.substr(0, slash);
}

// ".venlomer-PPPPPPPP-RRRRRRRR.tmp" → the pid, or false for any other name.
bool TempOwner(const char* name, pid_t& pid) {
    const std::size_t prefix = sizeof kTempPrefix - 1;
    const std::size_t suffix = sizeof kTempSuffix - 1;
    const std::size_t length = std::strlen(name);
    if (length != prefix + kHexDigits + 1 + kHexDigits + suffix ||
        std::strncmp(name, kTempPrefix, prefix) != 0 || name[prefix + kHexDigits] != '-' ||
        std::strcmp(name + length - suffix, kTempSuffix) != 0) {
        return false;
    }
    auto isHex = [](char c) { return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f'); };
    unsigned long value = 0;
    for (std::size_t i = 0; i < kHexDigits; ++i) {
        const char c = name[prefix + i];
        const char r = name[prefix + kHexDigits + 1 + i];
        if (!isHex(c) || !isHex(r)) {
            return false;
        }
        value = value * 16 + static_cast<unsigned long>(c <= '9' ? c - '0' : c - 'a' + 10);
    }
    pid = static_cast<pid_t>(value);
    return value > 0 && value <= INT_MAX;
}

bool ProcessAlive(pid_t pid) {
    return ::kill(pid, 0) == 0 || errno == EPERM;
}

std::uint32_t RandomPart() {
    static thread_local std::mt19937 generator{std::random_device{}()};
    return static_cast<std::uint32_t>(generator());
}

bool WriteAll(int fd, const char* data, std::size_t size, int& error) {
    while (size > 0) {
        const ssize_t written = ::write(fd, data, size);
        if (written < 0) {
            if (errno == EINTR) {
                continue;
            }
            error = errno;
            return false;
        }
        data += written;
        size -= static_cast<std::size_t>(written);
    }
    return true;
}

bool SyncFolder(const std::string& folder, int& error) {
    const int fd = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd < 0) {
        error = errno;
        return false;
    }
    // Some file systems cannot sync a folder at all; that is no failure of this write.
    const bool synced = ::fsync(fd) == 0 || errno == EINVAL || errno == EROFS;
    error = errno;
    ::close(fd);
    return synced;
}

std::string KindName(mode_t mode) {
    if (S_ISDIR(mode)) {
        return "a folder";
    }
    if (S_ISBLK(mode)) {
        return "a block device";
    }
    if (S_ISCHR(mode)) {
        return "a character device";
    }
    if (S_ISFIFO(mode)) {
        return "a FIFO";
    }
    if (S_ISSOCK(mode)) {
        return "a socket";
    }
    return "not a regular file";
}

} // namespace

int CleanLeftoverTemporaries(const std::string& folder) {
    DIR* dir = ::opendir(folder.c_str());
    if (dir == nullptr) {
        return 0;
    }
    const int dirFd = ::dirfd(dir);
    const std::time_t now = std::time(nullptr);
    int removed = 0;
    while (const dirent* entry = ::readdir(dir)) {
        pid_t pid = 0;
        if (!TempOwner(entry->d_name, pid)) {
            continue;
        }
        struct stat info {};
        if (::fstatat(dirFd, entry->d_name, &info, AT_SYMLINK_NOFOLLOW) != 0 ||
            !S_ISREG(info.st_mode) || info.st_uid != ::geteuid()) {
            continue; // only our own kind of file, and only our own
        }
        const std::time_t age = now - info.st_mtime;
        const bool gone = pid != ::getpid() && !ProcessAlive(pid) && age >= kLeftoverQuiet;
        if (gone || age >= kLeftoverStale) {
            removed += ::unlinkat(dirFd, entry->d_name, 0) == 0 ? 1 : 0;
        }
    }
    ::closedir(dir);
    return removed;
}

struct SafeWriter::State {
    std::string target;  // as the caller named it, for messages
    std::string final;   // the name the result is published under
    std::string folder;  // the folder of `final`
    std::string working; // the temporary, or the device
    int fd = -1;
    bool direct = false;
    bool committed = false;
    Mode mode = Mode::Replace;

    ~State() {
        if (fd >= 0) {
            ::close(fd);
        }
        if (!direct && !committed && !working.empty()) {
            ::unlink(working.c_str());
        }
    }

    bool Fail(std::string& error, const std::string& why) {
        error = "cannot write " + target + ": " + why;
        return false;
    }

    // A device or a pipe is written in place: there is nothing to replace it with.
    bool OpenDirect(const struct stat& info, std::string& error) {
        fd = ::open(target.c_str(), O_WRONLY | O_NOCTTY | O_CLOEXEC);
        struct stat opened {};
        if (fd < 0) {
            return Fail(error, Reason(errno));
        }
        // The name may have been swapped for something else since it was looked at.
        if (::fstat(fd, &opened) != 0 || opened.st_dev != info.st_dev ||
            opened.st_ino != info.st_ino) {
            return Fail(error, "it changed while being opened");
        }
        direct = true;
        working = target;
        return true;
    }

    // The name the result goes under: a link's target, so that the link stays a link.
    bool ResolveFinal(const struct stat& link, std::string& error) {
        if (!S_ISLNK(link.st_mode)) {
            final = target;
            return true;
        }
        char* resolved = ::realpath(target.c_str(), nullptr);
        if (resolved == nullptr) {
            return Fail(error, Reason(errno));
        }
        final = resolved;
        std::free(resolved);
        return true;
    }

    // The replaced file's owner, group and mode for the temporary that replaces it. A
    // replacement that would change the owner is refused: the file would silently become
    // the writer's, and its owner would lose it.
    bool TakeOwnerAndMode(const struct stat& info, std::string& error) {
        if (info.st_uid != ::geteuid() || info.st_gid != ::getegid()) {
            if (::fchown(fd, info.st_uid, info.st_gid) != 0 && info.st_uid != ::geteuid()) {
                return Fail(error, "it belongs to user " + std::to_string(info.st_uid) +
                                       ", and replacing it would make it yours");
            }
        }
        if (::fchmod(fd, info.st_mode & 07777) != 0) {
            return Fail(error, Reason(errno));
        }
        return true;
    }

    // A new temporary with a unique name in `folder`, opened exclusively and never
    // through a link planted under its name.
    bool CreateTemporary(mode_t createMode, std::string& error) {
        const std::string prefix = (folder == "/" ? "" : folder) + "/" + kTempPrefix +
                                   Hex(static_cast<std::uint32_t>(::getpid())) + "-";
        for (int attempt = 0; attempt < 100 && fd < 0; ++attempt) {
            std::string name = prefix + Hex(RandomPart()) + kTempSuffix;
            const int opened = ::open(
                name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, createMode);
            if (opened >= 0) {
                fd = opened;
                working = std::move(name);
            } else if (errno != EEXIST) {
                return Fail(error,
                            "cannot create a temporary file in " + folder + ": " + Reason(errno));
            }
        }
        if (fd < 0) {
            return Fail(error, "no free temporary name in " + folder);
        }
        return true;
    }
};

namespace {

// Whether the user may write the file `info` describes by its own mode bits. The folder
// lets the file be replaced whatever its mode; a replacement would then defeat what its
// owner asked for. The superuser passes every permission check, so for it the bits say
// only whether anyone at all was meant to write the file: a read-only file (no write bit)
// is refused for it too.
bool WritableByMode(const struct stat& info) {
    const mode_t mode = info.st_mode;
    if (::geteuid() == 0) {
        return (mode & (S_IWUSR | S_IWGRP | S_IWOTH)) != 0;
    }
    if (info.st_uid == ::geteuid()) {
        return (mode & S_IWUSR) != 0;
    }
    bool inGroup = info.st_gid == ::getegid();
    gid_t groups[256];
    const int count = ::getgroups(256, groups);
    for (int i = 0; i < count && !inGroup; ++i) {
        inGroup = groups[i] == info.st_gid;
    }
    return (mode & (inGroup ? S_IWGRP : S_IWOTH)) != 0;
}

// Why the file `info` describes must not be written: it is one of the inputs, by name or
// by identity. Empty when it is none of them.
std::string SameAsAnInput(const struct stat& info, const std::vector<std::string>& inputs,
                          const std::vector<FileIdentity>& inputIds) {
    for (const std::string& input : inputs) {
        struct stat in {};
        if (::stat(input.c_str(), &in) == 0 && in.st_dev == info.st_dev &&
            in.st_ino == info.st_ino) {
            return "it is the same file as the input " + input;
        }
    }
    const FileIdentity id{static_cast<std::uint64_t>(info.st_dev),
                          static_cast<std::uint64_t>(info.st_ino)};
    for (const FileIdentity& input : inputIds) {
        if (input == id) {
            return "it is the same file as an input";
        }
    }
    return {};
}

} // namespace

SafeWriter::SafeWriter() = default;
SafeWriter::~SafeWriter() = default;

bool SafeWriter::Open(const std::string& target, std::string& error,
                      const std::vector<std::string>& inputs, Mode mode,
                      const std::vector<FileIdentity>& inputIds) {
    m_state = std::make_unique<State>();
    State& s = *m_state;
    s.target = target;
    s.mode = mode;
    if (target.empty()) {
        return s.Fail(error, "no file name");
    }

    struct stat link {};
    struct stat info {};
    bool exists = false;
    if (::lstat(target.c_str(), &link) == 0) {
        if (::stat(target.c_str(), &info) != 0) {
            return s.Fail(error, S_ISLNK(link.st_mode)
                                     ? "it is a link to nothing (" + Reason(errno) + ")"
                                     : Reason(errno));
        }
        exists = true;
    } else if (errno != ENOENT) {
        return s.Fail(error, Reason(errno));
    }

    if (exists) {
        if (const std::string same = SameAsAnInput(info, inputs, inputIds); !same.empty()) {
            return s.Fail(error, same);
        }
        if (mode == Mode::CreateOnly) {
            error = target + " exists already";
            return false;
        }
        if (S_ISCHR(info.st_mode) || S_ISFIFO(info.st_mode)) {
            return s.OpenDirect(info, error);
        }
        if (!S_ISREG(info.st_mode)) {
            return s.Fail(error, "it is " + KindName(info.st_mode));
        }
        if (!WritableByMode(info)) {
            return s.Fail(error, "it is read-only for you (mode " + Octal(info.st_mode & 07777) +
                                     "); change its mode to replace it");
        }
        if (!s.ResolveFinal(link, error)) {
            return false;
        }
    } else {
        s.final = target;
    }
    s.folder = FolderOf(s.final);
    CleanLeftoverTemporaries(s.folder);

    // A replaced file's mode is set explicitly below, so the temporary starts private.
    if (!s.CreateTemporary(exists ? 0600 : 0666, error)) {
        return false;
    }
    return !exists || s.TakeOwnerAndMode(info, error);
}

bool SafeWriter::Write(std::string_view bytes, std::string& error) {
    if (!m_state || m_state->fd < 0 || m_state->committed) {
        error = "cannot write: the file is not open";
        return false;
    }
    int code = 0;
    if (!WriteAll(m_state->fd, bytes.data(), bytes.size(), code)) {
        return m_state->Fail(error, Reason(code));
    }
    return true;
}

bool SafeWriter::Commit(std::string& error) {
    if (!m_state || m_state->fd < 0 || m_state->committed) {
        error = "cannot write: the file is not open";
        return false;
    }
    State& s = *m_state;
    const int fd = s.fd;
    s.fd = -1;
    if (s.direct) {
        const bool closed = ::close(fd) == 0;
        s.committed = closed;
        return closed || s.Fail(error, Reason(errno));
    }
    if (::fsync(fd) != 0) {
        const int code = errno;
        ::close(fd);
        return s.Fail(error, Reason(code));
    }
    if (::close(fd) != 0) {
        return s.Fail(error, Reason(errno));
    }
    if (s.mode == Mode::Replace) {
        if (::rename(s.working.c_str(), s.final.c_str()) != 0) {
            return s.Fail(error, Reason(errno));
        }
    } else {
        // A hard link publishes the name only if it is free; the temporary goes after.
        if (::link(s.working.c_str(), s.final.c_str()) != 0) {
            const int code = errno;
            if (code == EEXIST) {
                error = s.target + " exists already";
                return false;
            }
            return s.Fail(error, Reason(code));
        }
        ::unlink(s.working.c_str());
    }
    s.committed = true;
    int code = 0;
    if (!SyncFolder(s.folder, code)) {
        return s.Fail(error, "written, but its folder could not be synced: " + Reason(code));
    }
    return true;
}

const std::string& SafeWriter::WorkingPath() const {
    static const std::string none;
    return m_state ? m_state->working : none;
}

bool SafeWriter::Direct() const {
    return m_state && m_state->direct;
}

bool WriteFileSafely(const std::string& target, std::string_view bytes, std::string& error,
                     const std::vector<std::string>& inputs) {
    SafeWriter writer;
    return writer.Open(target, error, inputs) && writer.Write(bytes, error) && writer.Commit(error);
}

// ---- reading -------------------------------------------------------------------------

namespace {

class FdBuffer : public std::streambuf {
public:
    FdBuffer(int fd, std::uint64_t limit) : m_fd(fd), m_limit(limit) {}

    bool overLimit = false;
    int readError = 0;

protected:
    int_type underflow() override {
        if (gptr() < egptr()) {
            return traits_type::to_int_type(*gptr());
        }
        if (overLimit || readError != 0) {
            return traits_type::eof();
        }
        ssize_t got = 0;
        do {
            got = ::read(m_fd, m_buffer, sizeof m_buffer);
        } while (got < 0 && errno == EINTR);
        if (got < 0) {
            readError = errno;
            return traits_type::eof();
        }
        if (got == 0) {
            return traits_type::eof();
        }
        m_total += static_cast<std::uint64_t>(got);
        if (m_total > m_limit) {
            overLimit = true;
            return traits_type::eof();
        }
        setg(m_buffer, m_buffer, m_buffer + got);
        return traits_type::to_int_type(*gptr());
    }

private:
    int m_fd;
    std::uint64_t m_limit;
    std::uint64_t m_total = 0;
    char m_buffer[1 << 16];
};

std::string LimitText(std::uint64_t limit) {
    if (limit >= (1u << 20) && limit % (1u << 20) == 0) {
        return std::to_string(limit >> 20) + " MiB";
    }
    return std::to_string(limit) + " bytes";
}

} // namespace

struct InputFile::State {
    std::string path;
    int fd = -1;
    bool ownFd = true;
    std::uint64_t size = 0;
    std::uint64_t limit = 0;
    FileIdentity id;
    std::unique_ptr<FdBuffer> buffer;
    std::unique_ptr<std::istream> stream;

    ~State() {
        if (fd >= 0 && ownFd) {
            ::close(fd);
        }
    }
};

InputFile::InputFile() = default;
InputFile::~InputFile() = default;

bool InputFile::Open(const std::string& path, std::string& error, std::uint64_t limit,
                     bool allowStdin) {
    m_state = std::make_unique<State>();
    State& s = *m_state;
    s.path = path;
    s.limit = limit;
    const bool standardInput = allowStdin && path == "-";
    if (standardInput) {
        s.fd = STDIN_FILENO;
        s.ownFd = false;
        s.path = "standard input";
    } else {
        // Without O_NONBLOCK, opening a FIFO that nobody writes waits for ever.
        s.fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC);
        if (s.fd < 0) {
            error = path + ": cannot open: " + Reason(errno);
            return false;
        }
    }
    struct stat info {};
    if (::fstat(s.fd, &info) != 0) {
        error = s.path + ": cannot open: " + Reason(errno);
        return false;
    }
    s.id = {static_cast<std::uint64_t>(info.st_dev), static_cast<std::uint64_t>(info.st_ino)};
    if (S_ISREG(info.st_mode)) {
        s.size = static_cast<std::uint64_t>(info.st_size);
        if (s.size > limit) {
            error = s.path + ": " + std::to_string(s.size) + " bytes is more than the " +
                    LimitText(limit) + " read at most";
            return false;
        }
    } else if (!(standardInput &&
                 (S_ISFIFO(info.st_mode) || S_ISCHR(info.st_mode) || S_ISSOCK(info.st_mode)))) {
        error = s.path + ": " + KindName(info.st_mode) + ", not a regular file; not read";
        return false;
    }
    if (!standardInput) {
        // Regular files never block; clearing the flag keeps reads plain.
        const int flags = ::fcntl(s.fd, F_GETFL);
        if (flags >= 0) {
            ::fcntl(s.fd, F_SETFL, flags & ~O_NONBLOCK);
        }
    }
    s.buffer = std::make_unique<FdBuffer>(s.fd, limit);
    s.stream = std::make_unique<std::istream>(s.buffer.get());
    return true;
}

std::istream& InputFile::Stream() {
    static std::istream closed(nullptr);
    if (!m_state || !m_state->stream) {
        closed.setstate(std::ios::badbit);
        return closed;
    }
    return *m_state->stream;
}

bool InputFile::Failed(std::string& error) const {
    if (!m_state || !m_state->buffer) {
        error = "not open";
        return true;
    }
    if (m_state->buffer->overLimit) {
        error = m_state->path + ": more than the " + LimitText(m_state->limit) + " read at most";
        return true;
    }
    if (m_state->buffer->readError != 0) {
        error = m_state->path + ": read error: " + Reason(m_state->buffer->readError);
        return true;
    }
    return false;
}

FileIdentity InputFile::Identity() const {
    return m_state ? m_state->id : FileIdentity{};
}

std::uint64_t InputFile::Size() const {
    return m_state ? m_state->size : 0;
}

bool ReadRegularFile(const std::string& path, std::string& out, std::string& error,
                     std::uint64_t limit) {
    out.clear();
    InputFile file;
    if (!file.Open(path, error, limit)) {
        return false;
    }
    out.reserve(static_cast<std::size_t>(file.Size()));
    std::istream& in = file.Stream();
    char chunk[1 << 16];
    while (in.read(chunk, sizeof chunk) || in.gcount() > 0) {
        out.append(chunk, static_cast<std::size_t>(in.gcount()));
    }
    if (file.Failed(error)) {
        out.clear();
        return false;
    }
    return true;
}

std::string Printable(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    auto escape = [&out](unsigned char c) {
        static const char digits[] = "0123456789abcdef";
        out += "\\x";
        out += digits[c >> 4];
        out += digits[c & 15];
    };
    for (std::size_t i = 0; i < text.size(); ++i) {
        const auto c = static_cast<unsigned char>(text[i]);
        if (c < 0x20 || c == 0x7f || (c >= 0x80 && c <= 0x9f)) {
            // C0 controls and DEL; a byte 0x80..0x9f outside UTF-8 is one a terminal in
            // 8-bit mode would take for a control.
            escape(c);
        } else if (c == 0xc2 && i + 1 < text.size() &&
                   static_cast<unsigned char>(text[i + 1]) >= 0x80 &&
                   static_cast<unsigned char>(text[i + 1]) <= 0x9f) {
            // U+0080..U+009F: the 8-bit control characters, which some terminals obey.
            escape(c);
            escape(static_cast<unsigned char>(text[++i]));
        } else {
            out += static_cast<char>(c);
        }
    }
    return out;
}

} // namespace Port
