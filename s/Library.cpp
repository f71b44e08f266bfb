//===-- s/Library.cpp - the library's plain entry and shared helpers ------------===//
#include "Port/UnitStartup.h"

#include "s/Export.h"
#include "s/internal/Shapes.h"

namespace Vn::Eng::detail {

void DumpLine(const Unit& unit, int line, const char* format, ...) {
    va_list args;
    va_start(args, format);
    Port_MsgManData::createObject("Venlomer", unit.path, line, unit.revision)
        .vissueStatus(format, args);
    va_end(args);
}

} // namespace Vn::Eng::detail

/// The factory entry the host looks for by name. The library registers no classes with
/// the component factory, so there is nothing to do.
extern "C" VENLOMER_API void InstFactoryEntry() {}
