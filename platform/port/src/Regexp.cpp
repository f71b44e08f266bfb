//===-- Regexp.cpp - RE2 behind Port_Regexp, with a compile cache ---------------===//
#include "Port/Regexp.h"

#include "Port/LastBuilt.h"
#include "Port/StringBase.h"

#include <re2/re2.h>

#include <algorithm>
#include <cstdint>
#include <list>
#include <mutex>
#include <optional>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace {

// The most one compiled expression may grow to (its programs and the state caches its
// automata fill while matching); the cache charges every entry this much, so the bound
// holds however the entries are used later.
constexpr std::int64_t kMaxMemPerExpression = std::int64_t{512} * 1024;
// What the shared cache may hold in all.
constexpr std::size_t kCacheBudget = std::size_t{8} * 1024 * 1024;

RE2::Options QuietOptions() {
    RE2::Options options;
    // An invalid pattern is an ordinary outcome of a search box, not something to log.
    options.set_log_errors(false);
    // Texts are narrow 8-bit text, not UTF-8: `.` must match any single byte, line
    // breaks included.
    options.set_encoding(RE2::Options::EncodingLatin1);
    options.set_dot_nl(true);
    options.set_max_mem(kMaxMemPerExpression);
    return options;
}

//===-- Case folding -------------------------------------------------------------===//
//
// Ignoring case means what it means everywhere else in the library: A-Z and a-z are the
// same letters, and no other byte has a case. RE2's own folding in Latin-1 mode also
// pairs the accented capitals with their small letters, so the engine never folds: the
// pattern is rewritten instead, a letter becoming the class of both its cases and a class
// gaining the other case of every letter it holds. A class is completed before it is
// negated ([^a] excludes a and A). The (?i) flag of a pattern, on or off, for the rest of
// a group or inside (?i:...), is honoured by the same rewrite.

bool IsAsciiLetter(unsigned c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
}

bool IsOctal(char c) {
    return c >= '0' && c <= '7';
}

int HexValue(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    if (c >= 'A' && c <= 'F') {
        return c - 'A' + 10;
    }
    return -1;
}

class CaseFolder {
public:
    CaseFolder(std::string_view pattern, bool ignoreCase) : m_p(pattern), m_fold(ignoreCase) {}

    // The rewritten pattern, or nullopt for a pattern the rewrite cannot read; every such
    // pattern is one the engine refuses as well.
    std::optional<std::string> Run() {
        m_out.reserve(m_p.size() * 2);
        while (m_i < m_p.size()) {
            if (!Step()) {
                return std::nullopt;
            }
        }
        return std::move(m_out);
    }

private:
    // The other-case letters a class must gain: bit n for 'A'+n, bit 26+n for 'a'+n.
    using Letters = std::uint64_t;

    static Letters LettersIn(unsigned lo, unsigned hi) {
        Letters set = 0;
        for (unsigned c = std::max(lo, unsigned{'A'}); c <= std::min(hi, unsigned{'z'}); ++c) {
            if (c <= 'Z') {
                set |= Letters{1} << (c - 'A');
            } else if (c >= 'a') {
                set |= Letters{1} << (26 + c - 'a');
            }
        }
        return set;
    }
    static constexpr Letters kUpper = (Letters{1} << 26) - 1;
    static constexpr Letters kLower = kUpper << 26;

    // The letters of the other case that `set` lacks, as class items.
    static std::string Completion(Letters set) {
        std::string items;
        for (unsigned n = 0; n < 26; ++n) {
            const bool upper = (set >> n) & 1;
            const bool lower = (set >> (26 + n)) & 1;
            if (upper && !lower) {
                items += static_cast<char>('a' + n);
            } else if (lower && !upper) {
                items += static_cast<char>('A' + n);
            }
        }
        return items;
    }

    void EmitLiteral(unsigned c) {
        if (m_fold && IsAsciiLetter(c)) {
            m_out += '[';
            m_out += static_cast<char>(c);
            m_out += static_cast<char>(c ^ 0x20);
            m_out += ']';
        } else if ((c >= '0' && c <= '9') || IsAsciiLetter(c)) {
            m_out += static_cast<char>(c);
        } else {
            static const char kHex[] = "0123456789abcdef";
            m_out += "\\x{";
            m_out += kHex[c >> 4];
            m_out += kHex[c & 15];
            m_out += '}';
        }
    }

    // \x{...}, \xHH and octal escapes at m_i (the backslash): the byte they stand for.
    std::optional<unsigned> NumericEscape() {
        const char e = m_p[m_i + 1];
        size_t j = m_i + 2;
        unsigned value = 0;
        if (e == 'x') {
            if (j < m_p.size() && m_p[j] == '{') {
                const size_t close = m_p.find('}', j);
                if (close == std::string_view::npos || close == j + 1 || close - j > 9) {
                    return std::nullopt;
                }
                for (size_t k = j + 1; k < close; ++k) {
                    const int h = HexValue(m_p[k]);
                    if (h < 0) {
                        return std::nullopt;
                    }
                    value = value * 16 + static_cast<unsigned>(h);
                }
                j = close + 1;
            } else {
                if (j + 2 > m_p.size() || HexValue(m_p[j]) < 0 || HexValue(m_p[j + 1]) < 0) {
                    return std::nullopt;
                }
                value = static_cast<unsigned>(HexValue(m_p[j]) * 16 + HexValue(m_p[j + 1]));
                j += 2;
            }
        } else {
            // \0 alone is NUL; \1 to \7 need a second octal digit (alone they would be
            // back references, which the engine refuses). Up to three digits in all.
            if (e != '0' && (j >= m_p.size() || !IsOctal(m_p[j]))) {
                return std::nullopt;
            }
            value = static_cast<unsigned>(e - '0');
            for (int more = 0; more < 2 && j < m_p.size() && IsOctal(m_p[j]); ++more, ++j) {
                value = value * 8 + static_cast<unsigned>(m_p[j] - '0');
            }
        }
        if (value > 0xFF) {
            return std::nullopt;
        }
        m_i = j;
        return value;
    }

    // \p and \P at m_i: the escape as written, and the letters the class it names holds
    // (only the letter categories hold one case of ASCII letters without the other).
    std::optional<std::pair<std::string, Letters>> UnicodeClassEscape() {
        size_t j = m_i + 2;
        if (j >= m_p.size()) {
            return std::nullopt;
        }
        std::string_view name;
        if (m_p[j] == '{') {
            const size_t close = m_p.find('}', j);
            if (close == std::string_view::npos) {
                return std::nullopt;
            }
            name = m_p.substr(j + 1, close - j - 1);
            j = close + 1;
        } else {
            name = m_p.substr(j, 1);
            j += 1;
        }
        bool negated = m_p[m_i + 1] == 'P';
        if (!name.empty() && name.front() == '^') {
            negated = !negated;
            name.remove_prefix(1);
        }
        Letters held = 0;
        if (name == "Lu") {
            held = negated ? kLower : kUpper;
        } else if (name == "Ll") {
            held = negated ? kUpper : kLower;
        }
        std::pair<std::string, Letters> out{std::string(m_p.substr(m_i, j - m_i)), held};
        m_i = j;
        return out;
    }

    // One character of a class at m_i: its byte, or nullopt when the item is no single
    // byte (then `held` has gained the letters of the named class it is).
    struct ClassChar {
        bool single = false;
        unsigned value = 0;
        bool rawDash = false;
    };
    std::optional<ClassChar> ReadClassChar(Letters& held) {
        const char c = m_p[m_i];
        if (PosixClass(held)) {
            return ClassChar{};
        }
        if (c != '\\') {
            ++m_i;
            return ClassChar{true, static_cast<unsigned char>(c), c == '-'};
        }
        return ClassEscape(held);
    }

    // [:name:] at m_i: skipped, its letters added to `held`. False when there is none.
    bool PosixClass(Letters& held) {
        if (m_p[m_i] != '[' || m_i + 1 >= m_p.size() || m_p[m_i + 1] != ':') {
            return false;
        }
        const size_t close = m_p.find(":]", m_i + 2);
        if (close == std::string_view::npos) {
            return false;
        }
        std::string_view name = m_p.substr(m_i + 2, close - m_i - 2);
        const bool negated = !name.empty() && name.front() == '^';
        if (negated) {
            name.remove_prefix(1);
        }
        if (name == "upper") {
            held |= negated ? kLower : kUpper;
        } else if (name == "lower") {
            held |= negated ? kUpper : kLower;
        }
        m_i = close + 2;
        return true;
    }

    // A backslash escape inside a class, at m_i; as ReadClassChar.
    std::optional<ClassChar> ClassEscape(Letters& held) {
        if (m_i + 1 >= m_p.size()) {
            return std::nullopt;
        }
        const char e = m_p[m_i + 1];
        switch (e) {
        case 'd':
        case 'D':
        case 's':
        case 'S':
        case 'w':
        case 'W':
            m_i += 2; // each holds both cases of a letter or neither
            return ClassChar{};
        case 'p':
        case 'P': {
            auto named = UnicodeClassEscape();
            if (!named) {
                return std::nullopt;
            }
            held |= named->second;
            return ClassChar{};
        }
        case 'x':
        case '0':
        case '1':
        case '2':
        case '3':
        case '4':
        case '5':
        case '6':
        case '7': {
            auto value = NumericEscape();
            if (!value) {
                return std::nullopt;
            }
            return ClassChar{true, *value, false};
        }
        default:
            break;
        }
        static const std::string_view kControls = "a\af\ft\tn\nr\rv\v";
        m_i += 2;
        if (const size_t at = kControls.find(e); at != std::string_view::npos && at % 2 == 0) {
            return ClassChar{true, static_cast<unsigned char>(kControls[at + 1]), false};
        }
        if (IsAsciiLetter(static_cast<unsigned char>(e)) || (e >= '0' && e <= '9')) {
            return std::nullopt; // no such escape in a class
        }
        return ClassChar{true, static_cast<unsigned char>(e), false};
    }

    bool Class() {
        const size_t open = m_i++;
        if (m_i < m_p.size() && m_p[m_i] == '^') {
            ++m_i;
        }
        Letters held = 0;
        bool first = true;
        bool endsInRawDash = false;
        while (m_i < m_p.size() && (m_p[m_i] != ']' || first)) {
            first = false;
            auto lo = ReadClassChar(held);
            if (!lo) {
                return false;
            }
            endsInRawDash = lo->rawDash;
            if (!lo->single) {
                continue;
            }
            unsigned hi = lo->value;
            if (m_i + 1 < m_p.size() && m_p[m_i] == '-' && m_p[m_i + 1] != ']') {
                ++m_i;
                auto end = ReadClassChar(held);
                if (!end || !end->single || end->value < lo->value) {
                    return false;
                }
                hi = end->value;
                endsInRawDash = false;
            }
            held |= LettersIn(lo->value, hi);
        }
        if (m_i >= m_p.size()) {
            return false;
        }
        std::string_view body = m_p.substr(open + 1, m_i - open - 1);
        ++m_i; // the closing bracket
        const std::string extra = m_fold ? Completion(held) : std::string();
        m_out += '[';
        if (endsInRawDash && !extra.empty()) {
            // A dash closing the class is literal only there: the extra letters go before.
            body.remove_suffix(1);
            m_out.append(body).append(extra).append("-");
        } else {
            m_out.append(body).append(extra);
        }
        m_out += ']';
        return true;
    }

    // (?flags), (?flags: and (?: at m_i. The i flag is taken out and applied by the
    // rewrite.
    bool FlagGroup() {
        size_t j = m_i + 2;
        bool negated = false;
        bool sawFlag = false;
        bool fold = m_fold;
        std::string on;
        std::string off;
        for (; j < m_p.size() && m_p[j] != ':' && m_p[j] != ')'; ++j) {
            const char f = m_p[j];
            if (f == '-') {
                if (negated) {
                    return false;
                }
                negated = true;
                sawFlag = false;
                continue;
            }
            if (f != 'i' && f != 'm' && f != 's' && f != 'U') {
                return false;
            }
            sawFlag = true;
            if (f == 'i') {
                fold = !negated;
            } else {
                (negated ? off : on) += f;
            }
        }
        if (j >= m_p.size() || (negated && !sawFlag)) {
            return false; // unterminated, or no flag after the dash
        }
        const bool scoped = m_p[j] == ':';
        std::string flags = on;
        if (!off.empty()) {
            flags += '-' + off;
        }
        if (scoped) {
            m_saved.push_back(m_fold);
            m_out += "(?" + flags + ":";
        } else if (!flags.empty()) {
            m_out += "(?" + flags + ")";
        }
        m_fold = fold;
        m_i = j + 1;
        return true;
    }

    bool Step() {
        const char c = m_p[m_i];
        switch (c) {
        case '\\':
            return Escape();
        case '[':
            return Class();
        case '(':
            return OpenGroup();
        case ')':
            if (m_saved.empty()) {
                return false;
            }
            m_fold = m_saved.back();
            m_saved.pop_back();
            m_out += ')';
            ++m_i;
            return true;
        default:
            if (m_fold && IsAsciiLetter(static_cast<unsigned char>(c))) {
                EmitLiteral(static_cast<unsigned char>(c));
            } else {
                m_out += c;
            }
            ++m_i;
            return true;
        }
    }

    // A backslash escape outside a class, at m_i.
    bool Escape() {
        if (m_i + 1 >= m_p.size()) {
            return false;
        }
        const char e = m_p[m_i + 1];
        if (e == 'Q') {
            const size_t end = m_p.find("\\E", m_i + 2);
            const std::string_view quoted = m_p.substr(
                m_i + 2, end == std::string_view::npos ? std::string_view::npos : end - m_i - 2);
            for (const char q : quoted) {
                EmitLiteral(static_cast<unsigned char>(q));
            }
            m_i = end == std::string_view::npos ? m_p.size() : end + 2;
            return true;
        }
        if (e == 'x' || IsOctal(e)) {
            auto value = NumericEscape();
            if (!value) {
                return false;
            }
            EmitLiteral(*value);
            return true;
        }
        if (e == 'p' || e == 'P') {
            auto named = UnicodeClassEscape();
            if (!named) {
                return false;
            }
            const std::string extra = m_fold ? Completion(named->second) : std::string();
            m_out += extra.empty() ? named->first : "[" + named->first + extra + "]";
            return true;
        }
        m_out.append(m_p.substr(m_i, 2));
        m_i += 2;
        return true;
    }

    // An opening parenthesis at m_i: a plain, named or flag group.
    bool OpenGroup() {
        if (m_i + 1 < m_p.size() && m_p[m_i + 1] == '?') {
            const char kind = m_i + 2 < m_p.size() ? m_p[m_i + 2] : '\0';
            if (kind == 'P' || kind == '<') {
                const size_t close = m_p.find('>', m_i);
                if (close == std::string_view::npos) {
                    return false;
                }
                m_saved.push_back(m_fold);
                m_out.append(m_p.substr(m_i, close + 1 - m_i));
                m_i = close + 1;
                return true;
            }
            return FlagGroup();
        }
        m_saved.push_back(m_fold);
        m_out += '(';
        ++m_i;
        return true;
    }

    std::string_view m_p;
    size_t m_i = 0;
    bool m_fold;
    std::vector<bool> m_saved; // the folding outside each open group
    std::string m_out;
};

// What the engine is given for a pattern. A pattern that neither ignores case nor sets
// any flag is given as it is.
std::string EnginePattern(std::string_view pattern, bool ignoreCase) {
    if (!ignoreCase && pattern.find("(?") == std::string_view::npos) {
        return std::string(pattern);
    }
    std::optional<std::string> folded = CaseFolder(pattern, ignoreCase).Run();
    return folded ? std::move(*folded) : std::string(pattern);
}

} // namespace

namespace {

bool IsMeta(char c) {
    return std::string_view(".[]()*+?{}|^$\\").find(c) != std::string_view::npos;
}

// The bytes every match anchored at the start must begin with: the plain characters
// that open the pattern, less the last one when a repeat follows it ("ab*" requires only
// "a"). A search rejects most texts on them with one short compare, where the engine
// spends a few hundred instructions per call even on a text it refuses at once. Patterns
// with an alternation or a flag group are left to the engine.
std::string RequiredPrefix(std::string_view pattern) {
    if (pattern.find('|') != std::string_view::npos ||
        pattern.find("(?") != std::string_view::npos) {
        return {};
    }
    size_t i = 0;
    while (i < pattern.size() && pattern[i] == '^') {
        ++i;
    }
    std::string prefix;
    for (; i < pattern.size() && !IsMeta(pattern[i]); ++i) {
        prefix += pattern[i];
    }
    if (!prefix.empty() && i < pattern.size() &&
        std::string_view("*?{").find(pattern[i]) != std::string_view::npos) {
        prefix.pop_back();
    }
    return prefix;
}

char FoldAscii(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
}

} // namespace

struct Port_Regexp::Compiled {
    Compiled(std::string_view pattern, bool ignoreCase)
        : re(EnginePattern(pattern, ignoreCase), QuietOptions()), prefix(RequiredPrefix(pattern)),
          foldPrefix(ignoreCase) {
        if (foldPrefix) {
            std::transform(prefix.begin(), prefix.end(), prefix.begin(), FoldAscii);
        }
    }

    bool MayMatchAtStart(std::string_view text) const {
        if (text.size() < prefix.size()) {
            return false;
        }
        if (!foldPrefix) {
            return text.compare(0, prefix.size(), prefix) == 0;
        }
        for (size_t i = 0; i < prefix.size(); ++i) {
            if (FoldAscii(text[i]) != prefix[i]) {
                return false;
            }
        }
        return true;
    }

    RE2 re;
    std::string prefix; // ASCII letters folded to small ones when case is ignored
    bool foldPrefix;
};

namespace {

using CompiledPtr = std::shared_ptr<const Port_Regexp::Compiled>;

// The cache key: the folding, then the pattern.
std::string KeyOf(std::string_view pattern, bool ignoreCase) {
    std::string key;
    key.reserve(pattern.size() + 1);
    key += ignoreCase ? 'i' : '-';
    key += pattern;
    return key;
}

// What an entry may come to hold: the most its expression may grow to, its parse trees
// (a few dozen bytes a pattern byte), the key twice (list and index) and the bookkeeping.
std::size_t ChargeOf(const std::string& key, const Port_Regexp::Compiled& compiled) {
    const std::size_t engine =
        compiled.re.ok() ? static_cast<std::size_t>(kMaxMemPerExpression) : std::size_t{0};
    return engine + key.size() * 66 + 256;
}

// An LRU of compiled patterns shared by all threads, bounded by the memory its entries
// may hold rather than by their number: a search box that runs for days sees any number
// of distinct patterns.
class PatternCache {
public:
    CompiledPtr Get(std::string_view pattern, bool ignoreCase) {
        std::string key = KeyOf(pattern, ignoreCase);
        {
            std::lock_guard<std::mutex> lock(m_mutex);
            if (auto found = m_index.find(key); found != m_index.end()) {
                m_order.splice(m_order.begin(), m_order, found->second);
                return found->second->compiled;
            }
        }
        // Compiled outside the lock: other threads' look-ups do not wait for it.
        auto compiled = std::make_shared<const Port_Regexp::Compiled>(pattern, ignoreCase);
        const std::size_t charge = ChargeOf(key, *compiled);
        std::lock_guard<std::mutex> lock(m_mutex);
        if (auto found = m_index.find(key); found != m_index.end()) {
            return found->second->compiled; // another thread was quicker
        }
        if (charge > kCacheBudget) {
            return compiled; // used by the caller alone, never kept
        }
        m_order.push_front(Entry{std::move(key), compiled, charge});
        m_index.emplace(m_order.front().key, m_order.begin());
        m_bytes += charge;
        while (m_bytes > kCacheBudget) {
            m_bytes -= m_order.back().charge;
            m_index.erase(m_order.back().key);
            m_order.pop_back();
        }
        return compiled;
    }

    std::size_t Bytes() {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_bytes;
    }

private:
    struct Entry {
        std::string key;
        CompiledPtr compiled;
        std::size_t charge;
    };
    std::mutex m_mutex;
    std::list<Entry> m_order; // most recently used first
    std::unordered_map<std::string_view, std::list<Entry>::iterator> m_index;
    std::size_t m_bytes = 0;
};

PatternCache& SharedCache() {
    // Never destroyed: a static object of the host may still compile a pattern while the
    // process's statics are being torn down.
    static PatternCache& cache = *new PatternCache;
    return cache;
}

// In front of the shared cache, the last pattern of this thread: a search compares every
// holder with the same pattern, so most constructions take no lock at all.
CompiledPtr Lookup(std::string_view pattern, bool ignoreCase) {
    if (Port::LastBuilt<CompiledPtr>::Gone()) {
        return SharedCache().Get(pattern, ignoreCase);
    }
    thread_local Port::LastBuilt<CompiledPtr> last;
    return last.Get(pattern, ignoreCase ? 1 : 0,
                    [&] { return SharedCache().Get(pattern, ignoreCase); });
}

} // namespace

std::size_t Port_Regexp::CacheBytes() {
    return SharedCache().Bytes();
}

std::size_t Port_Regexp::CacheBudget() {
    return kCacheBudget;
}

Port_Regexp::Port_Regexp(const Port::StringBase<char>& pattern, Case letterCase)
    : m_compiled(Lookup(pattern.view(), letterCase == Case::Ignore)) {}
Port_Regexp::Port_Regexp(std::string_view pattern, Case letterCase)
    : m_compiled(Lookup(pattern, letterCase == Case::Ignore)) {}
Port_Regexp::Port_Regexp(const Port_Regexp&) = default;
Port_Regexp& Port_Regexp::operator=(const Port_Regexp&) = default;
Port_Regexp::~Port_Regexp() = default;

bool Port_Regexp::IsValid() const {
    return m_compiled && m_compiled->re.ok();
}

bool Port_Regexp::Find(std::string_view text, unsigned int* start, unsigned int* length) const {
    if (!IsValid()) {
        return false;
    }
    re2::StringPiece input(text.data(), text.size());
    re2::StringPiece match;
    if (!m_compiled->re.Match(input, 0, input.size(), RE2::UNANCHORED, &match, 1)) {
        return false;
    }
    if (start != nullptr) {
        *start = static_cast<unsigned int>(match.data() - input.data());
    }
    if (length != nullptr) {
        *length = static_cast<unsigned int>(match.size());
    }
    return true;
}

bool Port_Regexp::MatchesAtStart(std::string_view text) const {
    if (!IsValid() || !m_compiled->MayMatchAtStart(text)) {
        return false;
    }
    re2::StringPiece input(text.data(), text.size());
    return m_compiled->re.Match(input, 0, input.size(), RE2::ANCHOR_START, nullptr, 0);
}
