//===-- PM_DEVKEY.cpp -----------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "devdata/PM_DEVKEY.h"

#include "Port/MsgMan.h"
#include "Port/SafeFile.h"
#include "Port/SearchPath.h"

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <istream>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace {

const char kRevision[] = "$Revision: 1.1 $";
const char kDomain[] = "devdata";
const char kUnit[] = "PM_DEVKEY";

// The characters that may join integers in a value. Keeping the set small lets a typo
// such as "1.5" or "12a" reject the file instead of reading as a quiet 0 later.
constexpr std::string_view kSeparators = ":,;|/";

bool IsBlank(char c) {
    return c == ' ' || c == '\t';
}
bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}
bool IsKeyChar(char c) {
    return IsDigit(c) || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '_';
}

// One key's value as parsed: the integers in order and the separator between each
// neighbouring pair. How entries and fields fall out of it depends on the separators a
// reader asks with, so that split is made on demand and kept for the next read with the
// same pair (readers walk a list with one pair, field after field).
struct Value {
    std::vector<std::int32_t> numbers;
    std::string separators; // separators[i] stands between numbers[i] and numbers[i + 1]

    mutable bool split = false;
    mutable char entrySeparator = 0;
    mutable char fieldSeparator = 0;
    mutable std::vector<std::int32_t> fields; // 0 for a field that is not one integer
    mutable std::vector<std::uint32_t>
        entryStart; // entry e is fields[entryStart[e], entryStart[e + 1])
    mutable std::uint32_t maxFields = 0;

    void Split(char entrySep, char fieldSep) const {
        if (split && entrySep == entrySeparator && fieldSep == fieldSeparator) {
            return;
        }
        fields.clear();
        entryStart.clear();
        maxFields = 0;
        if (!numbers.empty()) {
            entryStart.push_back(0);
            bool composite = false;
            auto closeField = [&](std::size_t i) {
                fields.push_back(composite ? 0 : numbers[i]);
                composite = false;
            };
            auto closeEntry = [&] {
                const auto count = static_cast<std::uint32_t>(fields.size()) - entryStart.back();
                maxFields = std::max(maxFields, count);
                entryStart.push_back(static_cast<std::uint32_t>(fields.size()));
            };
            for (std::size_t i = 0; i < separators.size(); ++i) {
                const char c = separators[i];
                if (c == entrySep) {
                    closeField(i);
                    closeEntry();
                } else if (c == fieldSep) {
                    closeField(i);
                } else {
                    composite = true;
                }
            }
            closeField(numbers.size() - 1);
            closeEntry();
        }
        split = true;
        entrySeparator = entrySep;
        fieldSeparator = fieldSep;
    }

    std::size_t EntryCount() const { return entryStart.empty() ? 0 : entryStart.size() - 1; }
};

short ClampShort(std::size_t n) {
    return static_cast<short>(std::min<std::size_t>(n, SHRT_MAX));
}

// A position in one line of a key file.
struct LineCursor {
    std::string_view line;
    std::size_t p = 0;

    bool AtEnd() const { return p == line.size(); }
    char Peek() const { return line[p]; }
    void SkipBlanks() {
        while (p < line.size() && IsBlank(line[p])) {
            ++p;
        }
    }
};

// "KEY =" at the cursor, which is then past the equals sign.
bool ReadKey(LineCursor& at, std::string& key, std::string& reason) {
    const std::size_t keyBegin = at.p;
    while (!at.AtEnd() && IsKeyChar(at.Peek())) {
        ++at.p;
    }
    const std::size_t keyEnd = at.p;
    at.SkipBlanks();
    if (keyEnd == keyBegin || at.AtEnd() || at.Peek() != '=') {
        reason = "expected KEY = value";
        return false;
    }
    ++at.p;
    key.assign(at.line.substr(keyBegin, keyEnd - keyBegin));
    return true;
}

// One signed 32-bit decimal integer at the cursor. Digits are added up in 64 bits and
// checked at each step, so no run of digits can overflow on the way.
bool ReadInteger(LineCursor& at, std::int32_t& number, std::string& reason) {
    const bool negative = !at.AtEnd() && at.Peek() == '-';
    if (negative) {
        ++at.p;
    }
    if (at.AtEnd() || !IsDigit(at.Peek())) {
        reason = "a field is not an integer";
        return false;
    }
    std::int64_t magnitude = 0;
    while (!at.AtEnd() && IsDigit(at.Peek())) {
        magnitude = magnitude * 10 + (at.Peek() - '0');
        if (magnitude > std::int64_t{INT32_MAX} + 1) {
            reason = "an integer lies outside the signed 32-bit range";
            return false;
        }
        ++at.p;
    }
    if (!negative && magnitude > INT32_MAX) {
        reason = "an integer lies outside the signed 32-bit range";
        return false;
    }
    number = static_cast<std::int32_t>(negative ? -magnitude : magnitude);
    return true;
}

// Parses one line. Answers true for a line that holds nothing, or a key and its value
// (then `key` is not empty); false with `reason` set for anything else.
bool ParseLine(std::string_view line, std::string& key, Value& value, std::string& reason) {
    if (const auto hash = line.find('#'); hash != std::string_view::npos) {
        line = line.substr(0, hash);
    }
    LineCursor at{line};
    at.SkipBlanks();
    if (at.AtEnd()) {
        return true;
    }
    if (!ReadKey(at, key, reason)) {
        return false;
    }
    at.SkipBlanks();
    if (at.AtEnd()) {
        return true; // an empty value: a key with no entries
    }
    for (;;) {
        std::int32_t number = 0;
        if (!ReadInteger(at, number, reason)) {
            return false;
        }
        value.numbers.push_back(number);
        at.SkipBlanks();
        if (at.AtEnd()) {
            return true;
        }
        if (kSeparators.find(at.Peek()) == std::string_view::npos) {
            reason = "a field is not an integer";
            return false;
        }
        value.separators.push_back(at.Peek());
        ++at.p;
        at.SkipBlanks();
    }
}

// One line of the file, without its end. CR, LF and CR LF all end a line: a scheme saved
// by an editor that writes CR alone must not read as one long comment.
bool NextLine(std::istream& in, std::string& line) {
    line.clear();
    std::streambuf* buffer = in.rdbuf();
    using Traits = std::char_traits<char>;
    Traits::int_type c = buffer->sbumpc();
    if (Traits::eq_int_type(c, Traits::eof())) {
        in.setstate(std::ios::eofbit);
        return false;
    }
    for (; !Traits::eq_int_type(c, Traits::eof()); c = buffer->sbumpc()) {
        const char ch = Traits::to_char_type(c);
        if (ch == '\n') {
            return true;
        }
        if (ch == '\r') {
            if (Traits::eq_int_type(buffer->sgetc(), Traits::to_int_type('\n'))) {
                buffer->sbumpc();
            }
            return true;
        }
        line.push_back(ch);
    }
    return true;
}

std::filesystem::path FindFile(const char* name, bool search) {
    namespace fs = std::filesystem;
    std::error_code ec;
    auto usable = [&ec](const fs::path& candidate) { return fs::is_regular_file(candidate, ec); };

    const std::string_view bare(name);
    if (!search || bare.find('/') != std::string_view::npos) {
        return usable(bare) ? fs::path(bare) : fs::path();
    }
    for (const std::string& dir : Port::SearchPathFromEnv("VENLOMER_DATA_PATH")) {
        if (usable(fs::path(dir) / bare)) {
            return fs::path(dir) / bare;
        }
    }
    if (usable(bare)) {
        return fs::path(bare);
    }
#ifdef VENLOMER_INSTALL_FULL_DATADIR
    if (usable(fs::path(VENLOMER_INSTALL_FULL_DATADIR) / bare)) {
        return fs::path(VENLOMER_INSTALL_FULL_DATADIR) / bare;
    }
#endif
    return {};
}

} // namespace

struct PM_DEVKEY::Keys {
    Port::StringBase<char> path;
    bool valid = false;
    std::unordered_map<std::string, Value> values;

    const Value* Find(const char* key) const {
        if (key == nullptr) {
            return nullptr;
        }
        const auto it = values.find(key);
        return it == values.end() ? nullptr : &it->second;
    }

    // Reads the whole file; any fault empties the keys again, so a rejected file never
    // leaves half its keys behind.
    void Read(const std::filesystem::path& file, bool report) {
        Port::InputFile input;
        std::string why;
        if (!input.Open(file.string(), why, kMaxFileBytes)) {
            if (report) {
                Port_MsgManData::createObject(kDomain, kUnit, __LINE__, kRevision)
                    .issueError("Key file %s cannot be read: %s\n", path.c_str(), why.c_str());
            }
            return;
        }
        std::istream& in = input.Stream();
        std::unordered_map<std::string, unsigned long> firstLine;
        std::string line;
        std::string key;
        std::string reason;
        unsigned long lineNumber = 0;
        while (NextLine(in, line)) {
            ++lineNumber;
            key.clear();
            Value value;
            if (!ParseLine(line, key, value, reason)) {
                Reject(report, lineNumber, reason);
                return;
            }
            if (key.empty()) {
                continue;
            }
            const auto [seen, inserted] = firstLine.try_emplace(key, lineNumber);
            if (!inserted) {
                Reject(report, lineNumber,
                       "key " + key + " is defined twice (first on line " +
                           std::to_string(seen->second) + ")");
                return;
            }
            values.emplace(std::move(key), std::move(value));
        }
        if (in.bad() || input.Failed(why)) {
            values.clear();
            if (report) {
                Port_MsgManData::createObject(kDomain, kUnit, __LINE__, kRevision)
                    .issueError("Key file %s cannot be read: %s\n", path.c_str(),
                                why.empty() ? "read error" : why.c_str());
            }
            return;
        }
        valid = true;
    }

    void Reject(bool report, unsigned long lineNumber, const std::string& reason) {
        values.clear();
        if (report) {
            Port_MsgManData::createObject(kDomain, kUnit, __LINE__, kRevision)
                .issueError("Key file %s rejected, line %lu: %s\n", path.c_str(), lineNumber,
                            reason.c_str());
        }
    }
};

PM_DEVKEY::PM_DEVKEY(const char* fileName, PM_PIC* /*part*/, unsigned char required,
                     unsigned char search, unsigned char report)
    : m_keys(std::make_unique<Keys>()) {
    if (fileName == nullptr || *fileName == '\0') {
        return;
    }
    const std::filesystem::path file = FindFile(fileName, search != 0);
    if (file.empty()) {
        if (required != 0) {
            Port_MsgManData::createObject(kDomain, kUnit, __LINE__, kRevision)
                .issueError("Key file %s not found\n", fileName);
        }
        return;
    }
    m_keys->path = Port::StringBase<char>(file.string());
    m_keys->Read(file, report != 0);
}

PM_DEVKEY::~PM_DEVKEY() = default;

unsigned char PM_DEVKEY::get_validity() const {
    return m_keys->valid ? 1 : 0;
}

std::pair<short, short> PM_DEVKEY::GetMaxIndex(const char* key, char entrySeparator,
                                               char fieldSeparator) const {
    const Value* value = m_keys->Find(key);
    if (value == nullptr) {
        return {0, 0};
    }
    value->Split(entrySeparator, fieldSeparator);
    return {ClampShort(value->EntryCount()), ClampShort(value->maxFields)};
}

int PM_DEVKEY::GetInt32ByKey(const char* key, const char* entrySeparator, short entry,
                             const char* fieldSeparator, short field) {
    if (entrySeparator == nullptr || fieldSeparator == nullptr || entry < 0 || field < 0) {
        return 0;
    }
    const Value* value = m_keys->Find(key);
    if (value == nullptr) {
        return 0;
    }
    value->Split(*entrySeparator, *fieldSeparator);
    const auto e = static_cast<std::size_t>(entry);
    if (e >= value->EntryCount()) {
        return 0;
    }
    const std::size_t begin = value->entryStart[e];
    const std::size_t end = value->entryStart[e + 1];
    const auto f = static_cast<std::size_t>(field);
    return f < end - begin ? value->fields[begin + f] : 0;
}

const Port::StringBase<char>& PM_DEVKEY::GetPath() const {
    return m_keys->path;
}
