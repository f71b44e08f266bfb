//===-- s/Utilities.h - name ordering and netlist stubs -------------------------===//
//
// \file
// Two strict less-than predicates for sorting names, and the making of a netlist stub
// (an NGC file that carries only a design's name, part and root block) from four texts
// or from an existing NGD file.
//
//   std::sort(names.begin(), names.end(), Vn::Eng::Utilities::num_compare);
//   Vn::Eng::Utilities::CreateNGCFromNGD("top.ngd", "top.ngc");
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/StringBase.h"
#include "s/Export.h"

namespace Vn::Eng {

class VENLOMER_API Utilities {
public:
    /// True when the unsigned number that all of a spells is smaller than b's. A text
    /// that is not a plain decimal number up to 4294967295 (empty, letters, signs, a
    /// larger number) counts as 0.
    static bool num_compare(const Port::StringBase<char>& a, const Port::StringBase<char>& b);
    /// True when a comes before b in unsigned byte order; a proper prefix comes first.
    static bool str_compare(const Port::StringBase<char>& a, const Port::StringBase<char>& b);

    /// Writes the stub `ngcFile`: one design, a "SOURCE" view whose "VIEW_TYPE" is
    /// "LOGICAL" and whose "PART" is `partName`, and root block `blockName`. Returns
    /// false, after an error message, when the file could not be made; then no file
    /// exists under that name. An existing file is not replaced (false).
    static bool CreateNGC(const Port::StringBase<char>& ngcFile,
                          const Port::StringBase<char>& designName,
                          const Port::StringBase<char>& partName,
                          const Port::StringBase<char>& blockName);
    /// Writes the stub `ngcFile` for the one design of `ngdFile`. True when the stub was
    /// made or `ngcFile` exists already (the NGD is then not looked at); false after one
    /// message saying why not. Failures of the design-model library while reading the
    /// NGD reach the caller as Nmod_Exception::Base.
    static bool CreateNGCFromNGD(const Port::StringBase<char>& ngdFile,
                                 const Port::StringBase<char>& ngcFile);
};

} // namespace Vn::Eng
