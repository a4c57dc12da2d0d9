// A fixed list of values.

#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>
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
    if (!isWords()) return valueAt(index);
    const detail::Block& block = value_.block();
    const detail::Form form =
        value_.slot_.form() == detail::Form::floats ? detail::Form::float32 : detail::Form::integer;
    const std::uint8_t* words = block.bytes(value_.slot_).data();
    return Value::in(block, detail::Slot::scalar(form, loadLe32(words + index * wordSize)));
  }

  Iterator begin() const noexcept;
  Iterator end() const noexcept;

  friend bool operator==(const Array& a, const Array& b);

 private:
  friend class Value;
  explicit Array(Value value) noexcept : value_(std::move(value)) {}

  static constexpr std::size_t wordSize = 4;  // of a float or integer in a block
  bool isWords() const noexcept {
    const detail::Form form = value_.slot_.form();
    return form == detail::Form::floats || form == detail::Form::integers;
  }
  // Of lists and boxes.
  std::size_t sizeOfValues() const noexcept;
  Value valueAt(std::size_t index) const;

  Value value_;  // nothing, or of an array's form
};

// Goes through an array, which must outlive it. Yields values, not references: most are made on the
// way.
class Array::Iterator {
 public:
  using value_type = Value;
  using difference_type = std::ptrdiff_t;
  using iterator_category = std::input_iterator_tag;
  using reference = Value;
  using pointer = void;

  Iterator() = default;
  Value operator*() const { return (*array_)[index_]; }
  Iterator& operator++() {
    ++index_;
    return *this;
  }
  Iterator operator++(int) {
    Iterator old = *this;
    ++index_;
    return old;
  }
  bool operator==(const Iterator&) const = default;

 private:
  friend class Array;
  Iterator(const Array* array, std::size_t index) : array_(array), index_(index) {}

  const Array* array_ = nullptr;
  std::size_t index_ = 0;
};

inline Array::Iterator Array::begin() const noexcept { return {this, 0}; }

inline Array::Iterator Array::end() const noexcept { return {this, size()}; }

}  // namespace oxmv
