//===-- Port/Export.h - symbol visibility of the portability layer ---------------===//
//
// Everything is built with hidden visibility; only what carries one of these macros is
// part of a library's binary interface.
//
//===------------------------------------------------------------------------------===//
#pragma once

#define VN_VISIBLE __attribute__((visibility("default")))

#if defined(VENLOMER_PORT_BUILDING)
#define VN_PORT_API VN_VISIBLE
#else
#define VN_PORT_API VN_VISIBLE
#endif

// Published interfaces are pure abstract classes; their type information must be one and
// the same in every shared library that uses them.
#define VN_INTERFACE VN_VISIBLE
