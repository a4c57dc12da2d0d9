#include "cli/JsonWriter.h"

#include <string>

#include <fmt/format.h>

#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

// Nearly every character is one of these, and stands for itself.
bool isPlain(char c) { return c >= ' ' && c < 0x7F && c != '"' && c != '\\'; }

// A character's escape; empty for one that stands for itself.
std::string escapeOf(const Character& character) {
  if (character.isByte) return fmt::format("\\\\x{:02X}", static_cast<unsigned>(character.code));
  if (character.code == '"') return "\\\"";
  if (character.code == '\\') return "\\\\";
  // No hidden character is above U+FFFF, so none needs a surrogate pair.
  if (isHidden(character.code))
    return fmt::format("\\u{:04x}", static_cast<unsigned>(character.code));
  return {};
}

}  // namespace

void JsonWriter::key(std::string_view name) {
  separate();
  quoted(name);
  sink_.write(":");
  needsComma_ = false;
}

void JsonWriter::text(std::string_view text) {
  separate();
  quoted(text);
}

void JsonWriter::integer(std::int64_t number) { raw(fmt::format("{}", number)); }

void JsonWriter::raw(std::string_view number) {
  separate();
  sink_.write(number);
}

void JsonWriter::member(std::string_view name, const std::optional<std::string_view>& text) {
  key(name);
  if (text) return this->text(*text);
  null();
}

void JsonWriter::member(std::string_view name, std::size_t number) {
  key(name);
  raw(fmt::format("{}", number));
}

void JsonWriter::begin(std::string_view bracket) {
  separate();
  sink_.write(bracket);
  needsComma_ = false;
}

void JsonWriter::end(std::string_view bracket) {
  sink_.write(bracket);
  needsComma_ = true;
}

// A value is about to come: a comma if another came before it.
void JsonWriter::separate() {
  if (needsComma_) sink_.write(",");
  needsComma_ = true;
}

void JsonWriter::quoted(std::string_view text) {
  sink_.write("\"");
  std::size_t plain = 0;  // bytes at the start that stand for themselves
  while (plain < text.size()) {
    if (isPlain(text[plain])) {
      ++plain;
      continue;
    }
    const Character next = firstCharacter(text.substr(plain));
    const std::string escape = escapeOf(next);
    if (escape.empty()) {
      plain += next.size;
      continue;
    }
    sink_.write(text.substr(0, plain));
    sink_.write(escape);
    text.remove_prefix(plain + next.size);
    plain = 0;
  }
  sink_.write(text);
  sink_.write("\"");
}

}  // namespace oxmv::cli
