#include "tests/support/Printing.h"

#include <iomanip>
#include <limits>
#include <sstream>
#include <string>
#include <string_view>

namespace oxmv {
namespace {

// Deeper than any test looks, and not deep enough to exhaust the stack.
constexpr int printedLevels = 100;

// Long payloads would bury what matters.
constexpr std::size_t printedBytes = 300;

void print(std::ostream& out, const Value& value, int level);

void printHex(std::ostream& out, std::uint8_t byte) {
  out << "0123456789abcdef"[byte / 16] << "0123456789abcdef"[byte % 16];
}

void printText(std::ostream& out, std::string_view text) {
  out << '"';
  for (const char c : text.substr(0, printedBytes)) {
    if (c == '"' || c == '\\') {
      out << '\\' << c;
    } else if (c >= 0x20 && c < 0x7F) {
      out << c;
    } else {
      out << "\\x";
      printHex(out, static_cast<std::uint8_t>(c));
    }
  }
  out << '"';
  if (text.size() > printedBytes) out << " of " << text.size() << " bytes";
}

void printData(std::ostream& out, std::span<const std::uint8_t> data) {
  out << '<';
  for (const std::uint8_t byte : data.first(std::min(data.size(), printedBytes)))
    printHex(out, byte);
  out << '>';
  if (data.size() > printedBytes) out << " of " << data.size() << " bytes";
}

void print(std::ostream& out, const Array& array, int level) {
  out << '[';
  std::size_t index = 0;
  for (const Value& element : array) {
    if (index++ != 0) out << ", ";
    if (index > printedBytes) {
      out << "... of " << array.size();
      break;
    }
    print(out, element, level);
  }
  out << ']';
}

void print(std::ostream& out, const Dictionary& dictionary, int level) {
  if (level > printedLevels) {
    out << "{...}";
    return;
  }
  out << '{';
  std::size_t index = 0;
  for (const auto& [key, value] : dictionary) {
    if (index++ != 0) out << ", ";
    if (index > printedBytes) {
      out << "... of " << dictionary.size();
      break;
    }
    printText(out, key);
    out << ": ";
    print(out, value, level + 1);
  }
  out << '}';
}

template <class Float>
std::string shortest(Float number) {
  std::ostringstream text;
  text << std::setprecision(std::numeric_limits<Float>::max_digits10) << number;
  return text.str();
}

void print(std::ostream& out, const Value& value, int level) {
  switch (value.kind()) {
    case Value::Kind::nothing: out << "nothing"; return;
    case Value::Kind::integer: out << value.int64Value(); return;
    case Value::Kind::float32: out << shortest(value.floatValue()) << 'f'; return;
    case Value::Kind::float64: out << shortest(value.doubleValue()) << " (double)"; return;
    case Value::Kind::text:
      printText(out, value.text());
      if (value.isDerivedText()) out << " (derived)";
      return;
    case Value::Kind::data: printData(out, value.data()); return;
    case Value::Kind::array: print(out, value.array(), level + 1); return;
    case Value::Kind::dictionary: print(out, value.dictionary(), level); return;
  }
}

}  // namespace

void PrintTo(const Value& value, std::ostream* out) { print(*out, value, 0); }

void PrintTo(const Array& array, std::ostream* out) { print(*out, array, 0); }

void PrintTo(const Dictionary& dictionary, std::ostream* out) { print(*out, dictionary, 0); }

void PrintTo(const myGUID& guid, std::ostream* out) {
  *out << std::hex << guid.Data1 << ' ' << guid.Data2 << ' ' << guid.Data3 << ' ' << std::dec;
  for (const std::uint8_t byte : guid.Data4) printHex(*out, byte);
}

void PrintTo(SkipReason reason, std::ostream* out) { *out << codeOf(reason); }

}  // namespace oxmv
