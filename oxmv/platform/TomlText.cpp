#include "oxmv/platform/TomlText.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <locale>
#include <span>
#include <sstream>
#include <utility>
#include <vector>

// Compiled in here, so that those who link with us need not know of it. Without exceptions, because
// its own ends the process when there is no memory for its message; otherwise as it comes, so that
// a host that uses it, too, has one and the same.
#define TOML_HEADER_ONLY 1
#define TOML_EXCEPTIONS 0
#include <toml++/toml.h>

#include "oxmv/platform/TomlOutline.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

// From TOML to values.

Value valueOf(const toml::node& node);

Dictionary dictionaryOf(const toml::table& table) {
  Dictionary entries;
  for (const auto& [key, node] : table) entries.set(key.str(), valueOf(node));
  return entries;
}

Array arrayOf(const toml::array& array) {
  std::vector<Value> elements;
  elements.reserve(array.size());
  for (const toml::node& node : array) elements.push_back(valueOf(node));
  return Array(std::move(elements));
}

template <class Time>
Value timeOf(const toml::value<Time>& time) {
  std::ostringstream out;
  out.imbue(std::locale::classic());
  out << time.get();
  const std::string text = out.str();
  return Value::data({reinterpret_cast<const std::uint8_t*>(text.data()), text.size()});
}

Value valueOf(const toml::node& node) {
  switch (node.type()) {
    case toml::node_type::none: return {};  // Not reached: no node of a document is of this type.
    case toml::node_type::table: return dictionaryOf(*node.as_table());
    case toml::node_type::array: return arrayOf(*node.as_array());
    case toml::node_type::string: return node.as_string()->get();
    case toml::node_type::integer: return node.as_integer()->get();
    case toml::node_type::floating_point: return node.as_floating_point()->get();
    case toml::node_type::boolean: return node.as_boolean()->get() ? 1 : 0;
    case toml::node_type::date: return timeOf(*node.as_date());
    case toml::node_type::time: return timeOf(*node.as_time());
    case toml::node_type::date_time: return timeOf(*node.as_date_time());
  }
  return {};  // Not reached: every case is above.
}

std::size_t lineAt(std::string_view text, std::size_t offset) {
  const std::string_view before = text.substr(0, offset);
  return static_cast<std::size_t>(std::count(before.begin(), before.end(), '\n')) + 1;
}

// The same text with some characters of its strings written as escapes.
std::string escaped(std::string text, const std::vector<std::size_t>& places) {
  for (auto place = places.rbegin(); place != places.rend(); ++place) {
    const Character next = firstCharacter(std::string_view(text).substr(*place));
    if (next.isByte) continue;  // not UTF-8, which is an error anyway
    std::string escape = "\\U00000000";
    std::size_t digit = escape.size();
    for (char32_t code = next.code; code != 0; code >>= 4)
      escape[--digit] = "0123456789ABCDEF"[code & 0xF];
    text.replace(*place, next.size, escape);
  }
  return text;
}

std::optional<Dictionary> parsed(std::string_view text, TomlProblem& problem) {
  const TomlOutline outline = outlineToml(text);
  if (outline.mistake) {
    problem = {lineAt(text, outline.mistake->at), outline.mistake->why};
    return std::nullopt;
  }
  // toml++ 3.3 asks whether such a character is a blank, and its answer is undefined for most.
  const toml::parse_result result =
      outline.continuations.empty()
          ? toml::parse(text)
          : toml::parse(escaped(std::string(text), outline.continuations));
  if (result) return dictionaryOf(result.table());
  const toml::parse_error& error = result.error();
  problem = {error.source().begin.line, std::string(error.description())};
  return std::nullopt;
}

// From values to TOML.

std::string quoted(std::string_view text) {
  std::string literal = "\"";
  for (const char c : text) {
    const auto code = static_cast<std::uint8_t>(c);
    if (c == '"' || c == '\\') {
      literal += {'\\', c};
    } else if (c == '\n') {
      literal += "\\n";
    } else if (c == '\t') {
      literal += "\\t";
    } else if (code < 0x20 || code == 0x7F) {
      literal += {'\\',
                  'u',
                  '0',
                  '0',
                  static_cast<char>('0' + (code >> 4)),
                  "0123456789ABCDEF"[code & 0xF]};
    } else {
      literal += c;
    }
  }
  return literal + '"';
}

std::string keyLiteral(std::string_view key) {
  const bool isBare = !key.empty() && std::all_of(key.begin(), key.end(), [](char c) {
    return ('a' <= c && c <= 'z') || ('A' <= c && c <= 'Z') || ('0' <= c && c <= '9') || c == '_' ||
           c == '-';
  });
  return isBare ? std::string(key) : quoted(key);
}

template <class Number>
std::string numberLiteral(Number number) {
  std::array<char, 64> digits;  // the longest double takes 24
  const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
  return {digits.data(), end};
}

// The fewest digits that give the number back. Without a point or an exponent it would be an
// integer.
template <class Float>
std::string floatLiteral(Float number) {
  if (std::isnan(number)) return std::signbit(number) ? "-nan" : "nan";
  const std::string digits = numberLiteral(number);
  return digits.find_first_of(".ein") == std::string::npos ? digits + ".0" : digits;
}

// Appends the value's form. Answers false when it has none.
bool appendLiteral(std::string& out, const Value& value, std::size_t depth);

bool appendElements(std::string& out, const Array& elements, std::size_t depth) {
  const char* before = "[";
  for (const Value& element : elements) {
    out += std::exchange(before, ", ");
    if (!appendLiteral(out, element, depth)) return false;
  }
  out += elements.empty() ? "[]" : "]";
  return true;
}

bool appendEntries(std::string& out, const Dictionary& entries, std::size_t depth) {
  const char* before = "{ ";
  for (const auto& [key, value] : entries) {
    out += std::exchange(before, ", ");
    out += keyLiteral(key) + " = ";
    if (!appendLiteral(out, value, depth)) return false;
  }
  out += entries.empty() ? "{}" : " }";
  return true;
}

bool appendLiteral(std::string& out, const Value& value, std::size_t depth) {
  switch (value.kind()) {
    case Value::Kind::nothing: return false;
    case Value::Kind::integer: return out += numberLiteral(value.int64Value()), true;
    case Value::Kind::float32: return out += floatLiteral(value.floatValue()), true;
    case Value::Kind::float64: return out += floatLiteral(value.doubleValue()), true;
    case Value::Kind::text: return out += quoted(value.text()), true;
    case Value::Kind::data: return false;
    case Value::Kind::array:
      return depth < maxTomlNesting && appendElements(out, value.array(), depth + 1);
    case Value::Kind::dictionary:
      return depth < maxTomlNesting && appendEntries(out, value.dictionary(), depth + 1);
  }
  return false;  // Not reached: every case is above.
}

// Editing.

// The key that a key's text stands for: bare, 'literal' or "basic".
std::string keyOf(std::string_view written) {
  const bool isQuoted = written.size() >= 2 && (written[0] == '"' || written[0] == '\'');
  if (!isQuoted) return std::string(written);
  if (written[0] == '\'' || written.find('\\') == std::string_view::npos)
    return std::string(written.substr(1, written.size() - 2));
  return std::string(toml::parse(std::string(written) + "=0").table().begin()->first.str());
}

std::string_view lineEndOf(std::string_view text) {
  const std::size_t end = text.find('\n');
  const bool isCrLf = end != std::string_view::npos && end > 0 && text[end - 1] == '\r';
  return isCrLf ? "\r\n" : "\n";
}

// The start of the comment lines that stand directly above a line, or of the line itself.
std::size_t withCommentAbove(std::string_view text, std::size_t line) {
  while (line > 0) {
    const std::size_t above = line < 2 ? 0 : text.rfind('\n', line - 2) + 1;  // npos + 1 is 0
    const std::size_t from = above == 0 ? byteOrderMarkSize(text) : above;
    const std::size_t first = text.find_first_not_of(" \t", from);
    if (first >= line || text[first] != '#') break;
    line = from;
    if (above == 0) break;
  }
  return line;
}

// What of a text's outline belongs to a key, and where the key goes.
struct Place {
  std::vector<TomlStatement> own;  // in order
  std::size_t newLine;             // where a line for the key goes; not behind any of its own

  bool isOneValue() const {
    return own.size() == 1 && !own.front().isHeader && !own.front().isDotted;
  }
};

Place findPlace(std::string_view text, std::string_view key) {
  Place place;
  std::optional<std::string> section;  // the first key of the header above
  std::optional<std::size_t> firstOwn;
  std::optional<std::size_t> afterLastPair;
  std::optional<std::size_t> firstHeader;
  for (const TomlStatement& statement : outlineToml(text).statements) {
    std::string name = keyOf(statement.firstKey);
    if (statement.isHeader) {
      if (!firstHeader) firstHeader = statement.begin;
      section = std::move(name);
    } else if (!section) {
      afterLastPair = statement.end;
      if (name == key && !firstOwn) firstOwn = statement.begin;
    }
    if ((section ? *section : name) == key) place.own.push_back(statement);
  }
  if (firstOwn) {
    place.newLine = *firstOwn;
  } else if (afterLastPair) {
    place.newLine = *afterLastPair;
  } else {
    place.newLine = firstHeader ? withCommentAbove(text, *firstHeader) : text.size();
  }
  return place;
}

void insertLine(std::string& text, std::size_t at, std::string line, std::string_view lineEnd) {
  const bool isBehindOpenLine = at > byteOrderMarkSize(text) && text[at - 1] != '\n';
  if (isBehindOpenLine) {  // the last line: as before, the text ends without a line end
    line.insert(0, lineEnd);
  } else {
    line += lineEnd;
  }
  text.insert(at, line);
}

// `literal` is empty when the key is to go.
std::string edited(std::string text, std::string_view key, const std::string& literal) {
  const Place place = findPlace(text, key);
  if (!literal.empty() && place.isOneValue()) {
    const TomlStatement& old = place.own.front();
    return text.replace(old.valueBegin, old.valueEnd - old.valueBegin, literal);
  }
  const std::string lineEnd(lineEndOf(text));
  for (auto old = place.own.rbegin(); old != place.own.rend(); ++old)
    text.erase(old->begin, old->end - old->begin);
  if (!literal.empty()) insertLine(text, place.newLine, keyLiteral(key) + " = " + literal, lineEnd);
  return text;
}

// What a literal reads as.
std::optional<Value> readBack(const std::string& literal) {
  TomlProblem ignored;
  const auto values = parsed("x = " + literal, ignored);
  return values ? std::optional((*values)["x"]) : std::nullopt;
}

}  // namespace

std::optional<TomlText> TomlText::parse(std::string text, TomlProblem* problem) {
  TomlProblem found;
  auto values = parsed(text, found);
  if (values) return TomlText(std::move(text), std::move(*values));
  if (problem != nullptr) *problem = std::move(found);
  return std::nullopt;
}

std::optional<TomlText> TomlText::with(std::string_view key, const Value& value) const {
  if (!isUtf8(key)) return with(utf8FromLatin1(key), value);
  if (values_[key] == value) return *this;

  std::string literal;
  Dictionary wanted = values_;
  if (value.isNothing()) {
    wanted.remove(key);
  } else {
    if (!appendLiteral(literal, value, 0)) return std::nullopt;
    const auto read = readBack(literal);
    if (!read) return std::nullopt;
    if (values_[key] == *read) return *this;  // a float that was written before
    wanted.set(key, *read);
  }
  // Nobody's preferences are lost to a mistake of ours: what does not read as wanted is no result.
  auto result = parse(edited(text_, key, literal));
  return result && result->values_ == wanted ? std::move(result) : std::nullopt;
}

}  // namespace oxmv
