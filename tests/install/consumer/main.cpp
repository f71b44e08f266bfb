//===-- tests/install/consumer/main.cpp - a consumer builds against the installed tree -===//
#include "s/CStringContainer.h"
#include "s/ColorScheme.h"

#include <cstdio>

int main() {
    auto texts = Vn::Eng::CStringContainer::CreateInstance();
    texts->AddString("one");
    texts->AddString("two");
    std::printf("consumer: %d texts\n", texts->GetNumStrings());
    // Where the library found its data, so an install can be checked for the folder its
    // library was configured to look in.
    using Vn::Eng::ColorScheme;
    std::printf("consumer: colour scheme %s %s\n",
                ColorScheme::GetSource() == ColorScheme::Source::Read ? "read from" : "not read",
                ColorScheme::GetPath().c_str());
    return texts->GetNumStrings() == 2 ? 0 : 1;
}
