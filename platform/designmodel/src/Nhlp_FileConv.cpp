//===-- Nhlp_FileConv.cpp - telling netlist files apart, and reading them -------===//
#include "Port/UnitStartup.h"

#include "designmodel/Nhlp_FileConv.h"

#include "Access.h"
#include "Engine.h"
#include "ReadIndex.h"
#include "Schema.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"

#include <cerrno>
#include <climits>
#include <cstring>
#include <fcntl.h>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>
#include <vector>

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

// Where a file is read from, and what its refusals say.
struct Source {
    const Nmod_Detail::Connection& db;
    const std::string& file;
    const std::string& context;
};

using Nmod_Detail::RowsById;
using Nmod_Detail::SeenNames;

// The object a row hangs under; a row whose parent id names no row read before is
// refused with `orphan` ("a view of a design"), as the file then holds a dangling link.
template <class Parent>
Parent& ParentRow(const RowsById<Parent>& parents, long long id, const char* orphan,
                  const std::string& file) {
    Parent* parent = parents.Find(id);
    if (parent == nullptr) {
        Refuse(file, std::string(orphan) + " it does not hold");
    }
    return *parent;
}

// The format record: which kind of database and which version, and the model's names.
std::unique_ptr<Nmod_Model> ReadFormat(const Source& from) {
    const std::string& file = from.file;
    Statement format(from.db,
                     "SELECT kind, version, model_name, tool, tool_version FROM nmod_format "
                     "WHERE id = 1",
                     from.context);
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
    return Nmod_Detail::Access::NewReadModel(
        TextColumn(format, 2, "model name", file), TextColumn(format, 3, "tool name", file),
        TextColumn(format, 4, "tool version", file), file, kind == Nmod_Detail::kKindNgd);
}

// Duplicates are found through hashes of the names already read, so a file of many
// designs, views or properties is read in time proportional to its size.

RowsById<Nmod_Design> ReadDesigns(const Source& from, Nmod_Model& model) {
    RowsById<Nmod_Design> designs;
    SeenNames names;
    Statement rows(from.db, "SELECT id, name FROM nmod_design ORDER BY id", from.context);
    while (rows.Step()) {
        const long long id = IntColumn(rows, 0, "design id", from.file);
        std::string name = TextColumn(rows, 1, "design name", from.file);
        SeenNames::Probe probe;
        const auto isDesign = [&](std::size_t entry) {
            return designs.At(entry)->GetName() == name;
        };
        if (names.Contains(0, name, isDesign, probe)) {
            Refuse(from.file, "design \"" + name + "\" twice");
        }
        names.Remember(probe, designs.Size());
        designs.Add(id, Nmod_Detail::Access::AddDesign(model, id, std::move(name)));
    }
    return designs;
}

RowsById<Nmod_View> ReadViews(const Source& from, const RowsById<Nmod_Design>& designs) {
    RowsById<Nmod_View> views;
    SeenNames names;
    Statement rows(from.db, "SELECT id, design_id, name FROM nmod_view ORDER BY id", from.context);
    while (rows.Step()) {
        const long long id = IntColumn(rows, 0, "view id", from.file);
        const long long designId = IntColumn(rows, 1, "view's design", from.file);
        Nmod_Design& design = ParentRow(designs, designId, "a view of a design", from.file);
        std::string name = TextColumn(rows, 2, "view name", from.file);
        SeenNames::Probe probe;
        const auto isView = [&](std::size_t entry) {
            const Nmod_View* view = views.At(entry);
            return view->GetDesign() == &design && view->GetName() == name;
        };
        if (names.Contains(designId, name, isView, probe)) {
            Refuse(from.file, "view \"" + name + "\" of design \"" + design.GetName() + "\" twice");
        }
        names.Remember(probe, views.Size());
        views.Add(id, Nmod_Detail::Access::AddView(design, id, std::move(name)));
    }
    return views;
}

void ReadProperties(const Source& from, const RowsById<Nmod_View>& views) {
    // Where each property read went: the view's list may move its names as it grows.
    std::vector<std::pair<const Nmod_View*, std::size_t>> read;
    SeenNames names;
    Statement rows(from.db, "SELECT view_id, name, value FROM nmod_view_property ORDER BY rowid",
                   from.context);
    while (rows.Step()) {
        const long long viewId = IntColumn(rows, 0, "property's view", from.file);
        Nmod_View& view = ParentRow(views, viewId, "a property of a view", from.file);
        std::string name = TextColumn(rows, 1, "property name", from.file);
        std::string value = TextColumn(rows, 2, "property value", from.file);
        SeenNames::Probe probe;
        const auto isProperty = [&](std::size_t entry) {
            const auto& [owner, place] = read[entry];
            return owner == &view && Nmod_Detail::Access::PropertyName(*owner, place) == name;
        };
        if (names.Contains(viewId, name, isProperty, probe)) {
            Refuse(from.file, "property \"" + name + "\" of view \"" + view.GetName() + "\" twice");
        }
        names.Remember(probe, read.size());
        read.emplace_back(
            &view, Nmod_Detail::Access::AddProperty(view, std::move(name), std::move(value)));
    }
}

void ReadBlocks(const Source& from, const RowsById<Nmod_View>& views) {
    Statement rows(from.db, "SELECT view_id, name, type FROM nmod_block ORDER BY id", from.context);
    while (rows.Step()) {
        Nmod_View& view = ParentRow(views, IntColumn(rows, 0, "block's view", from.file),
                                    "a block of a view", from.file);
        std::string name = TextColumn(rows, 1, "block name", from.file);
        const long long type = IntColumn(rows, 2, "block type", from.file);
        if (type < 0 || type > static_cast<long long>(UINT_MAX)) {
            Refuse(from.file, "block \"" + name + "\" of a type out of range");
        }
        Nmod_Detail::Access::AddBlock(view, std::move(name), static_cast<unsigned int>(type));
    }
}

// What the engine says of a file that starts like one of its databases: the tables a
// netlist database has, and the kind and version of its format record.
Nhlp_FileConv::FileStatus StatusOfDatabase(const char* fileName) {
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
            return Nhlp_FileConv::FILE_NOT_NGD;
        }
        Statement format(db, "SELECT kind, version FROM nmod_format WHERE id = 1", "format");
        if (!format.Step() || format.Type(0) != SQLITE_TEXT || format.Type(1) != SQLITE_INTEGER ||
            format.Text(0) != std::string(Nmod_Detail::kKindNgd)) {
            return Nhlp_FileConv::FILE_NOT_NGD;
        }
        const long long version = format.Int(1);
        if (version < Nmod_Model::kFormatVersion) {
            return Nhlp_FileConv::FILE_OBSOLETE;
        }
        return version == Nmod_Model::kFormatVersion ? Nhlp_FileConv::FILE_READABLE
                                                     : Nhlp_FileConv::FILE_NOT_NGD;
    } catch (const Nmod_Exception::Format&) {
        // Unfinished changes beside the file: as it stands it is no complete NGD.
        return Nhlp_FileConv::FILE_NOT_NGD;
    } catch (const Nmod_Exception::Database& e) {
        switch (e.GetCode()) {
        case SQLITE_NOTADB:
        case SQLITE_CORRUPT:
        case SQLITE_ERROR:
        case SQLITE_MISMATCH:
        case SQLITE_FORMAT:
            return Nhlp_FileConv::FILE_NOT_NGD;
        case SQLITE_PERM:
        case SQLITE_AUTH:
            return Nhlp_FileConv::FILE_NO_READ_PERMISSION;
        default:
            return Nhlp_FileConv::FILE_UNKNOWN_ERROR;
        }
    } catch (...) {
        return Nhlp_FileConv::FILE_UNKNOWN_ERROR;
    }
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
    return StatusOfDatabase(fileName);
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
    const Source from{db, file, context};

    auto read = ReadFormat(from);
    const RowsById<Nmod_View> views = ReadViews(from, ReadDesigns(from, *read));
    ReadProperties(from, views);
    ReadBlocks(from, views);

    Nmod_Detail::Access::OpenReadTxn(*read);
    // Nothing can fail from here on: hand out both or neither.
    txn = read->GetTxn();
    model = read.release();
}
