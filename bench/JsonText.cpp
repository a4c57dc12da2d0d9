#include "JsonText.h"

#include <array>
#include <charconv>
#include <string_view>

#include "oxmv/values/Array.h"

namespace bench {
namespace {

using oxmv::Dictionary;
using oxmv::Value;

std::string floatText(float number) {
  std::array<char, 32> digits{};
  const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
  std::string text(digits.data(), end);
  if (text.find_first_of(".e") == std::string::npos) text += ".0";
  return text;
}

// The texts of the corpora are letters and spaces: nothing in them needs an escape.
void addText(std::string& json, std::string_view text) {
  json += '"';
  json += text;
  json += '"';
}

void add(std::string& json, const Dictionary& content);

void add(std::string& json, const Value& value) {
  switch (value.kind()) {
    case Value::Kind::float32: json += floatText(value.floatValue()); return;
    case Value::Kind::text: return addText(json, value.text());
    case Value::Kind::dictionary: return add(json, value.dictionary());
    case Value::Kind::array: {
      char before = '[';
      for (const Value& element : value.elements()) {
        json += before;
        before = ',';
        add(json, element);
      }
      json += ']';
      return;
    }
    default: json += std::to_string(value.int64Value()); return;
  }
}

void add(std::string& json, const Dictionary& content) {
  char before = '{';
  for (const auto& [key, value] : content) {
    json += before;
    before = ',';
    addText(json, key);
    json += ':';
    add(json, value);
  }
  json += '}';
}

}  // namespace

std::string jsonTextOf(const Dictionary& content) {
  std::string json;
  add(json, content);
  return json;
}

}  // namespace bench
