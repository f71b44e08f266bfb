// Compares a text property with an arbitrary value, pattern and flags: a pattern typed
// into a search box reaches the regular-expression path unfiltered and must never crash
// or hang it. Also checks the assumption the regular-expression path rests on: under a
// match anchored at the start, a leading ^ changes no outcome of a valid expression.
#include "Port/Regexp.h"
#include "s/PropertyFactory.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>

using CommonI::RefCountPtr;
using Vn::Eng::PropertyFactory;
using VnI::IProperty;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 1) {
        return 0;
    }
    const int flags = data[0];
    const std::string_view rest(reinterpret_cast<const char*>(data + 1), size - 1);
    // The first NUL splits value from pattern; without one the value is empty.
    const std::size_t split = rest.find('\0');
    const std::string_view value =
        split == std::string_view::npos ? std::string_view() : rest.substr(0, split);
    const std::string_view pattern =
        split == std::string_view::npos ? rest : rest.substr(split + 1);

    const auto mine = RefCountPtr<const IProperty>::Adopt(
        PropertyFactory::CreateStringProperty(Port::StringBase<char>(value), true));
    const auto theirs = RefCountPtr<const IProperty>::Adopt(
        PropertyFactory::CreateStringProperty(Port::StringBase<char>(pattern), true));
    (void)mine->Equals(theirs, flags);
    (void)mine->Equals(theirs, flags | VnI::MATCH_REGEXP);
    (void)mine->LessThan(theirs, flags);

    const std::string flagsPart = (flags & VnI::MATCH_IGNORE_CASE) != 0 ? "(?i)" : "";
    const Port_Regexp plain(std::string_view(flagsPart + std::string(pattern)));
    if (plain.IsValid()) {
        const Port_Regexp anchored(std::string_view(flagsPart + "^" + std::string(pattern)));
        if (anchored.IsValid() && anchored.MatchesAtStart(value) != plain.MatchesAtStart(value)) {
            std::abort();
        }
    }
    return 0;
}
