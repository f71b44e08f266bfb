//===-- Port/Startup.h - start-up objects of the portability layer --------------===//
//
// \file
// The layer's process-wide state (the file and path tables, the factory's class table
// and loaded libraries, the message sink) is built by the first start-up object that is
// constructed and torn down by the last one destroyed (the nifty-counter idiom). Every
// source unit that uses the layer during static initialisation or destruction holds one
// of each, through Port/UnitStartup.h, so the layer is ready before any static object of
// that unit is built, whatever the link order.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

namespace Port {

class VN_PORT_API FileInit {
public:
    FileInit();
    ~FileInit();
    FileInit(const FileInit&) = delete;
    FileInit& operator=(const FileInit&) = delete;
};

class VN_PORT_API PathListInit {
public:
    PathListInit();
    ~PathListInit();
    PathListInit(const PathListInit&) = delete;
    PathListInit& operator=(const PathListInit&) = delete;
};

} // namespace Port

namespace CitP {

class VN_PORT_API InstanceTableInit {
public:
    InstanceTableInit();
    ~InstanceTableInit();
    InstanceTableInit(const InstanceTableInit&) = delete;
    InstanceTableInit& operator=(const InstanceTableInit&) = delete;
};

class VN_PORT_API FactoryInit {
public:
    FactoryInit();
    ~FactoryInit();
    FactoryInit(const FactoryInit&) = delete;
    FactoryInit& operator=(const FactoryInit&) = delete;
};

} // namespace CitP

class VN_PORT_API Port_MsgManInit {
public:
    Port_MsgManInit();
    ~Port_MsgManInit();
    Port_MsgManInit(const Port_MsgManInit&) = delete;
    Port_MsgManInit& operator=(const Port_MsgManInit&) = delete;
};
