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
#include <utility>
#include <vector>

namespace VnTool {

/// Escapes &, <, >, " and ' for use in XML text and attribute values; control characters
/// become '?' and bytes that are not UTF-8 characters become U+FFFD.
std::string XmlEscape(std::string_view text);

/// The width a text takes at that font size, as the views estimate it for a sans-serif
/// face (an average character is 0.6 of the size; a generous guess, so that what is said
/// to fit does).
double TextWidth(std::string_view text, double size);

/// `text` as it fits in `room` pixels at that size: whole, or cut with a trailing "…";
/// empty when not even two characters fit.
std::string FitText(std::string_view text, double room, double size);

class SvgWriter {
public:
    SvgWriter(double width, double height);

    void Rect(double x, double y, double w, double h, const std::string& fill,
              std::string_view cssClass, std::string_view title = {},
              const std::string& stroke = "#404040", double strokeWidth = 0.5);
    void Circle(double cx, double cy, double r, const std::string& fill, std::string_view cssClass,
                std::string_view title = {}, const std::string& stroke = "#202020",
                double strokeWidth = 0.5);
    /// `rotate` turns the text by that many degrees about (x, y); -90 runs it upward.
    void Text(double x, double y, std::string_view text, double size = 12,
              std::string_view anchor = "start", std::string_view cssClass = {}, double rotate = 0,
              const std::string& fill = "#000000");
    /// A closed shape through `points` (x, y pairs).
    void Polygon(const std::vector<std::pair<double, double>>& points, const std::string& fill,
                 std::string_view cssClass, std::string_view title = {},
                 const std::string& stroke = "#202020", double strokeWidth = 0.5);

    /// The finished document.
    std::string Finish() const;

private:
    std::string m_body;
    double m_width;
    double m_height;
};

} // namespace VnTool
