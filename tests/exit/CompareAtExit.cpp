//===-- tests/exit/CompareAtExit.cpp - a regexp comparison still answers during exit -===//
//
// A host object that lives in a static may compare property values while it is being
// destroyed, after the runtime has destroyed the thread's per-thread expression caches.
// The comparison must still give its answer, built afresh, without touching the dead
// cache. main() compares first, so that the caches exist and die before the static.
// Exits with 0 only when every comparison, before and during exit, answered right.
//
//===------------------------------------------------------------------------------===//
#include "CommonI/RefCountPtr.h"
#include "VnI/PropertyType.h"
#include "s/PropertyFactory.h"

#include <cstdio>
#include <cstdlib>
#include <string>

using CommonI::RefCountPtr;
using Vn::Eng::PropertyFactory;

namespace {

RefCountPtr<const VnI::IProperty> Text(const std::string& text) {
    return RefCountPtr<const VnI::IProperty>::Adopt(
        PropertyFactory::CreateStringProperty(Port::StringBase<char>(text), true));
}

// The answers a search box would give: a plain match, a case-folded one and a miss.
bool AnswersRight() {
    const auto value = Text("pin A1\nbank 2");
    return value->Equals(Text("pin.*bank"), VnI::MATCH_REGEXP) &&
           value->Equals(Text("PIN.*BANK"), VnI::MATCH_REGEXP | VnI::MATCH_IGNORE_CASE) &&
           !value->Equals(Text("bank"), VnI::MATCH_REGEXP);
}

struct ComparesWhenDestroyed {
    ~ComparesWhenDestroyed() {
        const bool right = AnswersRight() && AnswersRight();
        std::fflush(stdout);
        // Nothing can change main's status any more; leave with our own.
        std::_Exit(right ? 0 : 3);
    }
};

ComparesWhenDestroyed g_comparer;

} // namespace

int main() {
    return AnswersRight() ? 0 : 4;
}
