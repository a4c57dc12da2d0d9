// Any bytes as a look description. What must hold for all of them:
//
// - both ways of parsing give the same nodes, at the same places, or the same problem, also where
//   the nodes may have little text of their own;
// - a text that is said to stand in the file stands there;
// - every table reads the same with portable and with vector instructions, and stays in its record.
//
// The bytes 1 and 2, which no XML has, stand for runs long enough to be left out of the parsing,
// the second with every kind of line end, so that small inputs reach that, too.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "fuzz/Require.h"
#include "oxmv/looks/HexTable.h"
#include "oxmv/looks/LongRuns.h"
#include "oxmv/looks/LookDescription.h"
#include "oxmv/platform/Xml.h"

namespace {

using namespace oxmv;
using fuzz::require;

std::string withRuns(std::span<const std::uint8_t> bytes) {
  std::string text;
  for (const std::uint8_t byte : bytes) {
    if (byte == 1) {
      for (std::size_t i = 0; i < minLongRun; ++i) text += "0123456789abcdefABCDEF \n"[i % 24];
    } else if (byte == 2) {
      for (std::size_t i = 0; i < minLongRun; ++i) text += "0123456789abcdef\r\n \r\r\n\n"[i % 23];
    } else {
      text += static_cast<char>(byte);
    }
  }
  return text;
}

void compareTables(std::string_view text) {
  constexpr std::size_t room = 100;
  constexpr std::uint8_t untouched = 0xEE;
  std::vector<std::uint8_t> values[2];
  HexTable tables[2];
  for (const Instructions kind : {Instructions::portable, Instructions::vector}) {
    const bool isVector = kind == Instructions::vector;
    values[isVector].assign(room * 4, untouched);
    tables[isVector] = readHexTable(text, values[isVector], kind);
  }
  const HexTable& table = tables[0];
  require(values[0] == values[1]);
  require(table.groups == tables[1].groups && table.stored == tables[1].stored);
  require(table.malformed == tables[1].malformed && table.isAscii == tables[1].isAscii);
  require(table.stored == std::min(room, table.groups));
  require(table.groups * 8 <= text.size() + 7 && table.malformed <= table.groups);
  require(table.leading <= text.size());
  require(std::all_of(
      values[0].begin() + static_cast<std::ptrdiff_t>(table.stored * 4), values[0].end(),
      [&](std::uint8_t byte) { return byte == untouched || (byte == 0 && !table.isAscii); }));
}

// Parses the file in both ways; `most` is how much text its nodes may have that is not the file's.
void compareParsings(std::string_view text, std::span<const std::uint8_t> file, std::size_t most) {
  LookProblem problems[2];
  const auto quick = LookDescription::parse(file, &problems[0], LookParsing::quick, most);
  const auto plain = LookDescription::parse(file, &problems[1], LookParsing::plain, most);
  require(quick.has_value() == plain.has_value());
  require(problems[0].offset == problems[1].offset && problems[0].what == problems[1].what);
  if (!quick) {
    require(!problems[0].what.empty() && problems[0].offset <= file.size());
    const XmlPosition position = XmlPositions(file).of(problems[0].offset);
    require(position.line >= 1 && position.column >= 1);
    return;
  }

  require(quick->nodeCount() == plain->nodeCount());
  for (std::size_t i = 0; i < quick->nodeCount(); ++i) {
    const LookNode one = quick->node(i);
    const LookNode other = plain->node(i);
    require(one.kind == other.kind && one.form == other.form && one.text == other.text);
    require(one.offset == other.offset && one.textOffset == other.textOffset);
    require(one.offset < file.size());
    if (one.textOffset) require(text.substr(*one.textOffset, one.text.size()) == one.text);
    if (one.kind == LookNode::Kind::size) lookSizeFrom(one.text);
    if (one.kind == LookNode::Kind::table) compareTables(one.text);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text = withRuns({data, size});
  // Of exactly its size, so that a sanitizer sees the first byte read past its end.
  const std::vector<std::uint8_t> file(text.begin(), text.end());
  compareParsings(text, file, maxFileSize);
  compareParsings(text, file, file.size() / 2);
  return 0;
}
