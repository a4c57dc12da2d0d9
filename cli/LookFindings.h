// What is odd about a look description: everything that ends its import early, and everything that
// makes another look of it than its author meant.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/looks/LookDescription.h"
#include "oxmv/platform/Xml.h"

namespace oxmv::cli {

struct LookFinding {
  std::string_view code;              // stable: "too-few-values"
  std::string message;                // what it is, and how to mend it; visible text
  std::optional<std::size_t> offset;  // in the file; nothing for what is about the file as a whole
  bool stops = false;                 // the import ends here
};

// Tables in one description. No author has as many, and each takes memory in what is said of it.
constexpr std::size_t mostLookTables = 100000;

// Everything in the order of the file. Reads as the import does, but on to the end whatever it
// finds. `fileName` is that of the description, which names its looks; empty when it has none.
std::vector<LookFinding> findingsInLook(std::span<const std::uint8_t> file,
                                        std::string_view fileName);

// Where the content of a node begins in the file as it stands there: behind the start tag of an
// element, or where a text begins. Nothing for other nodes, for those that an entity brought, and
// for elements without content.
std::optional<std::size_t> contentOffset(std::span<const std::uint8_t> file, const LookNode& node);

// Whether the file is in UTF-16, whose bytes are no characters.
bool isUtf16(std::span<const std::uint8_t> file) noexcept;

// "line 3, column 7"
std::string positionText(const XmlPosition& position);

}  // namespace oxmv::cli
