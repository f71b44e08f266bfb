//===-- MsgMan.cpp - messages to one replaceable sink ---------------------------===//
#include "Port/MsgMan.h"

#include "Globals.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <utility>

#include "Port/UnitStartup.h"

namespace Port {

namespace {

__attribute__((format(printf, 1, 0))) std::string FormatArgs(const char* format, va_list args) {
    if (format == nullptr) {
        return {};
    }
    va_list again;
    va_copy(again, args);
    const int needed = std::vsnprintf(nullptr, 0, format, args);
    std::string out;
    if (needed > 0) {
        out.resize(static_cast<size_t>(needed) + 1);
        std::vsnprintf(out.data(), out.size(), format, again);
        out.resize(static_cast<size_t>(needed));
    }
    va_end(again);
    return out;
}

void Deliver(Message&& message) {
    MessageSink sink;
    {
        auto& state = detail::Messages();
        std::lock_guard<std::mutex> lock(state.mutex);
        sink = state.sink;
    }
    // Called outside the lock: a sink may issue messages of its own.
    if (sink) {
        sink(message);
    } else {
        DefaultMessageSink(message);
    }
}

} // namespace

MessageSink SetMessageSink(MessageSink sink) {
    auto& state = detail::Messages();
    std::lock_guard<std::mutex> lock(state.mutex);
    return std::exchange(state.sink, std::move(sink));
}

void DefaultMessageSink(const Message& message) {
    if (message.severity == Severity::Debug && std::getenv("VENLOMER_DEBUG") == nullptr) {
        return;
    }
    const char* prefix = message.severity == Severity::Error   ? "error: "
                         : message.severity == Severity::Debug ? "debug: "
                                                               : "";
    const bool endsWithNewline = !message.text.empty() && message.text.back() == '\n';
    std::fprintf(stderr, "%s%s%s", prefix, message.text.c_str(), endsWithNewline ? "" : "\n");
}

} // namespace Port

Port_MsgManData::Port_MsgManData(const char* domain, const char* file, int line,
                                 const char* revision)
    : m_domain(domain != nullptr ? domain : ""), m_file(file != nullptr ? file : ""), m_line(line),
      m_revision(revision != nullptr ? revision : "") {}

Port_MsgManData Port_MsgManData::createObject(const char* domain, const char* file, int line,
                                              const char* revision) {
    return Port_MsgManData(domain, file, line, revision);
}

void Port_MsgManData::vissueStatus(const char* format, va_list args) const {
    Port::Deliver({Port::Severity::Status, m_domain, m_file, m_line, m_revision,
                   Port::FormatArgs(format, args)});
}

void Port_MsgManData::vissueError(const char* format, va_list args) const {
    Port::Deliver({Port::Severity::Error, m_domain, m_file, m_line, m_revision,
                   Port::FormatArgs(format, args)});
}

void Port_MsgManData::vdebugStub(const char* format, va_list args) {
    Port::Deliver({Port::Severity::Debug, "", "", 0, "", Port::FormatArgs(format, args)});
}

void Port_MsgManData::issueStatus(const char* format, ...) const {
    va_list args;
    va_start(args, format);
    vissueStatus(format, args);
    va_end(args);
}

void Port_MsgManData::issueError(const char* format, ...) const {
    va_list args;
    va_start(args, format);
    vissueError(format, args);
    va_end(args);
}

void Port_MsgManData::debugStub(const char* format, ...) {
    va_list args;
    va_start(args, format);
    vdebugStub(format, args);
    va_end(args);
}
