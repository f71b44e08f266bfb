//===-- Nhlp_FileConv.cpp - telling netlist files apart, and reading them -------===//
#include "Port/UnitStartup.h"

#include "designmodel/Nhlp_FileConv.h"

#include "Access.h"
#include "Engine.h"
#include "Schema.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"

#include <cerrno>
#include <climits>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <unordered_map>
#include <unordered_set>

namespace {

using Nmod_Detail::Statement;

Nhlp_FileConv::FileStatus StatusOfErrno(int error) {
    switch (error) {
    case ENOENT:
    case ENOTDIR:
        return Nhlp_FileConv::FILE_NOT_FOUND;
    case EACCES:
    case EPERM:
        return Nhlp_FileConv::FILE_NO_READ_PERMISSION;
    default:
        return Nhlp_FileConv::FILE_UNKNOWN_ERROR;
    }
}

// Every SQLite file starts with these 16 bytes; anything else is not ours without
// asking the engine at all.
bool HasSqliteHeader(int fd) {
    static const char kMagic[16] = {'S', 'Q', 'L', 'i', 't', 'e', ' ', 'f',
                                    'o', 'r', 'm', 'a', 't', ' ', '3', '\0'};
    char header[sizeof kMagic];
    size_t got = 0;
    while (got < sizeof header) {
        const ssize_t n = ::read(fd, header + got, sizeof header - got);
        if (n < 0 && errno == EINTR) {
            continue;
        }
        if (n <= 0) {
            return false;
        }
        got += static_cast<size_t>(n);
    }
    return std::memcmp(header, kMagic, sizeof kMagic) == 0;
}

[[noreturn]] void Refuse(const std::string& file, const std::string& what) {
    throw Nmod_Exception::Format("netlist database \"" + file + "\" holds " + what);
}

// Tables declared without STRICT hold any type in any column, so the type of every value
// is checked rather than converted: a version stored as the text '2abc' would otherwise
// read as 2, and a blob as whatever text its bytes make.
std::string TextColumn(const Statement& row, int column, const char* what,
                       const std::string& file) {
    switch (row.Type(column)) {
    case SQLITE_TEXT:
        break;
    case SQLITE_NULL:
        Refuse(file, std::string("a ") + what + " with no value");
    default:
        Refuse(file, std::string("a ") + what + " that is not text");
    }
    std::string text = row.Text(column);
    // Names are handed out as C strings: one with a NUL would silently lose its end.
    if (text.find('\0') != std::string::npos) {
        Refuse(file, std::string("a ") + what + " with a NUL byte in it");
    }
    return text;
}

long long IntColumn(const Statement& row, int column, const char* what, const std::string& file) {
    if (row.Type(column) != SQLITE_INTEGER) {
        Refuse(file, std::string("a ") + what + " that is not a whole number");
    }
    return row.Int(column);
}

// A key unique per (owner row, name): the id takes a fixed width, so no name can make
// two different pairs meet.
std::string OwnedKey(long long owner, const std::string& name) {
    std::string key(sizeof owner, '\0');
    std::memcpy(key.data(), &owner, sizeof owner);
    return key + name;
}

} // namespace

Nhlp_FileConv::FileStatus Nhlp_FileConv::CanRead(const char* fileName) {
    if (fileName == nullptr || *fileName == '\0') {
        return FILE_NOT_FOUND;
    }
    struct stat info {};
    if (::stat(fileName, &info) != 0) {
        return StatusOfErrno(errno);
    }
    if (!S_ISREG(info.st_mode)) {
        return FILE_NOT_NGD;
    }
    const int fd = ::open(fileName, O_RDONLY | O_CLOEXEC);
    if (fd < 0) {
        return StatusOfErrno(errno);
    }
    const bool sqlite = HasSqliteHeader(fd);
    ::close(fd);
    if (!sqlite) {
        return FILE_NOT_NGD;
    }
    try {
        const auto db = Nmod_Detail::Connection::OpenForReading(fileName);
        Statement tables(db,
                         "SELECT count(*) FROM sqlite_master WHERE type = 'table' AND name IN "
                         "(?, ?, ?, ?, ?)",
                         "tables");
        int index = 1;
        for (const char* table : Nmod_Detail::kTables) {
            tables.Bind(index++, std::string(table));
        }
        if (!tables.Step() ||
            tables.Int(0) != static_cast<long long>(std::size(Nmod_Detail::kTables))) {
            return FILE_NOT_NGD;
        }
        Statement format(db, "SELECT kind, version FROM nmod_format WHERE id = 1", "format");
        if (!format.Step() || format.Type(0) != SQLITE_TEXT || format.Type(1) != SQLITE_INTEGER ||
            format.Text(0) != std::string(Nmod_Detail::kKindNgd)) {
            return FILE_NOT_NGD;
        }
        const long long version = format.Int(1);
        if (version < Nmod_Model::kFormatVersion) {
            return FILE_OBSOLETE;
        }
        return version == Nmod_Model::kFormatVersion ? FILE_READABLE : FILE_NOT_NGD;
    } catch (const Nmod_Exception::Format&) {
        // Unfinished changes beside the file: as it stands it is no complete NGD.
        return FILE_NOT_NGD;
    } catch (const Nmod_Exception::Database& e) {
        switch (e.GetCode()) {
        case SQLITE_NOTADB:
        case SQLITE_CORRUPT:
        case SQLITE_ERROR:
        case SQLITE_MISMATCH:
        case SQLITE_FORMAT:
            return FILE_NOT_NGD;
        case SQLITE_PERM:
        case SQLITE_AUTH:
            return FILE_NO_READ_PERMISSION;
        default:
            return FILE_UNKNOWN_ERROR;
        }
    } catch (...) {
        return FILE_UNKNOWN_ERROR;
    }
}

void Nhlp_FileConv::ReadAsNmod(const char* fileName, Nmod_Model*& model, Nmod_Txn*& txn,
                               bool checkIntegrity) {
    if (fileName == nullptr) {
        throw Nmod_Exception::Usage("no file name given (null)");
    }
    const std::string file = fileName;
    if (checkIntegrity && !Nmod_Model::IsQdbReadable(fileName)) {
        throw Nmod_Exception::Format("netlist database \"" + file + "\" fails the integrity check");
    }
    const auto db = Nmod_Detail::Connection::OpenForReading(file);
    const std::string context = "cannot read netlist database \"" + file + "\"";

    Statement format(db,
                     "SELECT kind, version, model_name, tool, tool_version FROM nmod_format "
                     "WHERE id = 1",
                     context);
    if (!format.Step()) {
        throw Nmod_Exception::Format("netlist database \"" + file + "\" has no format record");
    }
    const std::string kind = TextColumn(format, 0, "format kind", file);
    if (kind != Nmod_Detail::kKindNgd && kind != Nmod_Detail::kKindNgc) {
        throw Nmod_Exception::Format("\"" + file + "\" is not a netlist database (kind \"" + kind +
                                     "\")");
    }
    const long long version = IntColumn(format, 1, "format version", file);
    if (version != Nmod_Model::kFormatVersion) {
        throw Nmod_Exception::Format("netlist database \"" + file + "\" has format version " +
                                     std::to_string(version) + "; this library reads version " +
                                     std::to_string(Nmod_Model::kFormatVersion));
    }
    auto read = Nmod_Detail::Access::NewReadModel(
        TextColumn(format, 2, "model name", file), TextColumn(format, 3, "tool name", file),
        TextColumn(format, 4, "tool version", file), file, kind == Nmod_Detail::kKindNgd);

    // Duplicates are found through hash sets: a file of many designs, views or properties
    // is read in time proportional to its size.
    std::unordered_map<long long, Nmod_Design*> designs;
    std::unordered_set<std::string> designNames;
    Statement designRows(db, "SELECT id, name FROM nmod_design ORDER BY id", context);
    while (designRows.Step()) {
        const long long id = IntColumn(designRows, 0, "design id", file);
        std::string name = TextColumn(designRows, 1, "design name", file);
        if (!designNames.insert(name).second) {
            Refuse(file, "design \"" + name + "\" twice");
        }
        designs[id] = Nmod_Detail::Access::AddDesign(*read, id, std::move(name));
    }

    std::unordered_map<long long, Nmod_View*> views;
    std::unordered_set<std::string> viewNames;
    Statement viewRows(db, "SELECT id, design_id, name FROM nmod_view ORDER BY id", context);
    while (viewRows.Step()) {
        const long long id = IntColumn(viewRows, 0, "view id", file);
        const long long designId = IntColumn(viewRows, 1, "view's design", file);
        const auto design = designs.find(designId);
        if (design == designs.end()) {
            Refuse(file, "a view of a design it does not hold");
        }
        std::string name = TextColumn(viewRows, 2, "view name", file);
        if (!viewNames.insert(OwnedKey(designId, name)).second) {
            Refuse(file,
                   "view \"" + name + "\" of design \"" + design->second->GetName() + "\" twice");
        }
        views[id] = Nmod_Detail::Access::AddView(*design->second, id, std::move(name));
    }

    std::unordered_set<std::string> propertyNames;
    Statement propertyRows(db, "SELECT view_id, name, value FROM nmod_view_property ORDER BY rowid",
                           context);
    while (propertyRows.Step()) {
        const long long viewId = IntColumn(propertyRows, 0, "property's view", file);
        const auto view = views.find(viewId);
        if (view == views.end()) {
            Refuse(file, "a property of a view it does not hold");
        }
        std::string name = TextColumn(propertyRows, 1, "property name", file);
        std::string value = TextColumn(propertyRows, 2, "property value", file);
        if (!propertyNames.insert(OwnedKey(viewId, name)).second) {
            Refuse(file,
                   "property \"" + name + "\" of view \"" + view->second->GetName() + "\" twice");
        }
        Nmod_Detail::Access::AddProperty(*view->second, std::move(name), std::move(value));
    }

    Statement blockRows(db, "SELECT view_id, name, type FROM nmod_block ORDER BY id", context);
    while (blockRows.Step()) {
        const auto view = views.find(IntColumn(blockRows, 0, "block's view", file));
        if (view == views.end()) {
            Refuse(file, "a block of a view it does not hold");
        }
        std::string name = TextColumn(blockRows, 1, "block name", file);
        const long long type = IntColumn(blockRows, 2, "block type", file);
        if (type < 0 || type > static_cast<long long>(UINT_MAX)) {
            Refuse(file, "block \"" + name + "\" of a type out of range");
        }
        Nmod_Detail::Access::AddBlock(*view->second, std::move(name),
                                      static_cast<unsigned int>(type));
    }

    Nmod_Detail::Access::OpenReadTxn(*read);
    // Nothing can fail from here on: hand out both or neither.
    txn = read->GetTxn();
    model = read.release();
}
