//===-- File.cpp ----------------------------------------------------------------===//
#include "Port/File.h"

#include <sys/stat.h>

bool Port::File::exist(const char* path) {
    struct stat info {};
    return path != nullptr && *path != '\0' && ::stat(path, &info) == 0;
}
