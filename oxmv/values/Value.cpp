#include "oxmv/values/Value.h"

#include <algorithm>
#include <bit>
#include <limits>
#include <set>
#include <utility>
#include <vector>

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

// How much of a text counts, and whether that is all ASCII: both in one pass. Bytes behind the text
// are read, too; a block has enough of them.
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
    const std::uint32_t nuls = bytes.nuls() & nulsCount;
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

// Nearly every text is short and ASCII, and there one step finds where it ends.
void Value::borrowText(const Block& block, Slot slot) {
  const std::uint32_t size = slot.size();
  if (size < Bytes32::size && !hasShare()) {
    const Bytes32 bytes = Bytes32::at(block.bytes(slot).data());
    const std::uint32_t nulsCount = slot.form() == Form::textToNul ? ~0u : 0u;
    const int taken = std::countr_zero((bytes.nuls() & nulsCount) | 1u << size);
    if ((bytes.notAscii() & ((1u << taken) - 1)) == 0) {
      slot = Slot::place(Form::text, static_cast<std::uint32_t>(taken), slot.body());
      return becomeLent(block, slot);
    }
  }
  borrowOddText(block, slot);
}

void Value::borrowOddText(const Block& block, Slot slot) {
  const Cut cut = cutAt(block.bytes(slot).data(), slot.size(), slot.form() == Form::textToNul);
  slot = Slot::place(Form::text, cut.size, slot.body());
  if (cut.isAscii || isUtf8(block.text(slot))) return lend(block, slot);
  *this = wholeText(Form::wholeText, block.text(slot));
}

bool Value::isNumber() const noexcept {
  // The bits of the forms say what the enumeration of kinds says.
  static_assert(kindOf(Form::integer64) == Kind::integer &&
                kindOf(Form::float32) == Kind::float32 && kindOf(Form::float64) == Kind::float64 &&
                kindOf(Form::wholeDerivedText) == Kind::text &&
                kindOf(Form::wholeData) == Kind::data && kindOf(Form::arrayBox) == Kind::array &&
                kindOf(Form::dictionaryBox) == Kind::dictionary);
  const Kind kind = this->kind();
  return kind == Kind::integer || kind == Kind::float32 || kind == Kind::float64;
}

std::int32_t Value::intOfOther() const noexcept {
  switch (kind()) {
    case Kind::float32:
    case Kind::float64: return truncated<std::int32_t>(doubleValue());
    case Kind::integer: return static_cast<std::int32_t>(content_.integer);
    case Kind::text: {
      constexpr std::int64_t lowest = std::numeric_limits<std::int32_t>::min();
      return static_cast<std::int32_t>(std::clamp(leadingInteger(text()), lowest, -(lowest + 1)));
    }
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
    case Kind::integer: return content_.integer;
    case Kind::nothing:
    case Kind::data:
    case Kind::array:
    case Kind::dictionary: break;
  }
  return 0;
}

float Value::floatOfOther() const noexcept {
  switch (kind()) {
    case Kind::integer: return static_cast<float>(int64Value());
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
    case Kind::integer: return static_cast<double>(int64Value());
    case Kind::float32: return static_cast<double>(std::bit_cast<float>(slot_.body()));
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

// One comparison. Values may be nested deeper than a stack is, and the same one may stand in many
// places: containers wait for their turn, and none waits twice for the same other one.
class Value::Comparison {
 public:
  bool areEqual(const Value& a, const Value& b) {
    if (!areEqualOutside(a, b)) return false;
    while (!rest_.empty()) {
      const auto [x, y] = std::move(rest_.back());
      rest_.pop_back();
      const bool isEqual = x.kind() == Kind::array ? areEqualInside(x.array(), y.array())
                                                   : areEqualInside(x.dictionary(), y.dictionary());
      if (!isEqual) return false;
    }
    return true;
  }

 private:
  // Whether they are equal but for what stands in two containers.
  bool areEqualOutside(const Value& a, const Value& b) {
    if (a.kind() != b.kind()) return false;
    switch (a.kind()) {
      case Kind::nothing: return true;
      case Kind::integer: return a.int64Value() == b.int64Value();
      case Kind::float32: return a.slot_.body() == b.slot_.body();
      case Kind::float64:
        return std::bit_cast<std::uint64_t>(a.content_.float64) ==
               std::bit_cast<std::uint64_t>(b.content_.float64);
      case Kind::text:
      case Kind::data: return std::ranges::equal(a.payload(), b.payload());
      case Kind::array:
      case Kind::dictionary: queue(a, b); return true;
    }
    return false;  // Not reached: every case is above.
  }

  bool areEqualInside(const Array& a, const Array& b) {
    if (a.size() != b.size()) return false;
    auto other = b.begin();
    for (const Value& element : a) {
      if (!areEqualOutside(element, *other)) return false;
      ++other;
    }
    return true;
  }

  bool areEqualInside(const Dictionary& a, const Dictionary& b) {
    if (a.size() != b.size()) return false;
    Value other;
    for (const auto& [key, value] : a) {
      if (!b.lend(other, key) || !areEqualOutside(value, other)) return false;
    }
    return true;
  }

  void queue(const Value& a, const Value& b) {
    const bool isSame = a.slot_.kept() == b.slot_.kept() && a.owner() == b.owner();
    if (isSame || isQueued(a, b)) return;
    rest_.emplace_back(a, b);
  }

  // Whether these two have been queued before. That is remembered only where they may come again:
  // what nobody else has stands in one place, and so does what stands in a block.
  bool isQueued(const Value& a, const Value& b) {
    if (!isBox(a) || !isBox(b)) return false;
    if (a.owner()->isUnique() && b.owner()->isUnique()) return false;
    return !queued_.emplace(a.owner(), b.owner()).second;
  }
  static bool isBox(const Value& value) {
    const Form form = value.slot_.form();
    return (form == Form::arrayBox || form == Form::dictionaryBox) && value.owner() != nullptr;
  }

  std::vector<std::pair<Value, Value>> rest_;
  std::set<std::pair<const detail::Shared*, const detail::Shared*>> queued_;
};

bool operator==(const Value& a, const Value& b) { return Value::Comparison().areEqual(a, b); }

}  // namespace oxmv
