#include "cli/LookSpace.h"

#include <algorithm>
#include <iterator>
#include <string_view>

#include "cli/LookFindings.h"
#include "oxmv/looks/LookDescription.h"

namespace oxmv::cli {
namespace {

using Cut = StrippedLook::Cut;

constexpr std::string_view whiteSpace = " \t\r\n";

// The white space at both ends of a node's text, as far as it stands there between markup.
void cutAround(std::string_view file, std::span<const std::uint8_t> bytes, const LookNode& node,
               std::vector<Cut>& cuts) {
  const auto content = contentOffset(bytes, node);
  if (!content) return;
  const std::size_t end = std::min(file.find('<', *content), file.size());
  const std::string_view text = file.substr(*content, end - *content);
  const std::size_t first = std::min(text.find_first_not_of(whiteSpace), text.size());
  if (first > 0) cuts.push_back({*content, first, 0});
  const std::size_t rest = text.find_last_not_of(whiteSpace) + 1;
  // In an element the text may go on behind other markup.
  const bool isWhole = node.form == LookNode::Form::text || file.substr(end).starts_with("</");
  if (isWhole && first < text.size() && rest < text.size())
    cuts.push_back({*content + rest, text.size() - rest, 0});
}

}  // namespace

std::size_t StrippedLook::offsetInFile(std::size_t offset) const {
  const auto next = std::upper_bound(
      cuts.begin(), cuts.end(), offset,
      [](std::size_t place, const Cut& cut) { return place < cut.offset - cut.before; });
  if (next == cuts.begin()) return offset;
  const Cut& last = *std::prev(next);
  return offset + last.before + last.size;
}

std::optional<StrippedLook> withoutSpace(std::span<const std::uint8_t> file) {
  if (isUtf16(file)) return std::nullopt;
  const auto description = LookDescription::parse(file);
  if (!description) return std::nullopt;
  StrippedLook stripped;
  const std::string_view text(reinterpret_cast<const char*>(file.data()), file.size());
  for (std::size_t i = 0; i < description->nodeCount(); ++i) {
    // What stands in a "LUT" element are nodes of their own.
    const LookNode node = description->node(i);
    if (node.kind != LookNode::Kind::lut) cutAround(text, file, node, stripped.cuts);
  }

  stripped.bytes.reserve(file.size());
  std::size_t next = 0;
  std::size_t before = 0;
  for (Cut& cut : stripped.cuts) {
    cut.before = before;
    before += cut.size;
    stripped.bytes.insert(stripped.bytes.end(), file.begin() + static_cast<std::ptrdiff_t>(next),
                          file.begin() + static_cast<std::ptrdiff_t>(cut.offset));
    next = cut.offset + cut.size;
  }
  stripped.bytes.insert(stripped.bytes.end(), file.begin() + static_cast<std::ptrdiff_t>(next),
                        file.end());
  return stripped;
}

}  // namespace oxmv::cli
