//===-- Port/MsgMan.h - the message manager -------------------------------------===//
//
// \file
// Every message of the library (status, error, debug) goes to one process-wide sink
// that a host or a test can replace. A message carries its severity, the domain, the
// unit path, the line, the revision text and the formatted text.
//
//   Port_MsgManData::createObject("Venlomer", "../s/Unit", 42, "$Revision: 1.3 $")
//       .issueStatus("m_count = %d\n", count);
//   Port_MsgManData::debugStub("Tried to set value of Enumerated Property to invalid type\n");
//
// Text that comes from outside (a file name, a property value) is only ever passed as an
// argument, never as the format.
//
// The default sink writes status and error messages to stderr and drops debug messages
// unless the environment variable VENLOMER_DEBUG is set.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstdarg>
#include <functional>
#include <string>

namespace Port {

enum class Severity : int { Debug = 0, Status = 1, Error = 2 };

struct Message {
    Severity severity = Severity::Debug;
    std::string domain;
    std::string unit;
    int line = 0;
    std::string revision;
    std::string text;
};

using MessageSink = std::function<void(const Message&)>;

/// Replaces the process-wide sink and returns the previous one. An empty sink restores
/// the default.
VN_PORT_API MessageSink SetMessageSink(MessageSink sink);
/// The default sink's behaviour, for sinks that want to pass messages on.
VN_PORT_API void DefaultMessageSink(const Message& message);

} // namespace Port

class VN_PORT_API Port_MsgManData {
public:
    /// A message object for one message from the given place.
    static Port_MsgManData createObject(const char* domain, const char* file, int line,
                                        const char* revision);

    void issueStatus(const char* format, ...) const __attribute__((format(printf, 2, 3)));
    void issueError(const char* format, ...) const __attribute__((format(printf, 2, 3)));
    /// Debug output with no place attached.
    static void debugStub(const char* format, ...) __attribute__((format(printf, 1, 2)));

    /// The same, for callers that forward their own variadic arguments.
    void vissueStatus(const char* format, va_list args) const __attribute__((format(printf, 2, 0)));
    void vissueError(const char* format, va_list args) const __attribute__((format(printf, 2, 0)));
    static void vdebugStub(const char* format, va_list args) __attribute__((format(printf, 1, 0)));

private:
    Port_MsgManData(const char* domain, const char* file, int line, const char* revision);

    std::string m_domain;
    std::string m_file;
    int m_line;
    std::string m_revision;
};
