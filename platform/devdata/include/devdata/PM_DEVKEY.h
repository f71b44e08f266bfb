//===-- devdata/PM_DEVKEY.h - key files -----------------------------------------===//
//
// \file
// A key file is a set of named keys, one `KEY = value` a line. A value is a sequence of
// decimal integers joined by separator characters; a reader chooses, per call, which
// character separates entries and which separates the fields of an entry:
//
//   # IO bank palette: entries split by ':', fields by ','
//   IO_BANK_COLORS = 230,159,0 : 86,180,233 : 0,158,115
//
//   PM_PIC part(nullptr, nullptr, nullptr);
//   PM_DEVKEY keys("rareroded.acd", &part, PM_DEVKEY::kAbsentIsSilent,
//                  PM_DEVKEY::kSearchDataPath, PM_DEVKEY::kRejectionIsReported);
//   if (keys.get_validity() != 0) {
//       const char entrySep = ':', fieldSep = ',';
//       short n = keys.GetMaxIndex("IO_BANK_COLORS", entrySep, fieldSep).first;   // 3
//       int green1 = keys.GetInt32ByKey("IO_BANK_COLORS", &entrySep, 1, &fieldSep, 1); // 180
//   }
//
// Syntax (the authoritative description with examples heads data/rareroded.acd):
// - Lines end with '\n' (a '\r' before it is ignored). '#' starts a comment that runs to
//   the end of the line. Blank and comment-only lines are skipped.
// - Every other line is KEY = VALUE. A key is letters, digits and '_', compared exactly
//   (case-sensitive). Spaces and tabs may stand around the key, the '=' and every
//   separator.
// - A value is empty, or integers joined by single separator characters out of
//   ":,;|/". An integer is an optional '-' and decimal digits within the signed 32-bit
//   range.
// - A file with any other line, a value that breaks these rules or a key defined twice is
//   rejected whole: it reads as invalid and one message names the file and the line.
// - A file larger than kMaxFileBytes (16 MiB) is not read: a colour scheme is a few
//   kilobytes, and every integer read costs several times its text, so the cap is what
//   keeps a stray file from taking the editor's memory.
//
// Reading: entries are the runs between entry separators, fields the runs between field
// separators inside an entry, both numbered from 0. A field whose run holds another
// separator is not an integer under the chosen separators and reads as 0; so do absent
// keys, entries and fields. Nothing is ever read past the separator character whose
// address is passed.
//
// Finding the file: a name holding a '/' is opened as given. A bare name is looked up in
// each directory of VENLOMER_DATA_PATH (':'-separated, in order), then in the current
// directory, then in the installed share/venlomer folder; the first regular file found is
// read.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"
#include "Port/StringBase.h"

#include <memory>
#include <utility>

class PM_PIC;

class VN_VISIBLE PM_DEVKEY {
public:
    // The constructor's three flag bytes, by parameter. Hosts pass the bytes themselves,
    // so only 0 and non-zero are meaningful and the values stay as they are.
    /// `required`: whether an absent file is reported.
    static constexpr unsigned char kAbsentIsSilent = 0;
    static constexpr unsigned char kAbsentIsReported = 1;
    /// `search`: where a bare file name is looked for.
    static constexpr unsigned char kOpenInCurrentDir = 0;
    static constexpr unsigned char kSearchDataPath = 1;
    /// `report`: whether a rejected or unreadable file is reported.
    static constexpr unsigned char kRejectionIsSilent = 0;
    static constexpr unsigned char kRejectionIsReported = 1;

    /// The largest key file read; a larger one reads as invalid, with a message.
    static constexpr unsigned long kMaxFileBytes = 16ul << 20;

    /// Reads the key file now; the object keeps its keys, not the file.
    /// \param part      names the part the keys are for; may be null. Key files of this
    ///                  library hold the same values for every part, so it is not read.
    /// \param required  non-zero: an absent file is reported too (it is silent otherwise).
    /// \param search    non-zero: a bare name is looked up along the data search path;
    ///                  zero: it is opened from the current directory only.
    /// \param report    non-zero: a rejected or unreadable file is reported.
    PM_DEVKEY(const char* fileName, PM_PIC* part, unsigned char required, unsigned char search,
              unsigned char report);
    ~PM_DEVKEY();
    PM_DEVKEY(const PM_DEVKEY&) = delete;
    PM_DEVKEY& operator=(const PM_DEVKEY&) = delete;

    /// Non-zero when a file was found and accepted whole; 0 otherwise.
    unsigned char get_validity() const;

    /// First: the number of entries of key's value (0 when absent or empty). Second: the
    /// largest number of fields of one of its entries. Both stop at 32767.
    std::pair<short, short> GetMaxIndex(const char* key, char entrySeparator,
                                        char fieldSeparator) const;

    /// The integer at field `field` of entry `entry` of key's value, the separators being
    /// the single characters at the two addresses. 0 for an absent key, entry or field, a
    /// negative index, a null argument, or a field that is not one integer.
    int GetInt32ByKey(const char* key, const char* entrySeparator, short entry,
                      const char* fieldSeparator, short field);

    /// The file that was read (found along the search path), empty when none was found.
    const Port::StringBase<char>& GetPath() const;

private:
    struct Keys;
    std::unique_ptr<Keys> m_keys;
};
