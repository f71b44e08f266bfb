//===-- s/ProjFileHelper.h - the open project's files, from the host -----------===//
//
// \file
// Asks the host's project manager for three file names of the project open in the host:
// the project file, the netlist database of the translation view and the constraints
// file of the default view.
//
//   Port::StringBase<char> project, ngd, ucf;
//   if (Vn::Eng::ProjFileHelper::GetFilesFromHost(project, ngd, ucf)) { ... }
//
// Every step is reported through the debug sink; a failure names the step that failed.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/StringBase.h"
#include "s/Export.h"

namespace Vn::Eng {

class VENLOMER_API ProjFileHelper {
public:
    /// True when all three names were found. The texts are cleared on entry and keep
    /// what was found up to a failing step. Holds no host object after it returns.
    static bool GetFilesFromHost(Port::StringBase<char>& projectFile,
                                 Port::StringBase<char>& ngdFile, Port::StringBase<char>& ucfFile);
};

} // namespace Vn::Eng
