//===-- Factory.cpp - loading components and creating their objects -------------===//
#include "CitP/Factory.h"

#include "Globals.h"
#include "Port/File.h"
#include "Port/StringBase.h"

#include <dlfcn.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "Port/UnitStartup.h"

namespace CitP {

namespace {

std::vector<std::string> SearchDirectories() {
    std::vector<std::string> dirs;
    if (const char* env = std::getenv("VENLOMER_COMPONENT_PATH")) {
        std::string list(env);
        size_t start = 0;
        while (start <= list.size()) {
            const size_t end = std::min(list.find(':', start), list.size());
            if (end > start) {
                dirs.push_back(list.substr(start, end - start));
            }
            start = end + 1;
        }
    }
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
            paths.push_back(dir + "/" + file);
        }
    }
    return paths;
}

} // namespace

bool Factory::LoadLibraryFactory(const Port::StringBase<char>& name) {
    const std::string key = name.str();
    if (key.empty() || key.find('\0') != std::string::npos) {
        return false;
    }
    auto& libraries = Port::detail::Libraries();
    {
        std::lock_guard<std::mutex> lock(libraries.mutex);
        if (libraries.loaded.count(key) != 0) {
            return true;
        }
    }
    for (const std::string& path : Candidates(key)) {
        if (!Port::File::exist(path.c_str())) {
            continue;
        }
        void* handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
        if (handle == nullptr) {
            continue;
        }
        {
            std::lock_guard<std::mutex> lock(libraries.mutex);
            if (!libraries.loaded.emplace(key, path).second) {
                return true; // another thread loaded it meanwhile; its init already ran
            }
        }
        // Components stay loaded for the life of the process: objects they made may be
        // alive anywhere, so the handle is never closed.
        if (auto init = reinterpret_cast<void (*)()>(::dlsym(handle, "CitP_ComponentInit"))) {
            init();
        }
        return true;
    }
    return false;
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
