//===-- hostproj/Components.h - the host component libraries, by name ----------===//
//
// \file
// The one place that names the component libraries the project lookup loads with
// CitP::Factory::LoadLibraryFactory. Bare names: the factory finds libNAME.so on its
// search path. The build makes the sample host's libraries under exactly these names.
//
//===------------------------------------------------------------------------------===//
#pragma once

namespace HostProj {

/// Registers HostTask::CLSID_TaskHelper.
inline constexpr char kTaskHelperComponent[] = "venlomer_sample_taskhelper";
/// Registers Dpm::CLSID_ProjectHelper().
inline constexpr char kProjectManagerComponent[] = "venlomer_sample_projmgr";

} // namespace HostProj
