//===-- tests/support/MessageCapture.h - collects the library's messages while in scope -===//
#pragma once

#include "Port/MsgMan.h"

#include <string>
#include <vector>

namespace VnTest {

/// Replaces the message sink for its lifetime and keeps every message issued.
class MessageCapture {
public:
    MessageCapture() {
        m_previous =
            Port::SetMessageSink([this](const Port::Message& m) { m_messages.push_back(m); });
    }
    ~MessageCapture() { Port::SetMessageSink(std::move(m_previous)); }
    MessageCapture(const MessageCapture&) = delete;
    MessageCapture& operator=(const MessageCapture&) = delete;

    const std::vector<Port::Message>& Messages() const { return m_messages; }
    /// Texts of the messages of one severity, in order.
    std::vector<std::string> Texts(Port::Severity severity) const {
        std::vector<std::string> texts;
        for (const auto& m : m_messages) {
            if (m.severity == severity) {
                texts.push_back(m.text);
            }
        }
        return texts;
    }
    std::vector<std::string> Debug() const { return Texts(Port::Severity::Debug); }
    std::vector<std::string> Errors() const { return Texts(Port::Severity::Error); }
    std::vector<std::string> Status() const { return Texts(Port::Severity::Status); }
    void Clear() { m_messages.clear(); }

private:
    Port::MessageSink m_previous;
    std::vector<Port::Message> m_messages;
};

} // namespace VnTest
