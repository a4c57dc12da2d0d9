#include <algorithm>
#include <bit>
#include <charconv>
#include <cstdint>
#include <iterator>
#include <limits>
#include <optional>
#include <utility>
#include <vector>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include "cli/TagJson.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view dataName = "$data";
constexpr std::string_view floatName = "$float";

// Goes through a text and tells how far it came: the parser itself says where it stands only when
// it meets an error of its own.
class TracedIterator {
 public:
  using iterator_category = std::forward_iterator_tag;
  using value_type = char;
  using difference_type = std::ptrdiff_t;
  using pointer = const char*;
  using reference = const char&;

  TracedIterator() = default;
  TracedIterator(const char* at, const char** reached) : at_(at), reached_(reached) {}
  reference operator*() const { return *at_; }
  TracedIterator& operator++() {
    *reached_ = ++at_;
    return *this;
  }
  TracedIterator operator++(int) {
    TracedIterator old = *this;
    ++*this;
    return old;
  }
  bool operator==(const TracedIterator& other) const { return at_ == other.at_; }

 private:
  const char* at_ = nullptr;
  const char** reached_ = nullptr;
};

std::optional<std::uint8_t> digitOf(char c) {
  std::uint8_t digit = 0;
  const auto result = std::from_chars(&c, &c + 1, digit, 16);
  return result.ec == std::errc() ? std::optional(digit) : std::nullopt;
}

std::optional<Value> dataFrom(std::string_view digits) {
  if (digits.size() % 2 != 0) return std::nullopt;
  std::vector<std::uint8_t> bytes;
  bytes.reserve(digits.size() / 2);
  for (std::size_t i = 0; i < digits.size(); i += 2) {
    const auto high = digitOf(digits[i]);
    const auto low = digitOf(digits[i + 1]);
    if (!high || !low) return std::nullopt;
    bytes.push_back(static_cast<std::uint8_t>(*high << 4 | *low));
  }
  return Value::data(bytes);
}

std::optional<Value> floatFromBits(std::string_view text) {
  if (text.size() != 10 || !text.starts_with("0x")) return std::nullopt;
  std::uint32_t bits = 0;
  const char* end = text.data() + text.size();
  const auto result = std::from_chars(text.data() + 2, end, bits, 16);
  if (result.ec != std::errc() || result.ptr != end) return std::nullopt;
  return Value(std::bit_cast<float>(bits));
}

// Whether a decimal number, other than zero, lies between -1 and 1.
bool isBelowOne(std::string_view number) {
  const std::size_t e = std::min(number.find_first_of("eE"), number.size());
  const std::size_t point = std::min(number.find('.'), e);
  const std::size_t first = number.find_first_of("123456789");
  // The number is 0.d... times ten to the power of places and exponent.
  const std::int64_t places =
      static_cast<std::int64_t>(point) - static_cast<std::int64_t>(first) + (first > point ? 1 : 0);
  std::int64_t exponent = 0;
  if (e < number.size()) {
    const char* digits = number.data() + e + 1;
    if (*digits == '+') ++digits;
    const char* end = number.data() + number.size();
    if (std::from_chars(digits, end, exponent).ec != std::errc()) return *digits == '-';
  }
  return exponent <= -places;
}

// What the parser found, without its own wrapping and without the text that it read.
std::string sentenceOf(std::string_view message) {
  if (const std::size_t dash = message.find(" - "); dash != std::string_view::npos)
    message.remove_prefix(dash + 3);
  const std::size_t read = message.find("; last read: ");
  if (read == std::string_view::npos) return visible(message);
  const std::size_t expectation = message.rfind("; expected ");
  const bool isThere = expectation != std::string_view::npos && expectation > read;
  return visible(fmt::format("{}{}", message.substr(0, read),
                             isThere ? message.substr(expectation) : std::string_view()));
}

// Builds the dictionary from what the parser meets.
class Builder final : public nlohmann::json_sax<nlohmann::json> {
 public:
  explicit Builder(std::string_view text) : text_(text), reached_(text.data()) {}

  std::variant<Dictionary, JsonError> build() {
    if (!parse()) return std::move(error_);
    return std::move(result_);
  }

  // The text is a value only: of that member of an object that stays unwritten.
  std::variant<Value, JsonError> buildMember(std::string_view name) {
    frames_.push_back({false, 1, std::string(name)});
    isMember_ = true;
    if (!parse()) return std::move(error_);
    return frames_.front().dictionary[name];
  }

  bool null() override { return failLiteral("null"); }
  bool boolean(bool truth) override { return failLiteral(truth ? "true" : "false"); }
  bool number_integer(std::int64_t number) override { return add(Value(number), startOfNumber()); }
  bool number_unsigned(std::uint64_t number) override {
    if (number > std::numeric_limits<std::int64_t>::max()) return failInteger(startOfNumber());
    return add(Value(static_cast<std::int64_t>(number)), startOfNumber());
  }
  bool number_float(double /*approximation*/, const std::string& text) override {
    // The parser has put the decimal point of the process's locale in place of the one in the text.
    std::string digits = text;
    const std::size_t point = digits.find_first_not_of("0123456789+-eE");
    if (point != digits.npos) digits[point] = '.';
    return addFloat(digits, startOfNumber());
  }
  bool string(std::string& text) override {
    if (isSpecial()) return finishSpecial(text);
    return add(Value(text), startOfString());
  }
  bool binary(nlohmann::json::binary_t&) override { return false; }  // JSON has no such thing

  bool start_object(std::size_t) override { return begin(false); }
  bool key(std::string& name) override;
  bool end_object() override;
  bool start_array(std::size_t) override { return begin(true); }
  bool end_array() override {
    Array array(std::move(frames_.back().elements));
    frames_.pop_back();
    return add(array, reached_);
  }

  bool parse_error(std::size_t position, const std::string& token,
                   const nlohmann::json::exception& exception) override;

 private:
  enum class Special { none, data, float32 };
  // An object or array that has begun and not ended.
  struct Frame {
    bool isArray;
    int level;
    std::string key = {};  // of the member that comes next
    Dictionary dictionary = {};
    std::vector<Value> elements = {};
    Special special = Special::none;
    Value specialValue = {};
  };

  bool parse() {
    const TracedIterator begin(text_.data(), &reached_);
    const TracedIterator end(text_.data() + text_.size(), &reached_);
    return nlohmann::json::sax_parse(begin, end, this);
  }

  bool isSpecial() const { return !frames_.empty() && frames_.back().special != Special::none; }

  bool begin(bool isArray);
  bool add(const Value& value, const char* start);
  bool addFloat(const std::string& digits, const char* start);
  bool beginSpecial(const std::string& name);
  bool finishSpecial(const std::string& text);

  bool fail(std::string_view code, std::string message, const char* at);
  bool failLiteral(std::string_view word) {
    return fail("json-literal", fmt::format("{} has no place in a dictionary", word),
                reached_ - word.size());
  }
  bool failInteger(const char* start) {
    return fail("json-integer-range", "the integer does not fit 64 bits", start);
  }

  const char* startOfOffence(std::size_t position, std::string_view sentence) const;
  const char* startOfString() const;
  const char* startOfNumber() const;

  const std::string_view text_;
  const char* reached_;  // behind the last character that the parser has taken
  std::vector<Frame> frames_;
  Dictionary result_;
  bool isComplete_ = false;
  bool isMember_ = false;
  JsonError error_{};
};

bool Builder::begin(bool isArray) {
  const char* start = reached_ - 1;
  if (frames_.empty()) {
    if (isArray) return add({}, start);
    frames_.push_back({false, 1});
    return true;
  }
  if (isSpecial()) return add({}, start);
  const Frame& outer = frames_.back();
  // A stream on the last level may still hold a group.
  const bool isGroup = !outer.isArray && !isArray && (outer.key == "TAG " || outer.key == "REG ");
  const int level = outer.level + (isArray && !outer.isArray ? 0 : 1);
  if (level > maxNesting + (isGroup ? 1 : 0))
    return fail("json-depth", fmt::format("nested deeper than {} levels", maxNesting), start);
  frames_.push_back({isArray, level});
  return true;
}

// A value has come to its end.
bool Builder::add(const Value& value, const char* start) {
  if (frames_.empty()) return fail("json-not-object", "tags are an object: {...}", start);
  Frame& frame = frames_.back();
  if (isSpecial()) return fail("json-dollar", "a text has to follow, of hexadecimal digits", start);
  if (frame.isArray) {
    frame.elements.push_back(value);
  } else {
    frame.dictionary.set(frame.key, value);
    if (isMember_ && frames_.size() == 1) isComplete_ = true;
  }
  return true;
}

// Straight from the digits: by way of a double a few numbers would be rounded twice.
bool Builder::addFloat(const std::string& digits, const char* start) {
  // The parser also gives integers here when 64 bits do not hold them.
  if (digits.find_first_of(".eE") == std::string::npos) return failInteger(start);
  float number = 0;
  const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (result.ec == std::errc()) return add(Value(number), start);
  // The nearest float to what is too small for any is a zero; nothing is near what is too large.
  if (isBelowOne(digits)) return add(Value(digits.starts_with('-') ? -0.0f : 0.0f), start);
  return fail("json-float-range", "the number does not fit a float", start);
}

bool Builder::key(std::string& name) {
  Frame& frame = frames_.back();
  if (isSpecial())
    return fail("json-dollar", "$data and $float stand alone in their object", startOfString());
  if (name.starts_with('$') && !name.starts_with("$$")) return beginSpecial(name);
  frame.key = name.starts_with('$') ? name.substr(1) : name;
  if (frame.dictionary.contains(frame.key))
    return fail("json-duplicate", fmt::format("member \"{}\" stands twice", visible(name)),
                startOfString());
  return true;
}

bool Builder::end_object() {
  const Frame frame = std::move(frames_.back());
  frames_.pop_back();
  if (!frame.specialValue.isNothing()) return add(frame.specialValue, reached_);
  if (!frames_.empty()) return add(frame.dictionary, reached_);
  result_ = frame.dictionary;
  isComplete_ = true;
  return true;
}

bool Builder::beginSpecial(const std::string& name) {
  Frame& frame = frames_.back();
  if (name != dataName && name != floatName)
    return fail("json-dollar",
                fmt::format("\"{}\" means nothing; a name that begins with $ is written with $$",
                            visible(name)),
                startOfString());
  if (!frame.dictionary.empty() || frames_.size() == 1)
    return fail("json-dollar", fmt::format("{} stands alone in an object of its own", name),
                startOfString());
  frame.special = name == dataName ? Special::data : Special::float32;
  return true;
}

bool Builder::finishSpecial(const std::string& text) {
  Frame& frame = frames_.back();
  const bool isData = frame.special == Special::data;
  const auto value = isData ? dataFrom(text) : floatFromBits(text);
  if (!value)
    return fail("json-dollar",
                isData ? "$data takes hexadecimal digits, two for each byte"
                       : "$float takes the 32 bits, such as \"0x7fc00000\"",
                startOfString());
  frame.specialValue = *value;
  return true;
}

bool Builder::parse_error(std::size_t position, const std::string& token,
                          const nlohmann::json::exception& exception) {
  constexpr int overflow = 406;
  if (exception.id == overflow) return addFloat(token, startOfNumber());
  const std::string sentence = sentenceOf(exception.what());
  const char* at = startOfOffence(position, sentence);
  const std::string_view rest = text_.substr(static_cast<std::size_t>(at - text_.data()));
  if (sentence.find("UTF-8") != std::string::npos || (!rest.empty() && firstCharacter(rest).isByte))
    return fail("json-utf8", "the text is not UTF-8", at);
  if (isComplete_)
    return fail("json-trailing-text",
                isMember_ ? "more text behind the value" : "more text behind the tags", at);
  return fail("json-syntax", sentence, at);
}

// Of a whole token in the wrong place its start; within a token the character that does not fit.
const char* Builder::startOfOffence(std::size_t position, std::string_view sentence) const {
  if (position > text_.size()) return text_.data() + text_.size();  // the end came too early
  const auto isUnexpected = [&](std::string_view token) {
    return sentence.starts_with(fmt::format("unexpected {}", token));
  };
  if (isUnexpected("string")) return startOfString();
  if (isUnexpected("number")) return startOfNumber();
  if (isUnexpected("true") || isUnexpected("null")) return reached_ - 4;
  if (isUnexpected("false")) return reached_ - 5;
  return text_.data() + std::max<std::size_t>(position, 1) - 1;
}

bool Builder::fail(std::string_view code, std::string message, const char* at) {
  const std::string_view before = text_.substr(0, static_cast<std::size_t>(at - text_.data()));
  const auto lines = std::count(before.begin(), before.end(), '\n');
  const std::size_t lineStart = before.rfind('\n') + 1;  // npos + 1 is 0: the first line
  error_ = {code, std::move(message), static_cast<std::size_t>(lines) + 1,
            columns(before.substr(lineStart)) + 1};
  return false;
}

// Of the text that has just ended: the nearest quote before its last one that no backslash takes.
const char* Builder::startOfString() const {
  const char* quote = reached_ - 1;
  for (;;) {
    do --quote;
    while (*quote != '"');
    const char* backslash = quote;
    while (backslash > text_.data() && backslash[-1] == '\\') --backslash;
    if ((quote - backslash) % 2 == 0) return quote;
  }
}

// Of the number that has just ended. The parser has taken the character behind it too, if there is
// one.
const char* Builder::startOfNumber() const {
  const auto isPart = [](char c) {
    return (c >= '0' && c <= '9') || c == '+' || c == '-' || c == '.' || c == 'e' || c == 'E';
  };
  const char* start = reached_;
  if (!isPart(start[-1])) --start;
  while (start > text_.data() && isPart(start[-1])) --start;
  return start;
}

}  // namespace

std::variant<Dictionary, JsonError> readTagJson(std::string_view text) {
  return Builder(text).build();
}

std::variant<Value, JsonError> readTagJsonValue(std::string_view name, std::string_view text) {
  return Builder(text).buildMember(name);
}

}  // namespace oxmv::cli
