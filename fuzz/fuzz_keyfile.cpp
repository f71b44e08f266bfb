//===-- fuzz/fuzz_keyfile.cpp - the key-file reader on arbitrary files ----------===//
//
// The input's first two bytes choose the entry and field separators of the reads; the
// rest is written as the key file. Whatever the bytes, reading must neither crash nor
// read outside what it was given, and a rejected file must leave nothing readable.
//
//===------------------------------------------------------------------------------===//
#include "Port/MsgMan.h"
#include "devdata/PM_DEVKEY.h"
#include "devdata/PM_PIC.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#include <unistd.h>

namespace {

const std::string& ScratchFile() {
    static const std::string path = [] {
        char name[] = "/tmp/fuzz_keyfile-XXXXXX";
        const int fd = ::mkstemp(name);
        if (fd < 0) {
            std::abort();
        }
        ::close(fd);
        std::atexit([] { std::remove(ScratchFile().c_str()); });
        return std::string(name);
    }();
    return path;
}

// Keys the reader is asked for: the colour scheme's own, and one spelt by the input.
const char* const kKeys[] = {"TILE_COLOR", "GENERIC_COLORS", "A", "K", ""};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool quiet = [] {
        Port::SetMessageSink([](const Port::Message&) {});
        return true;
    }();
    (void)quiet;
    if (size < 2) {
        return 0;
    }
    // Separators live in their own heap cells so that reading past one is caught.
    auto* entrySeparator = new char(static_cast<char>(data[0]));
    auto* fieldSeparator = new char(static_cast<char>(data[1]));
    data += 2;
    size -= 2;

    const std::string& path = ScratchFile();
    if (FILE* out = std::fopen(path.c_str(), "wb")) {
        std::fwrite(data, 1, size, out);
        std::fclose(out);
    }

    PM_PIC part(nullptr, nullptr, nullptr);
    PM_DEVKEY keys(path.c_str(), &part, PM_DEVKEY::kAbsentIsSilent, PM_DEVKEY::kSearchDataPath,
                   PM_DEVKEY::kRejectionIsReported);
    const bool valid = keys.get_validity() != 0;

    // The first key-like run of the input, so that reads hit keys the file defines.
    std::string spelt;
    for (std::size_t i = 0; i < size && spelt.size() < 32; ++i) {
        const char c = static_cast<char>(data[i]);
        if ((c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') ||
            c == '_') {
            spelt.push_back(c);
        } else if (!spelt.empty()) {
            break;
        }
    }
    for (const char* key : kKeys) {
        const char* asked = *key != '\0' ? key : spelt.c_str();
        const auto [entries, fields] = keys.GetMaxIndex(asked, *entrySeparator, *fieldSeparator);
        if (!valid && (entries != 0 || fields != 0)) {
            std::abort(); // a rejected file must keep nothing
        }
        if (entries < 0 || fields < 0) {
            std::abort();
        }
        for (short e = -1; e <= entries && e < 64; ++e) {
            for (short f = -1; f <= fields && f < 8; ++f) {
                const int v = keys.GetInt32ByKey(asked, entrySeparator, e, fieldSeparator, f);
                if ((e < 0 || f < 0 || e == entries || f == fields) && v != 0) {
                    std::abort(); // beyond what is there reads 0
                }
            }
        }
    }
    delete entrySeparator;
    delete fieldSeparator;
    return 0;
}
