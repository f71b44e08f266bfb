//===-- Regexp.cpp - RE2 behind Port_Regexp, with a compile cache ---------------===//
#include "Port/Regexp.h"

#include "Port/StringBase.h"

#include <re2/re2.h>

#include <list>
#include <mutex>
#include <string>
#include <unordered_map>

namespace {

RE2::Options QuietOptions() {
    RE2::Options options;
    // An invalid pattern is an ordinary outcome of a search box, not something to log.
    options.set_log_errors(false);
    // Texts are narrow 8-bit text, not UTF-8: `.` must match any single byte.
    options.set_encoding(RE2::Options::EncodingLatin1);
    return options;
}

} // namespace

struct Port_Regexp::Compiled {
    explicit Compiled(std::string_view pattern)
        : re(re2::StringPiece(pattern.data(), pattern.size()), QuietOptions()) {}
    RE2 re;
};

namespace {

using CompiledPtr = std::shared_ptr<const Port_Regexp::Compiled>;

// A bounded LRU of compiled patterns shared by all threads.
class PatternCache {
public:
    static constexpr size_t kCapacity = 256;

    CompiledPtr Get(std::string_view pattern) {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (auto found = m_index.find(pattern); found != m_index.end()) {
            m_order.splice(m_order.begin(), m_order, found->second);
            return found->second->second;
        }
        auto compiled = std::make_shared<const Port_Regexp::Compiled>(pattern);
        m_order.emplace_front(std::string(pattern), compiled);
        m_index.emplace(m_order.front().first, m_order.begin());
        if (m_order.size() > kCapacity) {
            m_index.erase(m_order.back().first);
            m_order.pop_back();
        }
        return compiled;
    }

private:
    using Entry = std::pair<std::string, CompiledPtr>;
    std::mutex m_mutex;
    std::list<Entry> m_order; // most recently used first
    std::unordered_map<std::string_view, std::list<Entry>::iterator> m_index;
};

PatternCache& SharedCache() {
    static PatternCache cache;
    return cache;
}

// In front of the shared cache, the last pattern of this thread: a search compares every
// holder with the same pattern, so most constructions take no lock at all.
CompiledPtr Lookup(std::string_view pattern) {
    thread_local std::string lastPattern;
    thread_local CompiledPtr lastCompiled;
    if (lastCompiled && lastPattern == pattern) {
        return lastCompiled;
    }
    CompiledPtr compiled = SharedCache().Get(pattern);
    lastPattern.assign(pattern);
    lastCompiled = compiled;
    return compiled;
}

} // namespace

Port_Regexp::Port_Regexp(const Port::StringBase<char>& pattern)
    : m_compiled(Lookup(pattern.view())) {}
Port_Regexp::Port_Regexp(std::string_view pattern) : m_compiled(Lookup(pattern)) {}
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
    if (!IsValid()) {
        return false;
    }
    re2::StringPiece input(text.data(), text.size());
    return m_compiled->re.Match(input, 0, input.size(), RE2::ANCHOR_START, nullptr, 0);
}
