// Look descriptions: XML files that hold 3-D colour tables as hexadecimal text.
//
//   <look>                                  the root may have any name
//     <LUT><size>2</size>                   points per axis
//       <data>"00000000 0000803F ..."</data>  a table
//     </LUT>
//   </look>
//
// Every child node of a "LUT" element but "size" is a table: elements of any name, texts (also the
// white space between elements), CDATA sections, comments, processing instructions. So in the lines
// above the white space after "size" is a table without values.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/platform/WholeFile.h"

namespace oxmv {

// One node of a description.
struct LookNode {
  enum class Kind : std::uint8_t {
    lut,    // a "LUT" element begins
    size,   // a "size" element
    table,  // any other child
  };
  // What it is in the document.
  enum class Form : std::uint8_t { element, text, cdata, comment, instruction };
  Kind kind;
  Form form;
  // All the text in it, that of elements within included: what an element or a section holds, the
  // text of a comment, the data of a processing instruction. UTF-8; empty for a "LUT" element.
  std::string_view text;
  std::size_t offset;  // where it begins in the file, in bytes
  // Where its text begins in the file, if it stands there as it is, byte for byte.
  std::optional<std::size_t> textOffset;
};

// What is wrong with a file that is no description, and where, in bytes.
struct LookProblem {
  std::size_t offset = 0;
  std::string what;
};

// How a description is parsed. The results are the same.
enum class LookParsing {
  quick,  // long texts of tables do not pass through the XML parser
  plain,  // everything does
};

// The nodes of a description, in their order. Refers to the file's bytes, which must outlive it.
class LookDescription {
 public:
  // Nothing, with the problem unless that is null, when the file is not well-formed XML, or passes
  // one of the limits that walkXml() has, or its entities make more nodes of it than it has bytes,
  // or its nodes have more than `mostText` bytes of text that does not stand in the file as it is.
  static std::optional<LookDescription> parse(std::span<const std::uint8_t> file,
                                              LookProblem* problem = nullptr,
                                              LookParsing parsing = LookParsing::quick,
                                              std::size_t mostText = maxFileSize);

  std::size_t nodeCount() const { return nodes_.size(); }
  // Valid as long as the description and the file are.
  LookNode node(std::size_t index) const;

 private:
  class [[gnu::visibility("hidden")]] Builder;
  class [[gnu::visibility("hidden")]] Restorer;

  // 16 bytes: a hostile file may have a node for every four of its own. A file and the text made of
  // it have at most maxFileSize bytes each, so 32 bits hold every place.
  struct Entry {
    std::uint32_t offset;
    std::uint32_t textStart;
    std::uint32_t textLength;
    LookNode::Kind kind;
    LookNode::Form form;
    bool isInFile;  // textStart counts in the file, else in text_
  };

  explicit LookDescription(std::string_view file) : file_(file) {}

  std::string_view file_;
  std::string text_;  // of all nodes whose text does not stand in the file as it is
  std::vector<Entry> nodes_;
};

// The number of points that a "size" node asks for: its text without the punctuation at both ends,
// read as a whole number; 0 when it does not begin with one, the nearest 32-bit number when it has
// more bits.
std::int32_t lookSizeFrom(std::string_view text) noexcept;

}  // namespace oxmv
