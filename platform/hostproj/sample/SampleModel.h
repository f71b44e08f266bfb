//===-- sample/SampleModel.h - what the two sample components share ------------===//
//
// \file
// The project manager learns the project from the task helper's component only through
// interfaces, as it would from a real host: the open project answers IProjectModel with
// its description, and the task-helper component registers CLSID_OpenProject, whose
// "creation" hands out the open project with a new reference (or null).
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ProjectDescription.h"

#include "CitI/IInterface.h"

#include <memory>

namespace SampleHost {

inline constexpr Port::XUID IID_IProjectModel{0x3B1F6A2C9D4E4F70ull, 0x8A61C2D3E4F50617ull};
inline constexpr Port::XUID CLSID_OpenProject{0x3B1F6A2C9D4E4F71ull, 0x8A61C2D3E4F50618ull};

class VN_INTERFACE IProjectModel : public CitI::IInterface {
public:
    /// The description the project was opened from; never null.
    virtual std::shared_ptr<const Description> GetDescription() = 0;
};

} // namespace SampleHost
