//===-- fuzz/fuzz_projdesc.cpp - the sample host's project description reader -===//
//
// Any bytes must either parse into a description whose view references all resolve, or
// be refused with a line inside the text; never crash or read out of bounds.
//
//===------------------------------------------------------------------------------===//
#include "ProjectDescription.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    SampleHost::Description description;
    SampleHost::ParseError error;
    if (!SampleHost::ParseDescription(text, description, error)) {
        const auto lines = static_cast<int>(std::count(text.begin(), text.end(), '\n')) + 1;
        if (error.line < 1 || error.line > lines || error.what.empty()) {
            std::abort();
        }
        return 0;
    }
    const std::size_t views = description.views.size();
    if (description.hasDefault && description.defaultView >= views) {
        std::abort();
    }
    for (const auto& view : description.views) {
        for (const auto& produced : view.bindings) {
            for (std::size_t index : produced) {
                if (index >= views) {
                    std::abort();
                }
            }
        }
    }
    return 0;
}
