//===-- designmodel/Nhlp_FileConv.h - checking and reading netlist files --------===//
//
// \file
// CanRead tells a caller, without throwing, whether a file is an NGD this library can
// read, and if not, why. ReadAsNmod then loads a netlist database into a new model.
//
//   if (Nhlp_FileConv::CanRead("top.ngd") == Nhlp_FileConv::FILE_READABLE) {
//       Nmod_Model* model = nullptr;
//       Nmod_Txn* txn = nullptr;
//       Nhlp_FileConv::ReadAsNmod("top.ngd", model, txn, false); // caller deletes model
//   }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

class Nmod_Model;
class Nmod_Txn;

class VN_VISIBLE Nhlp_FileConv {
public:
    /// Callers compare these with numbers. Do not reorder.
    enum FileStatus {
        FILE_READABLE = 0,
        FILE_NOT_FOUND = 1,
        FILE_NO_READ_PERMISSION = 2,
        /// Not SQLite, no format record or tables, another kind (an NGC), a format
        /// version newer than this library knows, a kind or version stored as a value of
        /// another type, or changes left in a -wal or -journal file beside it.
        FILE_NOT_NGD = 3,
        /// An NGD of an older format version.
        FILE_OBSOLETE = 4,
        /// The system failed in another way (a symbolic-link loop, an I/O error).
        FILE_UNKNOWN_ERROR = 5
    };

    /// What stands between `fileName` and reading it as an NGD. Never throws.
    static FileStatus CanRead(const char* fileName);

    /// Reads an NGD or NGC file into a new read-only model with an open read-only
    /// transaction and hands both out (the model owns the transaction; the caller
    /// deletes the model). With `checkIntegrity` the whole file is checked first. Nothing
    /// is written beside the file. Values of another type than their column's, names
    /// holding a NUL byte and duplicate names are refused (Format). On failure throws
    /// (Database, Format or Usage) and leaves both arguments as they were.
    static void ReadAsNmod(const char* fileName, Nmod_Model*& model, Nmod_Txn*& txn,
                           bool checkIntegrity);
};
