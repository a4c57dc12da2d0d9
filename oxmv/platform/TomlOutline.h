// Where the statements of a TOML text stand, byte for byte, so that one of them can be changed and
// no other character is.

#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace oxmv {

// How deep a text may nest: parts of a dotted key, and values within values. TOML itself has no
// limit, but a parser that makes a table for every part of "a.a.a..." and frees them one within the
// other would run out of stack. Preferences are flat; with this, 64 KiB of stack suffice.
constexpr std::size_t maxTomlNesting = 8;

// `[table]`, `[[table]]` or `key = value`. All offsets and views are those of the text.
//
//     "look.folder" . root = [      # begin: the start of this line
//       "/looks",                   # firstKey: "look.folder", quotes included; isDotted
//     ]  # on the fast disk         # value: from [ to ]; end: the start of the line after this
struct TomlStatement {
  std::size_t begin;
  std::size_t end;  // behind the line end, if there is one
  std::string_view firstKey;
  bool isDotted;
  bool isHeader;
  std::size_t valueBegin;  // of a header: neither has a meaning
  std::size_t valueEnd;
};

// Why a text is not TOML.
struct TomlMistake {
  std::size_t at;
  std::string why;
};

struct TomlOutline {
  std::vector<TomlStatement> statements;
  // The first place where the text nests deeper than maxTomlNesting or breaks TOML's grammar. The
  // outline ends there. Not looked for: keys that stand there twice, numbers and dates out of
  // range, escapes in strings, characters that no text may hold.
  std::optional<TomlMistake> mistake;
  // The characters that are not ASCII and stand first in a line that continues another, behind a
  // backslash at its end. They are no blanks, whatever they look like.
  std::vector<std::size_t> continuations;
};

// The outline of any text. No other parser need be trusted with one in which this finds a mistake.
TomlOutline outlineToml(std::string_view text);

// The size of the byte order mark at the start of a text: 3, or 0 when there is none.
std::size_t byteOrderMarkSize(std::string_view text) noexcept;

}  // namespace oxmv
