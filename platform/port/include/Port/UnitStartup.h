//===-- Port/UnitStartup.h - the five start-up objects of one source unit -------===//
//
// Include this first in every source unit. Its five statics are constructed, in this
// order, before any other static of the unit, and destroyed after them.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Startup.h"

namespace {
[[maybe_unused]] Port::FileInit s_portFileInit;
[[maybe_unused]] Port::PathListInit s_portPathListInit;
[[maybe_unused]] CitP::InstanceTableInit s_citpInstanceTableInit;
[[maybe_unused]] CitP::FactoryInit s_citpFactoryInit;
[[maybe_unused]] Port_MsgManInit s_portMsgManInit;
} // namespace
