// One value of a clip's metadata.

#pragma once

#include <array>
#include <bit>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "oxmv/values/Block.h"

namespace oxmv {

class Array;
class Dictionary;
class Elements;
class Entries;

// A value is nothing, an integer (64 bits), a float (binary32), a double, a text (UTF-8), data
// (bytes), an array of values or a dictionary. It never changes once made; copies share the
// payload, so copying one is cheap and needs no memory. A value taken out of a decoded stream keeps
// that stream's block alive.
//
// The accessors answer for every kind and never fail: see each. Those that hand out views do so
// only for a value that has a name; asked of a temporary, they hand out a copy. Keep that copy as
// what it is: a std::string_view or std::span made of it would outlive it.
//
//   const auto reel = tags["REEL"].text();        // a std::string
//   const Value value = tags["REEL"];             // or keep the value,
//   const std::string_view view = value.text();   // and a view of it
//
// Different threads may use different values freely, also where they share a payload.
class Value {
 public:
  enum class Kind : std::uint8_t {
    nothing,
    integer,
    float32,
    float64,
    text,
    data,
    array,
    dictionary
  };

  // Nothing: what a look-up answers for a key that is not there. No dictionary holds it.
  Value() noexcept = default;

  template <std::integral T>
  requires(!std::same_as<T, bool> && !std::same_as<T, char> &&
           (std::is_signed_v<T> || sizeof(T) < sizeof(std::int64_t))) Value(T number)
  noexcept : Value(IntegerTag{}, static_cast<std::int64_t>(number)) {}
  Value(bool) = delete;  // has no place in a dictionary
  Value(float number) noexcept;
  Value(double number) noexcept;

  // Text that is not valid UTF-8 is taken as ISO-8859-1.
  Value(std::string_view text);
  Value(const std::string& text) : Value(std::string_view(text)) {}
  Value(std::nullptr_t) = delete;
  Value(const char* text) : Value(std::string_view(text)) {}
  // Text of a derived string kind. It differs from other text in one place: as a value in the "REG
  // " group the encoder takes it for a number.
  static Value derivedText(std::string_view text);

  static Value data(std::span<const std::uint8_t> bytes);

  Value(const Array& array) noexcept;
  Value(const Dictionary& dictionary) noexcept;

  Value(const Value& other) noexcept : slot_(other.slot_.kept()), content_(other.content_) {
    retain();
  }
  Value(Value&& other) noexcept : slot_(other.slot_.kept()), content_(other.content_) {
    if (other.slot_.isLent()) {
      retain();
    } else {
      other.slot_ = {};
    }
  }
  Value& operator=(Value other) noexcept {
    std::swap(slot_, other.slot_);
    std::swap(content_, other.content_);
    return *this;
  }
  ~Value() { release(); }

  Kind kind() const noexcept { return kindOf(slot_.form()); }
  bool isNothing() const noexcept { return slot_.form() == detail::Form::nothing; }
  bool isNumber() const noexcept;  // an integer, a float or a double
  bool isText() const noexcept { return kind() == Kind::text; }
  bool isDerivedText() const noexcept { return slot_.form() == detail::Form::wholeDerivedText; }

  // Numbers. Integers give their low bits; floats and doubles are truncated toward zero and
  // saturate (not a number gives 0); text is read like a number at its start (white space, sign,
  // digits); every other kind gives 0.
  std::int32_t intValue() const noexcept {
    return isInteger() ? static_cast<std::int32_t>(slot_.body()) : intOfOther();
  }
  std::int64_t int64Value() const noexcept {
    return isInteger() ? static_cast<std::int32_t>(slot_.body()) : int64OfOther();
  }
  float floatValue() const noexcept {
    return isFloat32() ? std::bit_cast<float>(slot_.body()) : floatOfOther();
  }
  double doubleValue() const noexcept {
    return slot_.form() == detail::Form::float64 ? content_.float64 : doubleOfOther();
  }
  // The bits of floatValue(), all of them: where floats are handed over in x87 registers, a
  // signalling not-a-number would arrive as a quiet one.
  std::uint32_t floatBits() const noexcept {
    return isFloat32() ? slot_.body() : std::bit_cast<std::uint32_t>(floatOfOther());
  }

  // The characters of a text; empty for every other kind. The view holds as long as this value.
  std::string_view text() const& noexcept {
    if (!isText()) return {};
    const std::span<const std::uint8_t> bytes = payload();
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
  }
  std::string text() const&& { return std::string(static_cast<const Value&>(*this).text()); }
  // A text's length in characters as UTF-16 counts them; 0 for every other kind.
  std::size_t length() const noexcept;

  // The bytes of data; empty for every other kind. The view holds as long as this value.
  std::span<const std::uint8_t> data() const& noexcept;
  std::vector<std::uint8_t> data() const&& {
    const auto bytes = static_cast<const Value&>(*this).data();
    return {bytes.begin(), bytes.end()};
  }

  // The array or dictionary; an empty one for every other kind.
  Array array() const;
  Dictionary dictionary() const;
  // The same to go through: views, which hold as long as this value and count nothing in or out.
  //
  //   for (const Value& element : value.elements()) ...
  //   for (const auto& [key, entry] : value.entries()) ...
  Elements elements() const& noexcept;
  Array elements() const&&;
  Entries entries() const& noexcept;
  Dictionary entries() const&&;

  // Equal are values of the same kind and content: floats and doubles bit for bit (so a
  // not-a-number equals itself), dictionaries whatever their order, text whether derived or not.
  friend bool operator==(const Value& a, const Value& b);

  // Internal: the value of a slot of `block`.
  static Value in(const detail::Block& block, detail::Slot slot) {
    Value lent;
    lent.borrow(block, slot);
    return Value(std::move(lent));
  }
  // Internal: a list of floats as words, if it is held in one piece; nothing else.
  std::span<const std::uint8_t> floatWords() const noexcept {
    if (slot_.form() != detail::Form::floats) return {};
    return block().bytes(slot_);
  }
  // Internal: becomes the value of a slot of `block`, or that of `other`, without a share in the
  // payload, whose owner has to stay. Whatever is copied or moved from it has a share.
  void borrow(const detail::Block& block, detail::Slot slot) {
    using detail::Form;
    const Form form = slot.form();
    if (form == Form::text || form == Form::textToNul) return borrowText(block, slot);
    lend(block, slot);
  }
  void borrow(const Value& other) noexcept {
    release();
    slot_ = other.slot_.lent();
    content_ = other.content_;
  }

 private:
  friend class Array;
  friend class Dictionary;
  struct IntegerTag {};
  union Content {
    std::int64_t integer;  // of `integer64`
    double float64;
    const detail::Shared* owner;  // null: an empty whole or box
  };

  Value(IntegerTag, std::int64_t number) noexcept
      : slot_(detail::Slot::scalar(
            std::in_range<std::int32_t>(number) ? detail::Form::integer : detail::Form::integer64,
            static_cast<std::uint32_t>(number))),
        content_{.integer = number} {}
  Value(detail::Slot slot, const detail::Shared* owner) noexcept
      : slot_(slot), content_{.owner = owner} {}
  void borrowText(const detail::Block& block, detail::Slot slot);
  void borrowOddText(const detail::Block& block, detail::Slot slot);
  void lend(const detail::Block& block, detail::Slot slot) noexcept {
    release();
    becomeLent(block, slot);
  }
  // Of a value that has no share in anything.
  void becomeLent(const detail::Block& block, detail::Slot slot) noexcept {
    slot_ = slot.lent();
    content_.owner = &block;
  }

  bool isInteger() const noexcept { return slot_.form() == detail::Form::integer; }
  bool isFloat32() const noexcept { return slot_.form() == detail::Form::float32; }
  std::int32_t intOfOther() const noexcept;
  std::int64_t int64OfOther() const noexcept;
  float floatOfOther() const noexcept;
  double doubleOfOther() const noexcept;

  static Value whole(detail::Form form, std::span<const std::uint8_t> bytes);
  static Value wholeText(detail::Form form, std::string_view text);

  class Comparison;

  static constexpr Kind kindOf(detail::Form form) {
    return static_cast<Kind>(static_cast<std::uint8_t>(form) >> detail::kindShift);
  }

  const detail::Shared* owner() const noexcept {
    return slot_.form() >= detail::Form::text ? content_.owner : nullptr;
  }
  const detail::Block& block() const noexcept {
    return static_cast<const detail::Block&>(*content_.owner);
  }
  std::span<const std::uint8_t> payload() const noexcept {
    using detail::Form;
    const Form form = slot_.form();
    if (form == Form::text || form == Form::data) return block().bytes(slot_);
    const bool isWhole =
        form == Form::wholeText || form == Form::wholeDerivedText || form == Form::wholeData;
    return isWhole && content_.owner != nullptr ? block().bytes() : std::span<const std::uint8_t>();
  }
  void retain() const noexcept {
    if (const auto* shared = owner()) shared->retain();
  }
  // Whether there is something to release.
  bool hasShare() const noexcept { return !slot_.isLent() && owner() != nullptr; }
  void release() const noexcept {
    if (hasShare()) content_.owner->release();
  }

  detail::Slot slot_;
  Content content_{.integer = 0};
};

}  // namespace oxmv
