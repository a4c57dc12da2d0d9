#include "oxmv/store/PathTemplate.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstddef>
#include <optional>

#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

struct Conversion {
  std::size_t position = 0;  // counted from 1; 0: the next one
  bool isLeft = false;
  bool hasZeros = false;
  bool hasPlus = false;
  bool hasSpace = false;
  bool hasPrefix = false;
  int width = 0;
  char kind = '\0';
  std::size_t length = 0;  // in the template, from the percent sign on
};

// Reads a conversion from its start, one part after the other.
class ConversionReader {
 public:
  explicit ConversionReader(std::string_view text) : rest_(text), size_(text.size()) {}

  std::optional<Conversion> read() {
    rest_.remove_prefix(1);  // the percent sign
    readPosition();
    while (!rest_.empty() && setFlag(rest_.front())) rest_.remove_prefix(1);
    if (const auto width = readNumber()) conversion_.width = *width;
    if (conversion_.width > widestConversion) return std::nullopt;
    skipLength();
    if (rest_.empty() || std::string_view("@diuxX").find(rest_.front()) == std::string_view::npos)
      return std::nullopt;
    conversion_.kind = rest_.front();
    conversion_.length = size_ - rest_.size() + 1;
    return conversion_;
  }

 private:
  // A number that does not begin with a zero: that is a flag, and no position.
  std::optional<int> readNumber() {
    if (rest_.starts_with('0')) return std::nullopt;
    int number = 0;
    const auto [end, error] = std::from_chars(rest_.data(), rest_.data() + rest_.size(), number);
    if (error == std::errc::result_out_of_range) return widestConversion + 1;
    // from_chars reads a minus sign too, which is a flag here.
    if (error != std::errc() || rest_.starts_with('-')) return std::nullopt;
    rest_.remove_prefix(static_cast<std::size_t>(end - rest_.data()));
    return number;
  }

  void readPosition() {
    const std::string_view before = rest_;
    const auto number = readNumber();
    if (number && rest_.starts_with('$')) {
      conversion_.position = static_cast<std::size_t>(*number);
      rest_.remove_prefix(1);
    } else {
      rest_ = before;
    }
  }

  bool setFlag(char character) {
    switch (character) {
      case '-': return conversion_.isLeft = true;
      case '0': return conversion_.hasZeros = true;
      case '+': return conversion_.hasPlus = true;
      case ' ': return conversion_.hasSpace = true;
      case '#': return conversion_.hasPrefix = true;
      default: return false;
    }
  }

  void skipLength() {
    for (const std::string_view length : {"hh", "h", "ll", "l"}) {
      if (rest_.starts_with(length)) return rest_.remove_prefix(length.size());
    }
  }

  std::string_view rest_;
  std::size_t size_;
  Conversion conversion_;
};

std::string digitsOf(std::uint32_t number, char kind) {
  const bool isHexadecimal = kind == 'x' || kind == 'X';
  std::array<char, 10> buffer;  // 4294967295
  const auto end =
      std::to_chars(buffer.data(), buffer.data() + buffer.size(), number, isHexadecimal ? 16 : 10)
          .ptr;
  if (kind == 'X') {
    std::transform(buffer.data(), end, buffer.data(), [](char digit) {
      return digit < 'a' ? digit : static_cast<char>(digit - 'a' + 'A');
    });
  }
  return {buffer.data(), end};
}

// What stands before the digits: a sign, or "0x".
std::string_view prefixOf(const Conversion& conversion, std::uint32_t number) {
  if (conversion.kind == 'd' || conversion.kind == 'i') {
    if (static_cast<std::int32_t>(number) < 0) return "-";
    return conversion.hasPlus ? "+" : conversion.hasSpace ? " " : "";
  }
  if (!conversion.hasPrefix || number == 0 || conversion.kind == 'u') return "";
  return conversion.kind == 'x' ? "0x" : "0X";
}

std::string padded(const Conversion& conversion, std::string_view text) {
  const auto width = static_cast<std::size_t>(conversion.width);
  const std::string padding(width - std::min(width, utf16Length(text)), ' ');
  return conversion.isLeft ? std::string(text) + padding : padding + std::string(text);
}

std::string formatted(const Conversion& conversion, std::uint32_t number) {
  const std::string_view prefix = prefixOf(conversion, number);
  const std::uint32_t magnitude = prefix == "-" ? std::uint32_t{0} - number : number;
  std::string digits = digitsOf(magnitude, conversion.kind);
  if (conversion.hasZeros && !conversion.isLeft) {
    const auto width = static_cast<std::size_t>(conversion.width);
    const std::size_t size = prefix.size() + digits.size();
    digits.insert(0, width - std::min(width, size), '0');
  }
  return padded(conversion, std::string(prefix) + digits);
}

// Nothing when the argument is not of the kind that is asked for.
std::optional<std::string> formatted(const Conversion& conversion, const PathArgument& argument) {
  if (const auto* text = std::get_if<std::string_view>(&argument)) {
    if (conversion.kind != '@') return std::nullopt;
    return padded(conversion, *text);
  }
  if (conversion.kind == '@') return std::nullopt;
  return formatted(conversion, std::get<std::uint32_t>(argument));
}

}  // namespace

std::string formatPath(std::string_view pathTemplate, std::span<const PathArgument> arguments) {
  std::string path;
  std::size_t next = 0;
  while (!pathTemplate.empty()) {
    const std::size_t plain = std::min(pathTemplate.find('%'), pathTemplate.size());
    path += pathTemplate.substr(0, plain);
    pathTemplate.remove_prefix(plain);
    if (pathTemplate.empty()) break;
    if (pathTemplate.starts_with("%%")) {
      path += '%';
      pathTemplate.remove_prefix(2);
      continue;
    }
    const auto conversion = ConversionReader(pathTemplate).read();
    const bool isNext = conversion && conversion->position == 0;
    const std::size_t index = !conversion || isNext ? next : conversion->position - 1;
    const auto text = conversion && index < arguments.size()
                          ? formatted(*conversion, arguments[index])
                          : std::nullopt;
    // A percent sign that begins no conversion stands for itself, and so does what follows it.
    path += text.value_or("%");
    pathTemplate.remove_prefix(text ? conversion->length : 1);
    if (text && isNext) ++next;
  }
  return path;
}

}  // namespace oxmv
