//===-- hostproj/TaskHelper.h - the host's task helper and its context ---------===//
//
// \file
// The task helper is the host's way in to its session: it hands out a context object,
// the context knows the project manager, the project manager knows the open project.
//
//   auto object = CitP::Factory::CreateInstanceRef(HostTask::CLSID_TaskHelper);
//   CommonI::RefCountPtr<HostTask::ITaskHelper> helper(
//       static_cast<HostTask::ITaskHelper*>(object->GetInterface(HostTask::IID_ITaskHelper)));
//   CommonI::RefCountPtr<HostTask::ITaskContext> context;
//   Port::StringBase<char> message;
//   if (helper->GetContext(context, message) == 1 && context) { ... }
//
// Slot orders (binary contract with the host, do not reorder):
//   ITaskHelper:     GetInterface, ~, GetContext
//   ITaskContext:    GetInterface, ~, GetProjectManager
//   IProjectManager: GetInterface, ~, GetCurrentProject
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "CommonI/RefCountPtr.h"
#include "Port/StringBase.h"
#include "Port/XUID.h"

#include <cstdint>

namespace HostTask {

/// The task-helper component's class.
inline constexpr Port::XUID CLSID_TaskHelper{0x7D52848011964635ull, 0xABA9639446E4AA59ull};
/// The task-helper interface of that class.
inline constexpr Port::XUID IID_ITaskHelper{0xD611A2946A124BE0ull, 0x81675590BEB51670ull};

class VN_INTERFACE IProjectManager : public CitI::IInterface {
public:
    /// Stores the open project object, borrowed (no reference), or null when no project
    /// is open. Returns 1.
    virtual std::int64_t GetCurrentProject(CitI::IInterface*& project) = 0;
};

class VN_INTERFACE ITaskContext : public CitI::IInterface {
public:
    /// The session's project manager, borrowed from this context; null when there is none.
    virtual IProjectManager* GetProjectManager() = 0;
};

class VN_INTERFACE ITaskHelper : public CitI::IInterface {
public:
    static const Port::XUID& IID() { return IID_ITaskHelper; }
    /// Stores a context object (one new reference) and a message from the host. Returns 1
    /// when the context can be used; anything else is a refusal, whatever was stored.
    virtual std::int64_t GetContext(CommonI::RefCountPtr<ITaskContext>& context,
                                    Port::StringBase<char>& message) = 0;
};

} // namespace HostTask
