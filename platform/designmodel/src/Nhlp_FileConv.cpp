//===-- Nhlp_FileConv.cpp - telling netlist files apart, and reading them -------===//
#include "Port/UnitStartup.h"

#include "designmodel/Nhlp_FileConv.h"

#include "Access.h"
#include "Engine.h"
#include "Schema.h"
#include "designmodel/Nmod_Exception.h"
#include "designmodel/Nmod_Model.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <unordered_map>

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

std::string Column(const Statement& row, int column, const char* what, const std::string& file) {
    if (row.IsNull(column)) {
        throw Nmod_Exception::Format("netlist database \"" + file + "\" holds a " + what +
                                     " with no value");
    }
    return row.Text(column);
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
        if (!format.Step() || format.IsNull(1) ||
            format.Text(0) != std::string(Nmod_Detail::kKindNgd)) {
            return FILE_NOT_NGD;
        }
        const long long version = format.Int(1);
        if (version < Nmod_Model::kFormatVersion) {
            return FILE_OBSOLETE;
        }
        return version == Nmod_Model::kFormatVersion ? FILE_READABLE : FILE_NOT_NGD;
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
    const std::string kind = Column(format, 0, "format kind", file);
    if (kind != Nmod_Detail::kKindNgd && kind != Nmod_Detail::kKindNgc) {
        throw Nmod_Exception::Format("\"" + file + "\" is not a netlist database (kind \"" + kind +
                                     "\")");
    }
    if (format.IsNull(1) || format.Int(1) != Nmod_Model::kFormatVersion) {
        throw Nmod_Exception::Format("netlist database \"" + file + "\" has format version " +
                                     format.Text(1) + "; this library reads version " +
                                     std::to_string(Nmod_Model::kFormatVersion));
    }
    auto read = Nmod_Detail::Access::NewReadModel(
        Column(format, 2, "model name", file), Column(format, 3, "tool name", file),
        Column(format, 4, "tool version", file), file, kind == Nmod_Detail::kKindNgd);

    std::unordered_map<long long, Nmod_Design*> designs;
    Statement designRows(db, "SELECT id, name FROM nmod_design ORDER BY id", context);
    while (designRows.Step()) {
        designs[designRows.Int(0)] = Nmod_Detail::Access::AddDesign(
            *read, designRows.Int(0), Column(designRows, 1, "design name", file));
    }

    std::unordered_map<long long, Nmod_View*> views;
    Statement viewRows(db, "SELECT id, design_id, name FROM nmod_view ORDER BY id", context);
    while (viewRows.Step()) {
        const auto design = designs.find(viewRows.Int(1));
        if (design == designs.end() || viewRows.IsNull(1)) {
            throw Nmod_Exception::Format("netlist database \"" + file +
                                         "\" holds a view of a design it does not hold");
        }
        views[viewRows.Int(0)] = Nmod_Detail::Access::AddView(
            *design->second, viewRows.Int(0), Column(viewRows, 2, "view name", file));
    }

    Statement propertyRows(db, "SELECT view_id, name, value FROM nmod_view_property ORDER BY rowid",
                           context);
    while (propertyRows.Step()) {
        const auto view = views.find(propertyRows.Int(0));
        if (view == views.end() || propertyRows.IsNull(0)) {
            throw Nmod_Exception::Format("netlist database \"" + file +
                                         "\" holds a property of a view it does not hold");
        }
        Nmod_Detail::Access::AddProperty(*view->second,
                                         Column(propertyRows, 1, "property name", file),
                                         Column(propertyRows, 2, "property value", file));
    }

    Statement blockRows(db, "SELECT view_id, name, type FROM nmod_block ORDER BY id", context);
    while (blockRows.Step()) {
        const auto view = views.find(blockRows.Int(0));
        if (view == views.end() || blockRows.IsNull(0)) {
            throw Nmod_Exception::Format("netlist database \"" + file +
                                         "\" holds a block of a view it does not hold");
        }
        Nmod_Detail::Access::AddBlock(*view->second, Column(blockRows, 1, "block name", file),
                                      static_cast<unsigned int>(blockRows.Int(2)));
    }

    Nmod_Detail::Access::OpenReadTxn(*read);
    // Nothing can fail from here on: hand out both or neither.
    txn = read->GetTxn();
    model = read.release();
}
