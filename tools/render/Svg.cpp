//===-- tools/render/Svg.cpp - a minimal SVG document writer --------------===//
#include "Svg.h"

#include <cstdio>

namespace VnTool {

namespace {

std::string Num(double value) {
    char buffer[32];
    std::snprintf(buffer, sizeof buffer, "%.2f", value);
    std::string text(buffer);
    // Trailing zeros only make the file bigger.
    while (text.back() == '0') {
        text.pop_back();
    }
    if (text.back() == '.') {
        text.pop_back();
    }
    return text;
}

std::string Tooltip(std::string_view title) {
    return title.empty() ? std::string() : "<title>" + XmlEscape(title) + "</title>";
}

// The length of the well-formed UTF-8 sequence at text[i] that XML may hold, or 0: overlong
// forms, surrogates, code points past U+10FFFF and U+FFFE/U+FFFF are not characters.
std::size_t XmlCharLength(std::string_view text, std::size_t i) {
    const auto byte = [&](std::size_t k) { return static_cast<unsigned char>(text[k]); };
    const unsigned char lead = byte(i);
    std::size_t length = 0;
    char32_t code = 0;
    if (lead >= 0xc2 && lead <= 0xdf) {
        length = 2;
        code = lead & 0x1f;
    } else if (lead >= 0xe0 && lead <= 0xef) {
        length = 3;
        code = lead & 0x0f;
    } else if (lead >= 0xf0 && lead <= 0xf4) {
        length = 4;
        code = lead & 0x07;
    } else {
        return 0;
    }
    if (i + length > text.size()) {
        return 0;
    }
    for (std::size_t k = 1; k < length; ++k) {
        if ((byte(i + k) & 0xc0) != 0x80) {
            return 0;
        }
        code = (code << 6) | (byte(i + k) & 0x3f);
    }
    const bool overlong = (length == 3 && code < 0x800) || (length == 4 && code < 0x10000);
    const bool surrogate = code >= 0xd800 && code <= 0xdfff;
    if (overlong || surrogate || code > 0x10ffff || code == 0xfffe || code == 0xffff) {
        return 0;
    }
    return length;
}

} // namespace

std::string XmlEscape(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        switch (c) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        case '"':
            out += "&quot;";
            break;
        case '\'':
            out += "&apos;";
            break;
        default:
            if (static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n') {
                // Control characters other than tab and newline are not allowed in XML 1.0.
                out += '?';
            } else if (static_cast<unsigned char>(c) < 0x80) {
                out += c;
            } else if (const std::size_t length = XmlCharLength(text, i); length > 0) {
                out.append(text.substr(i, length));
                i += length - 1;
            } else {
                // Names from a file in another encoding: the document is declared UTF-8,
                // so a byte that is no character becomes U+FFFD, one per byte.
                out += "\xef\xbf\xbd";
            }
        }
    }
    return out;
}

double TextWidth(std::string_view text, double size) {
    std::size_t characters = 0;
    for (char c : text) {
        characters += (static_cast<unsigned char>(c) & 0xc0) != 0x80 ? 1 : 0;
    }
    return 0.6 * size * static_cast<double>(characters);
}

std::string FitText(std::string_view text, double room, double size) {
    if (TextWidth(text, size) <= room) {
        return std::string(text);
    }
    std::string cut;
    for (char c : text) {
        // Whole UTF-8 characters only, and room kept for the ellipsis.
        if ((static_cast<unsigned char>(c) & 0xc0) != 0x80 &&
            TextWidth(cut, size) + 2 * 0.6 * size > room) {
            break;
        }
        cut += c;
    }
    return TextWidth(cut, size) < 1.5 * 0.6 * size ? std::string() : cut + "\u2026";
}

SvgWriter::SvgWriter(double width, double height) : m_width(width), m_height(height) {}

void SvgWriter::Rect(double x, double y, double w, double h, const std::string& fill,
                     std::string_view cssClass, std::string_view title, const std::string& stroke,
                     double strokeWidth) {
    m_body += "<rect class=\"" + XmlEscape(cssClass) + "\" x=\"" + Num(x) + "\" y=\"" + Num(y) +
              "\" width=\"" + Num(w) + "\" height=\"" + Num(h) + "\" fill=\"" + fill +
              "\" stroke=\"" + stroke + "\" stroke-width=\"" + Num(strokeWidth) + "\">" +
              Tooltip(title) + "</rect>\n";
}

void SvgWriter::Circle(double cx, double cy, double r, const std::string& fill,
                       std::string_view cssClass, std::string_view title, const std::string& stroke,
                       double strokeWidth) {
    m_body += "<circle class=\"" + XmlEscape(cssClass) + "\" cx=\"" + Num(cx) + "\" cy=\"" +
              Num(cy) + "\" r=\"" + Num(r) + "\" fill=\"" + fill + "\" stroke=\"" + stroke +
              "\" stroke-width=\"" + Num(strokeWidth) + "\">" + Tooltip(title) + "</circle>\n";
}

void SvgWriter::Text(double x, double y, std::string_view text, double size,
                     std::string_view anchor, std::string_view cssClass, double rotate,
                     const std::string& fill) {
    m_body += "<text";
    if (!cssClass.empty()) {
        m_body += " class=\"" + XmlEscape(cssClass) + "\"";
    }
    m_body += " x=\"" + Num(x) + "\" y=\"" + Num(y) + "\" font-size=\"" + Num(size) +
              "\" text-anchor=\"" + XmlEscape(anchor) + "\"";
    if (rotate != 0) {
        m_body += " transform=\"rotate(" + Num(rotate) + " " + Num(x) + " " + Num(y) + ")\"";
    }
    if (fill != "#000000") {
        m_body += " fill=\"" + fill + "\"";
    }
    m_body += '>';
    m_body += XmlEscape(text);
    m_body += "</text>\n";
}

void SvgWriter::Polygon(const std::vector<std::pair<double, double>>& points,
                        const std::string& fill, std::string_view cssClass, std::string_view title,
                        const std::string& stroke, double strokeWidth) {
    std::string list;
    for (const auto& [x, y] : points) {
        if (!list.empty()) {
            list += ' ';
        }
        list += Num(x);
        list += ',';
        list += Num(y);
    }
    m_body += "<polygon class=\"" + XmlEscape(cssClass) + "\" points=\"" + list + "\" fill=\"" +
              fill + "\" stroke=\"" + stroke + "\" stroke-width=\"" + Num(strokeWidth) + "\">" +
              Tooltip(title) + "</polygon>\n";
}

std::string SvgWriter::Finish() const {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
           "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" +
           Num(m_width) + "\" height=\"" + Num(m_height) + "\" viewBox=\"0 0 " + Num(m_width) +
           " " + Num(m_height) +
           "\" font-family=\"sans-serif\">\n"
           "<rect class=\"background\" x=\"0\" y=\"0\" width=\"100%\" height=\"100%\" "
           "fill=\"#ffffff\"/>\n" +
           m_body + "</svg>\n";
}

} // namespace VnTool
