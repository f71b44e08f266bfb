//===-- Startup.cpp - nifty counters of the portability layer -------------------===//
//
// Each start-up class guards one piece of process-wide state kept in raw static
// storage: zero-initialised counters are ready before any dynamic initialisation, so
// the first constructor to run (from whichever unit is initialised first) builds the
// state, and the last destructor tears it down.
//
//===------------------------------------------------------------------------------===//
#include "Port/Startup.h"

#include "Globals.h"

#include <new>

namespace {

template <class T> struct NiftySlot {
    int count; // zero-initialised before any constructor runs
    alignas(T) unsigned char storage[sizeof(T)];

    void Acquire() {
        if (count++ == 0) {
            new (storage) T();
        }
    }
    void Drop() {
        if (--count == 0) {
            Get().~T();
        }
    }
    T& Get() { return *std::launder(reinterpret_cast<T*>(storage)); }
};

struct Empty {};

NiftySlot<Empty> s_file;
NiftySlot<Empty> s_pathList;
NiftySlot<Port::detail::ClassTable> s_classes;
NiftySlot<Port::detail::LibraryTable> s_libraries;
NiftySlot<Port::detail::MessageState> s_messages;

} // namespace

namespace Port::detail {
ClassTable& Classes() {
    return s_classes.Get();
}
LibraryTable& Libraries() {
    return s_libraries.Get();
}
MessageState& Messages() {
    return s_messages.Get();
}
} // namespace Port::detail

Port::FileInit::FileInit() {
    s_file.Acquire();
}
Port::FileInit::~FileInit() {
    s_file.Drop();
}
Port::PathListInit::PathListInit() {
    s_pathList.Acquire();
}
Port::PathListInit::~PathListInit() {
    s_pathList.Drop();
}
CitP::InstanceTableInit::InstanceTableInit() {
    s_classes.Acquire();
}
CitP::InstanceTableInit::~InstanceTableInit() {
    s_classes.Drop();
}
CitP::FactoryInit::FactoryInit() {
    s_libraries.Acquire();
}
CitP::FactoryInit::~FactoryInit() {
    s_libraries.Drop();
}
Port_MsgManInit::Port_MsgManInit() {
    s_messages.Acquire();
}
Port_MsgManInit::~Port_MsgManInit() {
    s_messages.Drop();
}

// The layer's own units keep the state alive for as long as the layer is loaded.
#include "Port/UnitStartup.h"
