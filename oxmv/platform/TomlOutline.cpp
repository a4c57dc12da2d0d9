#include "oxmv/platform/TomlOutline.h"

#include <algorithm>
#include <utility>

#include "oxmv/platform/TomlScalar.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

constexpr std::string_view blanks = " \t";
constexpr std::string_view bareKeyCharacters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-";
constexpr std::string_view scalarCharacters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-+.:";

// text      := mark? ( line newline )* line
// line      := blank* statement? blank* comment?
// statement := key "=" value | "[" key "]" | "[[" key "]]"
// key       := part ( "." part )*
// part      := bare | short string
// value     := short string | long string | scalar
//            | "[" ( value ( "," value )* ","? )? "]"      -- newlines and comments between all of these
//            | "{" ( key "=" value ( "," key "=" value )* )? "}"
//
// Blanks may stand between all of these. Goes over the text once; a mistake sends it to the text's
// end, where every loop stops.
class Scanner {
 public:
  explicit Scanner(std::string_view text) : text_(text), at_(byteOrderMarkSize(text)) {}

  TomlOutline outline() && {
    while (at_ < text_.size()) {
      TomlStatement found = {};
      found.begin = at_;
      skip(blanks);
      const bool isEmpty = isAtLineEnd() || isAt("#");
      if (!isEmpty) statement(found);
      lineEnd();
      found.end = at_;
      if (!isEmpty && !outline_.mistake) outline_.statements.push_back(found);
    }
    return std::move(outline_);
  }

 private:
  bool isAt(std::string_view what) const { return text_.substr(at_).starts_with(what); }
  bool isAtLineEnd() const { return at_ == text_.size() || isAt("\n") || isAt("\r\n"); }
  bool take(std::string_view what) {
    const bool isThere = isAt(what);
    if (isThere) at_ += what.size();
    return isThere;
  }
  void skip(std::string_view set) {
    at_ = std::min(text_.find_first_not_of(set, at_), text_.size());
  }
  void skipComment() { at_ = std::min(text_.find('\n', at_), text_.size()); }

  void fail(std::string why) {
    if (!outline_.mistake) outline_.mistake = {at_, std::move(why)};
    at_ = text_.size();
  }
  void expect(std::string_view what) {
    if (!take(what)) fail("expected '" + std::string(what) + "'");
  }
  void checkDepth(std::size_t depth) {
    if (depth > maxTomlNesting)
      fail("nested deeper than " + std::to_string(maxTomlNesting) + " levels");
  }

  void lineEnd() {
    skip(blanks);
    if (isAt("#")) skipComment();
    if (!isAtLineEnd()) fail("expected the end of the line");
    take("\r");
    take("\n");
  }

  void statement(TomlStatement& found) {
    found.isHeader = isAt("[");
    if (found.isHeader) {
      const std::string_view brackets = isAt("[[") ? "[[]]" : "[]";
      at_ += brackets.size() / 2;
      key(found);
      expect(brackets.substr(brackets.size() / 2));
    } else {
      key(found);
      expect("=");
      skip(blanks);
      found.valueBegin = at_;
      value(0);
      found.valueEnd = at_;
    }
  }

  // With the blanks around it.
  void key(TomlStatement& found) {
    for (std::size_t parts = 1;; ++parts) {
      skip(blanks);
      const std::size_t begin = at_;
      if (isAt("\"") || isAt("'")) {
        shortString();
      } else {
        skip(bareKeyCharacters);
      }
      if (at_ == begin) return fail("expected a key");
      if (parts == 1) found.firstKey = text_.substr(begin, at_ - begin);
      checkDepth(parts);
      skip(blanks);
      if (!take(".")) return;
      found.isDotted = true;
    }
  }

  // `depth`: how many arrays and tables it stands in.
  void value(std::size_t depth) {
    if (isAt("\"\"\"") || isAt("'''")) return longString();
    if (isAt("\"") || isAt("'")) return shortString();
    if (isAt("[") || isAt("{")) checkDepth(depth + 1);
    if (take("[")) return elements(depth + 1);
    if (take("{")) return entries(depth + 1);
    scalar();
  }

  void elements(std::size_t depth) {
    for (skipLines(); at_ < text_.size() && !isAt("]"); skipLines()) {
      value(depth);
      skipLines();
      if (!take(",")) break;
    }
    if (!take("]")) fail("expected ',' or ']'");
  }

  void entries(std::size_t depth) {
    skip(blanks);
    if (take("}")) return;
    do {
      TomlStatement ignored = {};
      key(ignored);
      expect("=");
      skip(blanks);
      value(depth);
      skip(blanks);
    } while (take(","));
    if (!take("}")) fail("expected ',' or '}'");
  }

  void skipLines() {
    for (;;) {
      skip(blanks);
      if (isAt("#")) skipComment();
      if (at_ == text_.size() || !isAtLineEnd()) return;
      take("\r");
      take("\n");
    }
  }

  void scalar() {
    const std::size_t begin = at_;
    skip(scalarCharacters);
    if (at_ == begin) return fail("expected a value");
    // A date may have its time behind a blank: "1979-05-27 07:32:00".
    const bool isDate = at_ - begin == 10 && text_[begin + 4] == '-' && text_[begin + 7] == '-';
    const std::string_view next = text_.substr(at_).substr(0, 2);
    if (isDate && next.size() == 2 && next[0] == ' ' && '0' <= next[1] && next[1] <= '9') {
      ++at_;
      skip(scalarCharacters);
    }
    if (!isTomlScalar(text_.substr(begin, at_ - begin))) {
      at_ = begin;
      fail("neither a text, a boolean, a number nor a date");
    }
  }

  void shortString() {
    const char quote = text_[at_++];
    while (at_ < text_.size() && text_[at_] != '\n') {
      const char c = text_[at_++];
      if (c == quote) return;
      if (c == '\\' && quote == '"' && at_ < text_.size() && text_[at_] != '\n') ++at_;
    }
    fail("a string without an end");
  }

  // Ends with three quotes; up to two more before them belong to the text.
  void longString() {
    const char quote = text_[at_];
    at_ += 3;
    std::size_t quotes = 0;
    while (at_ < text_.size()) {
      const char c = text_[at_];
      if (quotes >= 3 && (c != quote || quotes == 5)) return;
      quotes = c == quote ? quotes + 1 : 0;
      if (c == '\\' && quote == '"') {
        escape();
      } else {
        ++at_;
      }
    }
    if (quotes < 3) fail("a string without an end");
  }

  // In a long string: a backslash and the character behind it, or all blanks and line ends up to
  // the line that continues this one.
  void escape() {
    const std::size_t next = at_ + 1;
    const std::size_t end = std::min(text_.find_first_not_of(" \t\r\n", next), text_.size());
    const bool endsLine = end > next;
    const bool isAsciiNext = isAscii(text_.substr(end, 1));
    if (!isAsciiNext && !endsLine) return fail("no escape begins like this");
    if (!isAsciiNext) outline_.continuations.push_back(end);
    at_ = endsLine ? end : std::min(next + 1, text_.size());
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
