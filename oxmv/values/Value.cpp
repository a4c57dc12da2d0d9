#include "oxmv/values/Value.h"

#include <algorithm>
#include <bit>
#include <limits>

#include "oxmv/values/Array.h"
#include "oxmv/values/Bytes32.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Numbers.h"
#include "oxmv/values/Text.h"

namespace oxmv {

using detail::Block;
using detail::Bytes32;
using detail::Form;
using detail::Slot;

namespace {

std::span<const std::uint8_t> asBytes(std::string_view text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

// How much of a text counts, and whether that is all ASCII: both in one pass, nearly every text in
// one step. Bytes behind the text are read, too; a block has enough of them.
struct Cut {
  std::uint32_t size;
  bool isAscii;
};

Cut cutAt(const std::uint8_t* text, std::uint32_t size, bool endsAtNul) {
  constexpr auto width = static_cast<std::uint32_t>(Bytes32::size);
  static_assert(Block::readAhead >= width);
  const std::uint32_t nulsCount = endsAtNul ? ~0u : 0u;
  std::uint32_t high = 0;
  for (std::uint32_t at = 0;; at += width) {
    const Bytes32 bytes = Bytes32::at(text + at);
    const std::uint32_t nuls = bytes.ends() & ~bytes.notAscii() & nulsCount;
    const std::uint32_t left = std::min(size - at, width);
    const auto taken =
        static_cast<std::uint32_t>(std::countr_zero(nuls | std::uint64_t{1} << left));
    high |= bytes.notAscii() & static_cast<std::uint32_t>((std::uint64_t{1} << taken) - 1);
    if (taken < width || size - at == width) return {at + taken, high == 0};
  }
}

}  // namespace

Value::Value(float number) noexcept
    : slot_(Slot::scalar(Form::float32, std::bit_cast<std::uint32_t>(number))) {}

Value::Value(double number) noexcept
    : slot_(Slot::scalar(Form::float64, 0)), content_{.float64 = number} {}

Value::Value(std::string_view text) : Value(wholeText(Form::wholeText, text)) {}

Value::Value(const Array& array) noexcept : Value(array.value_) {
  if (isNothing()) *this = Value(Slot::scalar(Form::arrayBox, 0), nullptr);
}

Value::Value(const Dictionary& dictionary) noexcept : Value(dictionary.value_) {
  if (isNothing()) *this = Value(Slot::scalar(Form::dictionaryBox, 0), nullptr);
}

Value Value::derivedText(std::string_view text) { return wholeText(Form::wholeDerivedText, text); }

Value Value::data(std::span<const std::uint8_t> bytes) { return whole(Form::wholeData, bytes); }

Value Value::whole(Form form, std::span<const std::uint8_t> bytes) {
  const Slot slot = Slot::scalar(form, 0);
  return bytes.empty() ? Value(slot, nullptr)
                       : Value(slot, Block::make(bytes, {}, {}, {}).detach());
}

Value Value::wholeText(Form form, std::string_view text) {
  return isUtf8(text) ? whole(form, asBytes(text)) : whole(form, asBytes(utf8FromLatin1(text)));
}

void Value::borrowText(const Block& block, Slot slot) {
  const Cut cut = cutAt(block.bytes(slot).data(), slot.size(), slot.form() == Form::textToNul);
  slot = Slot::place(Form::text, cut.size, slot.body);
  if (!cut.isAscii && !isUtf8(block.text(slot))) {
    *this = wholeText(Form::wholeText, block.text(slot));
    return;
  }
  release();
  slot_ = slot.lent();
  content_.owner = &block;
}

bool Value::isNumber() const noexcept {
  const Form form = slot_.form();
  return form == Form::integer || form == Form::float32 || form == Form::float64;
}

std::int32_t Value::intOfOther() const noexcept {
  switch (kind()) {
    case Kind::float32:
    case Kind::float64: return truncated<std::int32_t>(doubleValue());
    case Kind::text: {
      constexpr std::int64_t lowest = std::numeric_limits<std::int32_t>::min();
      return static_cast<std::int32_t>(std::clamp(leadingInteger(text()), lowest, -(lowest + 1)));
    }
    case Kind::integer:
    case Kind::nothing:
    case Kind::data:
    case Kind::array:
    case Kind::dictionary: break;
  }
  return 0;
}

std::int64_t Value::int64OfOther() const noexcept {
  switch (kind()) {
    case Kind::float32:
    case Kind::float64: return truncated<std::int64_t>(doubleValue());
    case Kind::text: return leadingInteger(text());
    case Kind::integer:
    case Kind::nothing:
    case Kind::data:
    case Kind::array:
    case Kind::dictionary: break;
  }
  return 0;
}

float Value::floatOfOther() const noexcept {
  switch (kind()) {
    case Kind::integer: return static_cast<float>(content_.integer);
    case Kind::float64: return static_cast<float>(content_.float64);
    case Kind::text: return leadingFloat(text());
    case Kind::float32:
    case Kind::nothing:
    case Kind::data:
    case Kind::array:
    case Kind::dictionary: break;
  }
  return 0;
}

double Value::doubleOfOther() const noexcept {
  switch (kind()) {
    case Kind::integer: return static_cast<double>(content_.integer);
    case Kind::float32: return static_cast<double>(std::bit_cast<float>(slot_.body));
    case Kind::text: return leadingDouble(text());
    case Kind::float64:
    case Kind::nothing:
    case Kind::data:
    case Kind::array:
    case Kind::dictionary: break;
  }
  return 0;
}

std::size_t Value::length() const noexcept { return utf16Length(text()); }

std::span<const std::uint8_t> Value::data() const& noexcept {
  return kind() == Kind::data ? payload() : std::span<const std::uint8_t>();
}

Array Value::array() const { return kind() == Kind::array ? Array(*this) : Array(); }

Dictionary Value::dictionary() const {
  return kind() == Kind::dictionary ? Dictionary(*this) : Dictionary();
}

// What is equal but for the elements and entries of two containers; those are put into `rest`, to
// be compared in their turn: values may be nested deeper than a stack is.
bool Value::equalOutside(const Value& a, const Value& b, Pairs& rest) {
  if (a.kind() != b.kind()) return false;
  switch (a.kind()) {
    case Kind::nothing: return true;
    case Kind::integer: return a.content_.integer == b.content_.integer;
    case Kind::float32: return a.slot_.body == b.slot_.body;
    case Kind::float64:
      return std::bit_cast<std::uint64_t>(a.content_.float64) ==
             std::bit_cast<std::uint64_t>(b.content_.float64);
    case Kind::text:
    case Kind::data: return std::ranges::equal(a.payload(), b.payload());
    case Kind::array:
    case Kind::dictionary: rest.emplace_back(a, b); return true;
  }
  return false;  // Not reached: every case is above.
}

bool Value::equalInside(const Array& a, const Array& b, Pairs& rest) {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i) {
    if (!equalOutside(a[i], b[i], rest)) return false;
  }
  return true;
}

bool Value::equalInside(const Dictionary& a, const Dictionary& b, Pairs& rest) {
  return a.size() == b.size() &&
         std::all_of(a.begin(), a.end(), [&](const Dictionary::Entry& entry) {
           return equalOutside(entry.value, b[entry.key], rest);
         });
}

bool operator==(const Value& a, const Value& b) {
  std::vector<std::pair<Value, Value>> rest;
  if (!Value::equalOutside(a, b, rest)) return false;
  while (!rest.empty()) {
    const auto [x, y] = std::move(rest.back());
    rest.pop_back();
    const bool isEqual = x.kind() == Value::Kind::array
                             ? Value::equalInside(x.array(), y.array(), rest)
                             : Value::equalInside(x.dictionary(), y.dictionary(), rest);
    if (!isEqual) return false;
  }
  return true;
}

}  // namespace oxmv
