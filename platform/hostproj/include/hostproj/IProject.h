//===-- hostproj/IProject.h - the host's open project ---------------------------===//
//
// Slot order (binary contract with the host, do not reorder):
//   GetInterface, ~, GetProjectFileName
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "Port/StringBase.h"
#include "Port/XUID.h"

#include <cstdint>

class VN_INTERFACE IProject : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{155462E3-6B65-42e1-94AB-FC281C0EF860}");
        return id;
    }
    /// Stores the project file name, or the empty text when the project has none.
    /// Returns 1.
    virtual std::int64_t GetProjectFileName(Port::StringBase<char>& name) = 0;
};
