//===-- Port/LastBuilt.h - the one value last built from a text -----------------===//
//
// \file
// A search compares every holder with one pattern, so whatever is built from that
// pattern (a compiled expression) is asked for again and again with the same text.
// LastBuilt keeps the value built last, with the text and the option bits it was built
// from, and builds again only when either changes. Keep one per thread, as a
// thread_local: it takes no lock, and a value is then never shared between threads.
//
// The runtime destroys a thread's thread_locals before its statics (and before older
// thread_locals), and a host object dying then may still compare texts. So ask Gone()
// before reaching the thread_local, and build afresh once it has been destroyed:
//
//   if (Port::LastBuilt<Port_Regexp>::Gone()) { return use(Port_Regexp(pattern)); }
//   thread_local Port::LastBuilt<Port_Regexp> last;
//   return use(last.Get(pattern, flags, [&] { return Port_Regexp(pattern); }));
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>

namespace Port {

template <class Value> class LastBuilt {
public:
    LastBuilt() = default;
    ~LastBuilt() { Gone() = true; }
    LastBuilt(const LastBuilt&) = delete;
    LastBuilt& operator=(const LastBuilt&) = delete;

    /// True on this thread once a LastBuilt<Value> of it has been destroyed (thread or
    /// process exit). The flag is trivially destructible, so it is never torn down itself.
    static bool& Gone() {
        thread_local bool gone = false;
        return gone;
    }

    /// The value last built from `text` and `options`; calls `build()` (which returns a
    /// Value) first when there is none. If build throws, nothing is kept, and the next
    /// call builds again. The reference is valid until the next Get on this object.
    template <class Build> const Value& Get(std::string_view text, int options, Build&& build) {
        if (!m_value || m_options != options || m_text != text) {
            // Emptied first: should the text not fit in memory, no value is left under a
            // key that is not its own.
            m_value.reset();
            m_text.assign(text);
            m_options = options;
            m_value.emplace(std::forward<Build>(build)());
        }
        return *m_value;
    }

private:
    std::string m_text;
    int m_options = 0;
    std::optional<Value> m_value;
};

} // namespace Port
