#include "cli/TagJson.h"

#include <array>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <span>

#include <fmt/format.h>

#include "cli/Sink.h"
#include "oxmv/values/Array.h"

namespace oxmv::cli {
namespace {

template <class Float>
std::string shortestDigits(Float number) {
  std::array<char, 64> digits{};
  const auto result = std::to_chars(digits.data(), digits.data() + digits.size(), number);
  std::string text(digits.data(), result.ptr);
  if (text.find_first_of(".e") == std::string::npos) text += ".0";
  return text;
}

void writeFloat(JsonWriter& json, float number) {
  if (std::isfinite(number)) return json.raw(digitsOf(number));
  json.beginObject();
  json.member("$float", fmt::format("0x{:08x}", std::bit_cast<std::uint32_t>(number)));
  json.endObject();
}

void writeData(JsonWriter& json, std::span<const std::uint8_t> bytes) {
  json.beginObject();
  json.member("$data", fmt::format("{:02x}", fmt::join(bytes, "")));
  json.endObject();
}

void writeArray(JsonWriter& json, const Array& array) {
  json.beginArray();
  for (const Value& element : array) writeTagJson(json, element);
  json.endArray();
}

void writeDictionary(JsonWriter& json, const Dictionary& dictionary) {
  json.beginObject();
  for (const auto& [key, value] : dictionary) {
    json.key(key.starts_with('$') ? fmt::format("${}", key) : std::string(key));
    writeTagJson(json, value);
  }
  json.endObject();
}

}  // namespace

void writeTagJson(JsonWriter& json, const Value& value) {
  switch (value.kind()) {
    case Value::Kind::nothing: return json.null();
    case Value::Kind::integer: return json.integer(value.int64Value());
    case Value::Kind::float32: return writeFloat(json, value.floatValue());
    case Value::Kind::float64:
      if (!std::isfinite(value.doubleValue())) return writeFloat(json, value.floatValue());
      return json.raw(digitsOf(value.doubleValue()));
    case Value::Kind::text: return json.text(value.text());
    case Value::Kind::data: return writeData(json, value.data());
    case Value::Kind::array: return writeArray(json, value.array());
    case Value::Kind::dictionary: return writeDictionary(json, value.dictionary());
  }
}

std::string tagJsonOf(const Value& value) {
  StringSink sink;
  JsonWriter json(sink);
  writeTagJson(json, value);
  return sink.text;
}

std::string digitsOf(float number) { return shortestDigits(number); }

std::string digitsOf(double number) { return shortestDigits(number); }

}  // namespace oxmv::cli
