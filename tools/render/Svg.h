//===-- tools/render/Svg.h - a minimal SVG document writer ----------------===//
//
// \file
// Enough SVG for floorplans and swatch sheets: rectangles, circles and text, each with
// a class and an optional tooltip. Every text that reaches the document is escaped, since
// pin names, tile names and file names come from outside.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

/// Escapes &, <, >, " and ' for use in XML text and attribute values; control characters
/// become '?' and bytes that are not UTF-8 characters become U+FFFD.
std::string XmlEscape(std::string_view text);

class SvgWriter {
public:
    SvgWriter(double width, double height);

    void Rect(double x, double y, double w, double h, const std::string& fill,
              std::string_view cssClass, std::string_view title = {},
              const std::string& stroke = "#404040", double strokeWidth = 0.5);
    void Circle(double cx, double cy, double r, const std::string& fill, std::string_view cssClass,
                std::string_view title = {}, const std::string& stroke = "#202020",
                double strokeWidth = 0.5);
    void Text(double x, double y, std::string_view text, double size = 12,
              std::string_view anchor = "start");

    /// The finished document.
    std::string Finish() const;

private:
    std::string m_body;
    double m_width;
    double m_height;
};

} // namespace VnTool
