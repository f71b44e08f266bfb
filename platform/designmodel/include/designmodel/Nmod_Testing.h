//===-- designmodel/Nmod_Testing.h - failure injection for tests ----------------===//
//
// \file
// A full disk or a failing device is hard to arrange in a test, so the library can be
// told to fail one of its write steps as if the disk were full. Write steps are the
// database statements of writing models, their final commit and the move of the file
// into place, counted over the whole process from the last call of FailWriteStep.
//
//   Nmod_Testing::FailWriteStep(3);   // the fourth step from now throws
//   ...
//   Nmod_Testing::FailWriteStep(-1);  // back to normal
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

namespace Nmod_Testing {

/// Makes write step number `step` (0 is the next one) throw Nmod_Exception::Database
/// with the engine's "disk full" code. A negative number injects nothing. Either way the
/// step count restarts at 0.
VN_VISIBLE void FailWriteStep(long step);

/// The write steps taken since the last call of FailWriteStep.
VN_VISIBLE long WriteStepsTaken();

/// Calls `hook` with the final file name right before each move of a finished file into
/// place, so that a test can make another writer's file appear at the last moment. Null
/// removes the hook.
VN_VISIBLE void BeforeMoveIntoPlace(void (*hook)(const char* finalPath));

} // namespace Nmod_Testing
