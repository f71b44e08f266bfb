//===-- s/Export.h - symbol visibility of libvenlomer ---------------------------===//
#pragma once

#include "Port/Export.h"

/// Marks the classes and functions that hosts call. Everything else stays hidden.
#define VENLOMER_API VN_VISIBLE
