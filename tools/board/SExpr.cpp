//===-- tools/board/SExpr.cpp - the S-expressions of KiCad's files -----------------===//
#include "SExpr.h"
#include "SourceLine.h"

namespace VnTool {

namespace {

// A board file nests a few levels deep; anything far deeper is no KiCad file and must not
// exhaust the stack.
constexpr std::size_t kMaxDepth = 256;

class Parser {
public:
    Parser(std::string_view text, std::string_view source) : m_text(text), m_source(source) {}

    bool Document(SExpr& out, std::string& error) {
        SkipSpace();
        if (m_at >= m_text.size() || m_text[m_at] != '(') {
            return Fail("expected '(' at the start of the file", error);
        }
        if (!List(out, 0, error)) {
            return false;
        }
        SkipSpace();
        if (m_at < m_text.size()) {
            return Fail("text after the closing ')'", error);
        }
        return true;
    }

private:
    bool Fail(const std::string& why, std::string& error) const {
        error = AtLine(m_source, m_line, why);
        return false;
    }

    void SkipSpace() {
        while (m_at < m_text.size()) {
            char c = m_text[m_at];
            if (c == '\n') {
                ++m_line;
            } else if (c != ' ' && c != '\t' && c != '\r' && c != '\f' && c != '\v') {
                return;
            }
            ++m_at;
        }
    }

    bool List(SExpr& out, std::size_t depth, std::string& error) {
        if (depth >= kMaxDepth) {
            return Fail("lists nested deeper than " + std::to_string(kMaxDepth), error);
        }
        out.list = true;
        out.line = m_line;
        ++m_at; // '('
        for (;;) {
            SkipSpace();
            if (m_at >= m_text.size()) {
                return Fail("the file ends inside a list opened on line " +
                                std::to_string(out.line),
                            error);
            }
            char c = m_text[m_at];
            if (c == ')') {
                ++m_at;
                return true;
            }
            SExpr child;
            bool ok = c == '(' ? List(child, depth + 1, error)
                               : (c == '"' ? String(child, error) : Word(child));
            if (!ok) {
                return false;
            }
            out.children.push_back(std::move(child));
        }
    }

    bool Word(SExpr& out) {
        out.line = m_line;
        std::size_t start = m_at;
        while (m_at < m_text.size()) {
            char c = m_text[m_at];
            if (c == '(' || c == ')' || c == '"' || c == ' ' || c == '\t' || c == '\n' ||
                c == '\r') {
                break;
            }
            ++m_at;
        }
        out.atom = std::string(m_text.substr(start, m_at - start));
        return true;
    }

    bool String(SExpr& out, std::string& error) {
        out.line = m_line;
        ++m_at; // '"'
        while (m_at < m_text.size() && m_text[m_at] != '"') {
            char c = m_text[m_at++];
            if (c == '\n') {
                ++m_line;
            }
            if (c == '\\' && m_at < m_text.size()) {
                char next = m_text[m_at++];
                c = next == 'n' ? '\n' : (next == 't' ? '\t' : next);
            }
            out.atom += c;
        }
        if (m_at >= m_text.size()) {
            return Fail("the file ends inside a string opened on line " + std::to_string(out.line),
                        error);
        }
        ++m_at;
        return true;
    }

    std::string_view m_text;
    std::string_view m_source;
    std::size_t m_at = 0;
    std::size_t m_line = 1;
};

} // namespace

const std::string& SExpr::Head() const {
    static const std::string kNone;
    return list && !children.empty() && !children.front().list ? children.front().atom : kNone;
}

const SExpr* SExpr::Find(std::string_view head) const {
    for (const SExpr& child : children) {
        if (child.Head() == head) {
            return &child;
        }
    }
    return nullptr;
}

std::string SExpr::AtomAt(std::size_t index) const {
    return index < children.size() && !children[index].list ? children[index].atom : std::string();
}

bool ParseSExpr(std::string_view text, std::string_view source, SExpr& out, std::string& error) {
    out = SExpr();
    return Parser(text, source).Document(out, error);
}

} // namespace VnTool
