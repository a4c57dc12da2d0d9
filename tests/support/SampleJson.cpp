#include "tests/support/SampleJson.h"

#include <bit>
#include <charconv>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include <nlohmann/json.hpp>

#include "oxmv/values/Array.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

template <class Number, class... Base>
Number numberFrom(const std::string& digits, Base... base) {
  Number number{};
  const char* end = digits.data() + digits.size();
  const auto result = std::from_chars(digits.data(), end, number, base...);
  if (result.ec != std::errc() || result.ptr != end) throw std::runtime_error("number: " + digits);
  return number;
}

Bytes bytesFromHex(const std::string& digits) {
  Bytes bytes;
  for (std::size_t i = 0; i < digits.size(); i += 2)
    bytes.push_back(numberFrom<std::uint8_t>(digits.substr(i, 2), 16));
  return bytes;
}

float floatFromBits(const std::string& bits) {
  if (!bits.starts_with("0x")) throw std::runtime_error("float: " + bits);
  return std::bit_cast<float>(numberFrom<std::uint32_t>(bits.substr(2), 16));
}

// Builds the value from the parser's events, because they alone carry a number's own digits.
class Builder final : public nlohmann::json_sax<nlohmann::json> {
 public:
  Value result;

  bool null() override { return false; }
  bool boolean(bool) override { return false; }
  bool number_integer(number_integer_t number) override { return put(Value(number)); }
  bool number_unsigned(number_unsigned_t number) override {
    return put(Value(static_cast<std::int64_t>(number)));
  }
  bool number_float(number_float_t, const string_t& text) override {
    // With the decimal point of the process's locale in it.
    std::string digits = text;
    const auto point = digits.find_first_not_of("0123456789+-eE");
    if (point != digits.npos) digits[point] = '.';
    return put(Value(numberFrom<float>(digits)));
  }
  bool string(string_t& text) override {
    if (open_.empty() || open_.back().isArray) return put(Value(text));
    Open& object = open_.back();
    if (object.key == "$data") {
      object.special = Value::data(bytesFromHex(text));
      return true;
    }
    if (object.key == "$float") {
      object.special = Value(floatFromBits(text));
      return true;
    }
    return put(Value(text));
  }
  bool binary(binary_t&) override { return false; }
  bool start_object(std::size_t) override {
    open_.push_back({.isArray = false});
    return true;
  }
  bool key(string_t& text) override {
    open_.back().key = text;
    return true;
  }
  bool end_object() override {
    const Open object = std::exchange(open_.back(), {});
    open_.pop_back();
    return put(object.special.value_or(Value(object.members)));
  }
  bool start_array(std::size_t) override {
    open_.push_back({.isArray = true});
    return true;
  }
  bool end_array() override {
    const Open array = std::exchange(open_.back(), {});
    open_.pop_back();
    return put(Value(Array(array.elements)));
  }
  bool parse_error(std::size_t, const std::string&,
                   const nlohmann::detail::exception& error) override {
    throw std::runtime_error(error.what());
  }

 private:
  struct Open {
    bool isArray = false;
    std::string key = {};
    std::vector<Value> elements = {};
    Dictionary members = {};
    std::optional<Value> special = {};
  };

  bool put(const Value& value) {
    if (open_.empty()) {
      result = value;
    } else if (open_.back().isArray) {
      open_.back().elements.push_back(value);
    } else {
      const std::string& key = open_.back().key;
      open_.back().members.set(key.starts_with("$") ? key.substr(1) : key, value);
    }
    return true;
  }

  std::vector<Open> open_;
};

}  // namespace

Dictionary dictionaryFromJson(std::span<const std::uint8_t> text) {
  Builder builder;
  const bool isRead = nlohmann::json::sax_parse(text.begin(), text.end(), &builder);
  if (!isRead || builder.result.kind() != Value::Kind::dictionary)
    throw std::runtime_error("not a dictionary in JSON");
  return builder.result.dictionary();
}

}  // namespace oxmv::test
