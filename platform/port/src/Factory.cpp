//===-- Factory.cpp - loading components and creating their objects -------------===//
#include "CitP/Factory.h"

#include "Globals.h"
#include "Port/File.h"
#include "Port/SearchPath.h"
#include "Port/StringBase.h"

#include <cxxabi.h>
#include <dlfcn.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "Port/UnitStartup.h"

namespace CitP {

namespace {

std::vector<std::string> SearchDirectories() {
    std::vector<std::string> dirs = Port::SearchPathFromEnv("VENLOMER_COMPONENT_PATH");
    // The directory this layer was loaded from: the build tree's library folder in tests,
    // the install libdir once installed.
    Dl_info info{};
    if (::dladdr(reinterpret_cast<void*>(&Factory::LoadLibraryFactory), &info) != 0 &&
        info.dli_fname != nullptr) {
        std::string self(info.dli_fname);
        const size_t slash = self.rfind('/');
        dirs.push_back(slash == std::string::npos ? "." : self.substr(0, slash));
    }
    return dirs;
}

std::vector<std::string> Candidates(const std::string& name) {
    if (name.find('/') != std::string::npos) {
        return {name};
    }
    std::vector<std::string> paths;
    for (const std::string& dir : SearchDirectories()) {
        for (const std::string& file : {"lib" + name + ".so", name + ".so", name}) {
            paths.push_back((dir + "/").append(file));
        }
    }
    return paths;
}

// Opens the component and runs its init. The path it was loaded from, or empty when no
// candidate loaded or the init failed (threw).
std::string OpenAndInit(const std::string& key) {
    for (const std::string& path : Candidates(key)) {
        if (!Port::File::exist(path.c_str())) {
            continue;
        }
        void* handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
        if (handle == nullptr) {
            continue;
        }
        // Components stay loaded for the life of the process: objects they made, or
        // creators a failing init registered before it gave up, may be alive anywhere,
        // so the handle is never closed.
        if (auto init = reinterpret_cast<void (*)()>(::dlsym(handle, "CitP_ComponentInit"))) {
            try {
                init();
            } catch (abi::__forced_unwind&) {
                throw; // a cancelled thread must go on unwinding
            } catch (...) {
                return {}; // an init that throws has failed
            }
        }
        return path;
    }
    return {};
}

} // namespace

bool Factory::LoadLibraryFactory(const Port::StringBase<char>& name) {
    const std::string& key = name.str();
    if (key.empty() || key.find('\0') != std::string::npos) {
        return false;
    }
    auto& libraries = Port::detail::Libraries();
    std::unique_lock<std::mutex> lock(libraries.mutex);
    // A name counts as loaded only once its init has registered its classes: until then,
    // other loaders of the name wait for the one that runs it.
    for (;;) {
        if (libraries.loaded.count(key) != 0) {
            return true;
        }
        const auto running = libraries.loading.find(key);
        if (running == libraries.loading.end()) {
            break;
        }
        if (running->second == std::this_thread::get_id()) {
            return true; // the component's own init asks for itself: it is loaded
        }
        libraries.settled.wait(lock);
    }
    libraries.loading.emplace(key, std::this_thread::get_id());
    lock.unlock();

    // Whatever way this call ends, the name stops loading and its waiters wake: loaded
    // when the init succeeded, unloaded otherwise (a later call may try again).
    std::string path;
    struct Settle {
        Port::detail::LibraryTable& libraries;
        const std::string& key;
        std::string& path;
        ~Settle() {
            {
                std::lock_guard<std::mutex> relock(libraries.mutex);
                libraries.loading.erase(key);
                if (!path.empty()) {
                    libraries.loaded.emplace(key, path);
                }
            }
            libraries.settled.notify_all();
        }
    } settle{libraries, key, path};
    // The init runs without the lock: it registers its classes through the factory, and
    // may load other components.
    path = OpenAndInit(key);
    return !path.empty();
}

std::string Factory::LoadedPath(const Port::StringBase<char>& name) {
    auto& libraries = Port::detail::Libraries();
    std::lock_guard<std::mutex> lock(libraries.mutex);
    const auto found = libraries.loaded.find(name.str());
    return found == libraries.loaded.end() ? std::string() : found->second;
}

void Factory::RegisterClass(const Port::XUID& classId, CreateFunction create) {
    auto& classes = Port::detail::Classes();
    std::lock_guard<std::mutex> lock(classes.mutex);
    if (create == nullptr) {
        classes.creators.erase(classId);
    } else {
        classes.creators[classId] = create;
    }
}

void Factory::UnregisterClass(const Port::XUID& classId) {
    RegisterClass(classId, nullptr);
}

CitI::IInterface* Factory::CreateInstance(const Port::XUID& classId) {
    CreateFunction create = nullptr;
    {
        auto& classes = Port::detail::Classes();
        std::lock_guard<std::mutex> lock(classes.mutex);
        const auto found = classes.creators.find(classId);
        if (found != classes.creators.end()) {
            create = found->second;
        }
    }
    return create != nullptr ? create() : nullptr;
}

CommonI::RefCountPtr<CitI::IInterface> Factory::CreateInstanceRef(const Port::XUID& classId) {
    return CommonI::RefCountPtr<CitI::IInterface>::Adopt(CreateInstance(classId));
}

} // namespace CitP
