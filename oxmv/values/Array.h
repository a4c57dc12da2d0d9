// A fixed list of values.

#pragma once

#include <array>
#include <bit>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <span>
#include <utility>
#include <vector>

#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Value.h"

namespace oxmv {

// A handle on a list of values that never changes once made; copies share it.
class Array {
 public:
  class Iterator;

  Array() noexcept = default;  // empty
  explicit Array(std::vector<Value> elements);
  // Array::of(1, 2.5f, "three"). Not a constructor from a list, which would take Array{other} for a
  // list of one.
  template <class... T>
  static Array of(const T&... elements) {
    if constexpr (sizeof...(T) > 0 && (std::same_as<T, float> && ...)) {
      std::array<std::uint8_t, sizeof...(T) * wordSize> words;
      std::uint8_t* at = words.data();
      (storeLe32(std::exchange(at, at + wordSize), std::bit_cast<std::uint32_t>(elements)), ...);
      return ofFloats(words);
    }
    std::vector<Value> values;
    values.reserve(sizeof...(elements));
    (values.emplace_back(elements), ...);
    return Array(std::move(values));
  }

  std::size_t size() const noexcept {
    return isWords() ? value_.slot_.size() / wordSize : sizeOfValues();
  }
  bool empty() const noexcept { return size() == 0; }
  // `index` must be below size().
  Value operator[](std::size_t index) const {
    Value element;
    borrowTo(element, index);
    return Value(std::move(element));
  }

  Iterator begin() const;
  Iterator end() const noexcept;

  friend bool operator==(const Array& a, const Array& b);

 private:
  friend class Elements;
  friend class Value;
  explicit Array(Value value) noexcept : value_(std::move(value)) {}
  // Held in one piece, as in a decoded stream.
  static Array ofFloats(std::span<const std::uint8_t> words);

  static constexpr std::size_t wordSize = 4;  // of a float or integer in a block
  bool isWords() const noexcept {
    const detail::Form form = value_.slot_.form();
    return form == detail::Form::floats || form == detail::Form::integers;
  }
  void borrowTo(Value& element, std::size_t index) const {
    using detail::Form;
    if (value_.slot_.form() == Form::arrayBox) return borrowFromBox(element, index);
    const detail::Block& block = value_.block();
    if (!isWords()) return element.borrow(block, block.items(value_.slot_.body())[index]);
    const Form form = value_.slot_.form() == Form::floats ? Form::float32 : Form::integer;
    const std::uint8_t* words = block.bytes(value_.slot_).data();
    element.borrow(block, detail::Slot::scalar(form, loadLe32(words + index * wordSize)));
  }
  // Of lists and boxes.
  std::size_t sizeOfValues() const noexcept;
  void borrowFromBox(Value& element, std::size_t index) const noexcept;

  Value value_;  // nothing, or of an array's form
};

// Goes through an array, which must outlive it. The element that it has come to stands in the
// iterator itself, as an entry does in a dictionary's: see there.
class Array::Iterator {
 public:
  using value_type = Value;
  using difference_type = std::ptrdiff_t;
  using iterator_category = std::input_iterator_tag;
  using reference = const Value&;
  using pointer = void;

  Iterator() = default;
  const Value& operator*() const& { return element_; }
  Value operator*() const&& { return element_; }
  Iterator& operator++() {
    ++index_;
    arrive();
    return *this;
  }
  Iterator operator++(int) {
    Iterator old = *this;
    ++*this;
    return old;
  }
  // Of iterators through the same array.
  bool operator==(const Iterator& other) const { return index_ == other.index_; }

 private:
  friend class Array;
  Iterator(const Array* array, std::size_t index, std::size_t end)
      : array_(array), index_(index), end_(end) {
    arrive();
  }
  // The end, which holds nothing.
  explicit Iterator(std::size_t end) : index_(end), end_(end) {}
  void arrive() {
    if (index_ != end_) array_->borrowTo(element_, index_);
  }

  const Array* array_ = nullptr;
  std::size_t index_ = 0;
  std::size_t end_ = 0;
  Value element_;
};

inline Array::Iterator Array::begin() const { return {this, 0, size()}; }

inline Array::Iterator Array::end() const noexcept { return Iterator(size()); }

// The elements of the array that a value is, to go through; see Value::elements().
class Elements {
 public:
  Elements(const Elements&) = delete;
  Elements& operator=(const Elements&) = delete;

  std::size_t size() const noexcept { return array_.size(); }
  bool empty() const noexcept { return array_.empty(); }
  // `index` must be below size().
  Value operator[](std::size_t index) const { return array_[index]; }

  Array::Iterator begin() const { return array_.begin(); }
  Array::Iterator end() const noexcept { return array_.end(); }

 private:
  friend class Value;
  explicit Elements(const Value& value) noexcept {
    if (value.kind() == Value::Kind::array) array_.value_.borrow(value);
  }

  Array array_;  // has no share in its payload
};

inline Elements Value::elements() const& noexcept { return Elements(*this); }
inline Array Value::elements() const&& { return array(); }

}  // namespace oxmv
