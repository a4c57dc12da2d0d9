// TOML: keys and values in a text that is written by hand as often as by us.

#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "oxmv/values/Dictionary.h"

namespace oxmv {

// Why a text is not TOML. The message is the parser's, and may repeat some of the text.
struct TomlProblem {
  std::size_t line = 0;  // the first is 1
  std::string message;
};

// A text that is TOML, and what it says. Editing makes another text, in which only what was asked
// for is different: comments, order, blanks, line ends, a byte order mark stay as they are, byte
// for byte.
//
// A table, an array or a string gives a dictionary, array or text; an integer or a float gives an
// integer or a double. What has no kind of its own is kept apart from text all the same: true and
// false are the integers 1 and 0, and a date or a time is data, the bytes of its usual form
// ("1979-05-27T07:32:00Z").
class TomlText {
 public:
  // Nothing when the text is not TOML 1.0, nests deeper than maxTomlNesting, or is not UTF-8; then
  // `problem`, unless null, says why.
  static std::optional<TomlText> parse(std::string text, TomlProblem* problem = nullptr);

  // An empty text.
  TomlText() = default;

  const std::string& text() const noexcept { return text_; }
  // The keys at the top and their values: `a.b = 1` and `[a]` make a dictionary "a".
  const Dictionary& values() const noexcept { return values_; }

  // This text with the value under a key at the top, or without the key when the value is nothing.
  // A key that is not valid UTF-8 is taken as ISO-8859-1.
  //
  // A value takes the place of the one before it, character for character. If that was spread over
  // tables or dotted keys, their lines go. A new key gets a line of its own: behind the last key at
  // the top, where no table has begun. With a key that is removed goes its line, and the comment in
  // it. A value that is already there changes nothing.
  //
  // Floats are written with as many digits as tell them apart from others of their size, and come
  // back as doubles. Nothing, when the value has no form in TOML: data, or nested too deep.
  std::optional<TomlText> with(std::string_view key, const Value& value) const;

 private:
  TomlText(std::string text, Dictionary values)
      : text_(std::move(text)), values_(std::move(values)) {}

  std::string text_;
  Dictionary values_;
};

}  // namespace oxmv
