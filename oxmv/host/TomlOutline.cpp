#include "oxmv/host/TomlOutline.h"

#include <algorithm>
#include <string>
#include <utility>

#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

constexpr std::string_view blanks = " \t";
constexpr std::string_view bareKeyCharacters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-";

bool contains(std::string_view set, char c) { return set.find(c) != std::string_view::npos; }

// Goes over a text once, from statement to statement. Every step stops at the text's end, and every
// statement and line takes at least one byte, so any text comes to an end.
class Scanner {
 public:
  explicit Scanner(std::string_view text) : text_(text), at_(byteOrderMarkSize(text)) {}

  TomlOutline outline() && {
    while (at_ < text_.size()) {
      const std::size_t begin = at_;
      skip(blanks);
      if (!isAt("\n") && !isAt("\r") && !isAt("#")) statement(begin);
      skipLine();
      if (!outline_.statements.empty() && outline_.statements.back().begin == begin)
        outline_.statements.back().end = at_;
    }
    return std::move(outline_);
  }

 private:
  bool isAt(std::string_view what) const { return text_.substr(at_).starts_with(what); }
  void skip(std::string_view set) {
    at_ = std::min(text_.find_first_not_of(set, at_), text_.size());
  }
  void skipLine() {
    at_ = std::min(text_.find('\n', at_), text_.size());
    if (at_ < text_.size()) ++at_;
  }
  bool isAtAscii() const { return isAscii(text_.substr(at_, 1)); }
  void note(std::string why) {
    if (!outline_.obstacle) outline_.obstacle = {at_, std::move(why)};
  }
  void noteDepth(std::size_t depth) {
    if (depth > maxTomlNesting)
      note("nested deeper than " + std::to_string(maxTomlNesting) + " levels");
  }
  void noteCharacter() {
    if (!isAtAscii()) note("a character that is not ASCII stands outside of text and comments");
  }

  void statement(std::size_t begin) {
    TomlStatement found = {};
    found.begin = begin;
    found.isHeader = isAt("[");
    if (found.isHeader) at_ += isAt("[[") ? 2 : 1;
    key(found);
    if (found.isHeader) {
      skip("]");
    } else if (isAt("=")) {
      ++at_;
      skip(blanks);
      found.valueBegin = at_;
      value();
      found.valueEnd = at_;
    }
    skip(blanks);
    noteCharacter();
    outline_.statements.push_back(found);
  }

  // key := part ( "." part )*       -- with blanks between
  void key(TomlStatement& found) {
    for (std::size_t parts = 1;; ++parts) {
      skip(blanks);
      const std::size_t begin = at_;
      if (isAt("\"") || isAt("'")) {
        shortString();
      } else {
        skip(bareKeyCharacters);
      }
      if (parts == 1) found.firstKey = text_.substr(begin, at_ - begin);
      noteDepth(parts);
      skip(blanks);
      if (!isAt(".")) return;
      ++at_;
      found.isDotted = true;
    }
  }

  void value() {
    const std::size_t begin = at_;
    std::size_t depth = 0;
    std::size_t parts = 1;  // of the key in an inline table, where a dot stands in one
    while (at_ < text_.size()) {
      const char c = text_[at_];
      if (c == '"' || c == '\'') {
        string();
        if (depth == 0) return;
        continue;
      }
      if (depth == 0 && (c == '\n' || c == '#')) break;
      if (c == '#') {
        skipLine();
        continue;
      }
      noteCharacter();
      ++at_;
      if (contains("{,=\n", c)) parts = 1;
      if (c == '.') noteDepth(++parts);
      if (c == '[' || c == '{') noteDepth(++depth);
      if ((c == ']' || c == '}') && (depth == 0 || --depth == 0)) return;
    }
    // A value without brackets or quotes goes on until something else begins. A date may have a
    // blank in it.
    while (at_ > begin && contains(" \t\r", text_[at_ - 1])) --at_;
  }

  void string() {
    if (isAt("\"\"\"") || isAt("'''")) {
      longString();
    } else {
      shortString();
    }
  }

  void shortString() {
    const char quote = text_[at_++];
    while (at_ < text_.size() && text_[at_] != '\n') {
      const char c = text_[at_++];
      if (c == quote) return;
      if (c == '\\' && quote == '"' && at_ < text_.size()) ++at_;
    }
  }

  // Ends with three quotes; up to two more before them belong to the text.
  void longString() {
    const char quote = text_[at_];
    at_ += 3;
    for (std::size_t quotes = 0; at_ < text_.size(); ++at_) {
      const char c = text_[at_];
      if (quotes >= 3 && (c != quote || quotes == 5)) return;
      quotes = c == quote ? quotes + 1 : 0;
      if (c == '\\' && quote == '"') escape();
    }
  }

  // A backslash in a long string: goes to the last character that belongs to it, which may be the
  // last blank before a line that continues this one.
  void escape() {
    const std::size_t next = at_ + 1;
    const std::size_t end = std::min(text_.find_first_not_of(" \t\r\n", next), text_.size());
    const bool endsLine = end > next;
    at_ = end;
    if (!isAtAscii()) {
      if (endsLine) {
        outline_.continuations.push_back(at_);
      } else {
        note("a character that is not ASCII stands behind a backslash");
      }
    }
    if (endsLine || at_ == text_.size()) --at_;
  }

  std::string_view text_;
  std::size_t at_;
  TomlOutline outline_;
};

}  // namespace

TomlOutline outlineToml(std::string_view text) { return Scanner(text).outline(); }

std::size_t byteOrderMarkSize(std::string_view text) noexcept {
  constexpr std::string_view mark = "\xEF\xBB\xBF";
  return text.starts_with(mark) ? mark.size() : 0;
}

}  // namespace oxmv
