//===-- s/internal/ColorSchemeSource.h - which scheme file the load saw ---------===//
//
// The colour manager notes here what its one load found, so that ColorScheme can say so
// without searching again (a second search could find another file than the first).
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>

namespace Vn::Eng::detail {

struct ColorSchemeSource {
    std::string path; // empty: no file was found
    bool accepted = false;
};

/// The one record, made on first use: the load runs during static initialisation, in
/// whatever order the units of the library are initialised.
ColorSchemeSource& LoadedColorSchemeSource();

} // namespace Vn::Eng::detail
