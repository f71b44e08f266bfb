//===-- Globals.h - process-wide state behind the start-up objects --------------===//
#pragma once

#include "CitP/Factory.h"
#include "Port/MsgMan.h"
#include "Port/XUID.h"

#include <condition_variable>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <unordered_map>

namespace Port::detail {

struct XUIDHash {
    size_t operator()(const Port::XUID& id) const noexcept {
        return std::hash<std::uint64_t>{}(id.GetHigh() * 0x9E3779B97F4A7C15ull ^ id.GetLow());
    }
};

struct ClassTable {
    std::mutex mutex;
    std::unordered_map<Port::XUID, CitP::CreateFunction, XUIDHash> creators;
};

struct LibraryTable {
    std::mutex mutex;
    std::map<std::string, std::string> loaded; // name asked for -> path loaded
    // Names whose component is being loaded and initialised, with the thread doing it.
    // Other loaders of such a name wait on `settled` until it is loaded or has failed.
    std::map<std::string, std::thread::id> loading;
    std::condition_variable settled;
};

struct MessageState {
    std::mutex mutex;
    Port::MessageSink sink;
};

// Valid while at least one start-up object of the matching kind lives.
ClassTable& Classes();
LibraryTable& Libraries();
MessageState& Messages();

} // namespace Port::detail
