//===-- tools/board/Xml.cpp - a small reader of the XML KiCad writes its netlists in ---===//
#include "Xml.h"
#include "SourceLine.h"

#include <algorithm>
#include <cstdint>

namespace VnTool {

namespace {

constexpr std::size_t kMaxDepth = 256;

bool IsNameChar(char c) {
    return c != '>' && c != '/' && c != '=' && c != ' ' && c != '\t' && c != '\n' && c != '\r' &&
           c != '<' && c != '"' && c != '\'';
}

void AppendUtf8(std::uint32_t code, std::string& out) {
    if (code < 0x80) {
        out += static_cast<char>(code);
    } else if (code < 0x800) {
        out += static_cast<char>(0xC0 | (code >> 6));
        out += static_cast<char>(0x80 | (code & 0x3F));
    } else if (code < 0x10000) {
        out += static_cast<char>(0xE0 | (code >> 12));
        out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (code & 0x3F));
    } else {
        out += static_cast<char>(0xF0 | (code >> 18));
        out += static_cast<char>(0x80 | ((code >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (code & 0x3F));
    }
}

class Parser {
public:
    Parser(std::string_view text, std::string_view source) : m_text(text), m_source(source) {}

    bool Document(XmlElement& root, std::string& error) {
        if (!Misc(error)) {
            return false;
        }
        if (!Starts("<")) {
            return Fail("expected the document element", error);
        }
        if (!Element(root, 0, error) || !Misc(error)) {
            return false;
        }
        return m_at >= m_text.size() || Fail("text after the document element", error);
    }

private:
    bool Fail(const std::string& why, std::string& error) const {
        error = AtLine(m_source, m_line, why);
        return false;
    }
    bool Starts(std::string_view what) const { return m_text.substr(m_at, what.size()) == what; }
    void Advance(std::size_t n) {
        for (std::size_t end = std::min(m_at + n, m_text.size()); m_at < end; ++m_at) {
            m_line += m_text[m_at] == '\n' ? 1 : 0;
        }
    }
    void SkipSpace() {
        while (m_at < m_text.size() && (m_text[m_at] == ' ' || m_text[m_at] == '\t' ||
                                        m_text[m_at] == '\n' || m_text[m_at] == '\r')) {
            Advance(1);
        }
    }
    // Skips to just past `end`; false when the text ends first.
    bool SkipPast(std::string_view end, const char* what, std::string& error) {
        std::size_t found = m_text.find(end, m_at);
        if (found == std::string_view::npos) {
            return Fail(std::string("the file ends inside ") + what, error);
        }
        Advance(found + end.size() - m_at);
        return true;
    }

    // Whitespace, comments, processing instructions and a document type between elements.
    bool Misc(std::string& error) {
        for (;;) {
            SkipSpace();
            if (Starts("<?")) {
                if (!SkipPast("?>", "a processing instruction", error)) {
                    return false;
                }
            } else if (Starts("<!--")) {
                if (!SkipPast("-->", "a comment", error)) {
                    return false;
                }
            } else if (Starts("<!DOCTYPE")) {
                if (!SkipPast(">", "the document type", error)) {
                    return false;
                }
            } else {
                return true;
            }
        }
    }

    bool Entity(std::string& out, std::string& error) {
        std::size_t end = m_text.find(';', m_at);
        if (end == std::string_view::npos || end - m_at > 12) {
            return Fail("a '&' that starts no entity", error);
        }
        std::string_view name = m_text.substr(m_at + 1, end - m_at - 1);
        static const std::pair<std::string_view, char> kNamed[] = {
            {"lt", '<'}, {"gt", '>'}, {"amp", '&'}, {"quot", '"'}, {"apos", '\''}};
        bool known = false;
        for (const auto& [entity, c] : kNamed) {
            if (name == entity) {
                out += c;
                known = true;
            }
        }
        if (!known && name.size() > 1 && name[0] == '#') {
            bool hex = name[1] == 'x' || name[1] == 'X';
            std::uint32_t code = 0;
            std::string_view digits = name.substr(hex ? 2 : 1);
            for (char c : digits) {
                int v = c >= '0' && c <= '9'          ? c - '0'
                        : hex && c >= 'a' && c <= 'f' ? c - 'a' + 10
                        : hex && c >= 'A' && c <= 'F' ? c - 'A' + 10
                                                      : -1;
                if (v < 0 || code > 0x10FFFF) {
                    return Fail("a malformed character reference", error);
                }
                code = code * (hex ? 16 : 10) + static_cast<std::uint32_t>(v);
            }
            if (digits.empty() || code == 0 || code > 0x10FFFF) {
                return Fail("a malformed character reference", error);
            }
            AppendUtf8(code, out);
            known = true;
        }
        if (!known) {
            return Fail("unknown entity '&" + std::string(name) + ";'", error);
        }
        Advance(end + 1 - m_at);
        return true;
    }

    bool Name(std::string& out, std::string& error) {
        std::size_t start = m_at;
        while (m_at < m_text.size() && IsNameChar(m_text[m_at])) {
            ++m_at;
        }
        out = std::string(m_text.substr(start, m_at - start));
        return !out.empty() || Fail("expected a name", error);
    }

    bool Attributes(XmlElement& element, std::string& error) {
        for (;;) {
            SkipSpace();
            if (m_at >= m_text.size()) {
                return Fail("the file ends inside the tag <" + element.name + ">", error);
            }
            if (m_text[m_at] == '>' || Starts("/>")) {
                return true;
            }
            std::string key;
            if (!Name(key, error)) {
                return false;
            }
            SkipSpace();
            if (!Starts("=")) {
                return Fail("attribute " + key + " has no value", error);
            }
            Advance(1);
            SkipSpace();
            if (m_at >= m_text.size() || (m_text[m_at] != '"' && m_text[m_at] != '\'')) {
                return Fail("attribute " + key + " wants a quoted value", error);
            }
            char quote = m_text[m_at];
            Advance(1);
            std::string value;
            while (m_at < m_text.size() && m_text[m_at] != quote) {
                if (m_text[m_at] == '&') {
                    if (!Entity(value, error)) {
                        return false;
                    }
                } else {
                    value += m_text[m_at];
                    Advance(1);
                }
            }
            if (m_at >= m_text.size()) {
                return Fail("the file ends inside attribute " + key, error);
            }
            Advance(1);
            element.attributes.emplace_back(std::move(key), std::move(value));
        }
    }

    // Kept whole: the content loop reads text, entities, CDATA, comments, children and the
    // end tag, each a few lines; split, the cases would lose sight of each other.
    bool Element(XmlElement& element, std::size_t depth, std::string& error) {
        if (depth >= kMaxDepth) {
            return Fail("elements nested deeper than " + std::to_string(kMaxDepth), error);
        }
        element.line = m_line;
        Advance(1); // '<'
        if (!Name(element.name, error) || !Attributes(element, error)) {
            return false;
        }
        if (Starts("/>")) {
            Advance(2);
            return true;
        }
        Advance(1); // '>'
        for (;;) {
            if (m_at >= m_text.size()) {
                return Fail("the file ends inside <" + element.name + "> opened on line " +
                                std::to_string(element.line),
                            error);
            }
            if (Starts("</")) {
                Advance(2);
                std::string name;
                if (!Name(name, error)) {
                    return false;
                }
                SkipSpace();
                if (name != element.name || !Starts(">")) {
                    return Fail("</" + name + "> closes <" + element.name + "> opened on line " +
                                    std::to_string(element.line),
                                error);
                }
                Advance(1);
                return true;
            }
            if (Starts("<!--")) {
                if (!SkipPast("-->", "a comment", error)) {
                    return false;
                }
            } else if (Starts("<![CDATA[")) {
                Advance(9);
                std::size_t end = m_text.find("]]>", m_at);
                if (end == std::string_view::npos) {
                    return Fail("the file ends inside CDATA", error);
                }
                element.text += m_text.substr(m_at, end - m_at);
                Advance(end + 3 - m_at);
            } else if (Starts("<?")) {
                if (!SkipPast("?>", "a processing instruction", error)) {
                    return false;
                }
            } else if (Starts("<")) {
                element.children.emplace_back();
                if (!Element(element.children.back(), depth + 1, error)) {
                    return false;
                }
            } else if (m_text[m_at] == '&') {
                if (!Entity(element.text, error)) {
                    return false;
                }
            } else {
                element.text += m_text[m_at];
                Advance(1);
            }
        }
    }

    std::string_view m_text;
    std::string_view m_source;
    std::size_t m_at = 0;
    std::size_t m_line = 1;
};

} // namespace

std::string XmlElement::Attribute(std::string_view key) const {
    for (const auto& [attribute, value] : attributes) {
        if (attribute == key) {
            return value;
        }
    }
    return {};
}

const XmlElement* XmlElement::Child(std::string_view childName) const {
    for (const XmlElement& child : children) {
        if (child.name == childName) {
            return &child;
        }
    }
    return nullptr;
}

bool ParseXml(std::string_view text, std::string_view source, XmlElement& root,
              std::string& error) {
    root = XmlElement();
    return Parser(text, source).Document(root, error);
}

} // namespace VnTool
