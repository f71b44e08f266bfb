//===-- Port/File.h - file-system queries ---------------------------------------===//
#pragma once

#include "Port/Export.h"

namespace Port {

class VN_PORT_API File {
public:
    /// True when something exists under that path (a null path never exists).
    static bool exist(const char* path);
};

} // namespace Port
