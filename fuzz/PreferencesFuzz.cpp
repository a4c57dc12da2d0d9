// Any bytes as the text of a preferences file: read, then edited key by key. What must hold for all
// of them that are TOML:
//
// - every key can be set and removed, and a key that is not there can be added;
// - after that, exactly that key says something else;
// - a line that was added and removed again leaves the text byte for byte as it was, but for the
//   line end that it may have put behind the last line.

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "fuzz/Require.h"
#include "oxmv/platform/TomlText.h"

namespace {

using namespace oxmv;
using fuzz::require;

TomlText changed(const TomlText& text, std::string_view key, const Value& value) {
  const std::optional<TomlText> result = text.with(key, value);
  require(result.has_value());
  require(result->values()[key] == value);

  Dictionary before = text.values();
  Dictionary after = result->values();
  before.remove(key);
  after.remove(key);
  require(after == before);

  const std::optional<TomlText> again = TomlText::parse(result->text());
  require(again && again->values() == result->values());
  return *result;
}

std::string keyNotIn(const Dictionary& values) {
  std::string key = "new key";
  while (values.contains(key)) key += '\'';
  return key;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto text = TomlText::parse(std::string(data, data + size));
  if (!text) return 0;

  const std::string key = keyNotIn(text->values());
  const TomlText longer = changed(*text, key, "a \"value\"\n");
  const std::string again = changed(longer, key, {}).text();
  require(again == text->text() || again == text->text() + "\n" || again == text->text() + "\r\n");

  int most = 8;  // keys, for speed
  for (const auto& [present, value] : text->values()) {
    if (most-- == 0) break;
    changed(*text, present, "x");
    changed(*text, present, {});
  }
  return 0;
}
