//===-- CitP/Factory.h - the component loader -----------------------------------===//
//
// \file
// Components are shared libraries loaded by name. A bare name N is looked for as
// libN.so (then N.so, then N as given) in each directory of VENLOMER_COMPONENT_PATH
// (colon-separated), then in the directory the portability layer itself was loaded
// from. A name holding a '/' is taken as a path.
//
// A loaded component registers its classes from its exported entry
//
//   extern "C" void CitP_ComponentInit();   // calls CitP::Factory::RegisterClass(...)
//
// which the loader calls once, right after the library is loaded. A name counts as
// loaded only once that init has returned: other threads loading the same name meanwhile
// wait for it. An init that throws has failed: the name stays unloaded and a later load
// tries again. Libraries stay loaded for the life of the process.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "Port/Export.h"
#include "Port/XUID.h"

#include <string>

namespace Port {
template <class CharT> class StringBase;
}

namespace CitP {

/// Creates one object; a counted object comes with the one reference the caller owns.
using CreateFunction = CitI::IInterface* (*)();

class VN_PORT_API Factory {
public:
    /// Loads the named component library (once). True when it is loaded.
    static bool LoadLibraryFactory(const Port::StringBase<char>& name);
    /// A new object of the class, carrying its initial reference; null when no loaded
    /// component registered the class.
    static CitI::IInterface* CreateInstance(const Port::XUID& classId);
    /// As CreateInstance, the initial reference adopted by the returned pointer.
    static CommonI::RefCountPtr<CitI::IInterface> CreateInstanceRef(const Port::XUID& classId);

    /// Registers (or replaces) the creator of a class. Called by components.
    static void RegisterClass(const Port::XUID& classId, CreateFunction create);
    /// Forgets a class; components that are tests may use it to clean up.
    static void UnregisterClass(const Port::XUID& classId);
    /// The path of the library that LoadLibraryFactory loaded for name, or empty.
    static std::string LoadedPath(const Port::StringBase<char>& name);
};

} // namespace CitP
