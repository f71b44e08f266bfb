//===-- tests/install/consumer/main.cpp - a consumer builds against the installed tree -===//
#include "s/CStringContainer.h"

#include <cstdio>

int main() {
    auto texts = Vn::Eng::CStringContainer::CreateInstance();
    texts->AddString("one");
    texts->AddString("two");
    std::printf("consumer: %d texts\n", texts->GetNumStrings());
    return texts->GetNumStrings() == 2 ? 0 : 1;
}
