//===-- tools/hello.cpp - loads the library and shows what it answers -----------===//
//
// A stand-in for the command-line tool while it is being built: it creates a string
// container through the library, walks it and prints the object's reference count.
//
//===------------------------------------------------------------------------------===//
#include "CommonI/RefCountPtr.h"
#include "s/CStringContainer.h"

#include <cstdio>

int main() {
    auto names = Vn::Eng::CStringContainer::CreateInstance();
    for (const char* bank : {"Bank 0", "Bank 1", "Bank 2", "Bank 3"}) {
        names->AddString(bank);
    }
    CommonI::RefCountPtr<VnI::IStringIterator> it;
    names->GetStringIterator(it);
    std::printf("libvenlomer answers a string container holding %d texts:\n",
                names->GetNumStrings());
    for (it->First(); !it->IsEnd(); it->Next()) {
        std::printf("  %s\n", it->CurrentItem().c_str());
    }
    int count = 0;
    static_cast<CommonI::IRefCount*>(names->GetInterface(CommonI::IID_IRefCount))
        ->GetRefCount(count);
    std::printf("references held on it: %d (the container pointer and the iterator)\n", count);
    return 0;
}
