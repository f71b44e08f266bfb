//===-- tools/board/Xml.h - a small reader of the XML KiCad writes its netlists in ---===//
//
// \file
// KiCad's XML netlist uses elements, attributes, text and the five named entities, no
// namespaces and no document type of consequence. This reader takes exactly that (plus
// comments, processing instructions, CDATA and character references) and refuses the rest
// with a line number, so the tool needs no XML library for one file format.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace VnTool {

struct XmlElement {
    std::string name;
    std::vector<std::pair<std::string, std::string>> attributes;
    std::vector<XmlElement> children;
    std::string text; ///< the element's own text, entities resolved
    std::size_t line = 0;

    /// The attribute's value, or empty.
    std::string Attribute(std::string_view key) const;
    /// The first child of that name, or null.
    const XmlElement* Child(std::string_view childName) const;
};

/// Reads the document element. Returns false with "source:line: why" in `error`.
bool ParseXml(std::string_view text, std::string_view source, XmlElement& root, std::string& error);

} // namespace VnTool
