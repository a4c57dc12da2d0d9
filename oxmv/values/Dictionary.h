// A dictionary from text keys to values: the metadata of a clip, a nested stream or a named group.

#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <iterator>
#include <string_view>
#include <utility>

#include "oxmv/values/Value.h"

namespace oxmv {

namespace detail {
class Table;
}

// Keeps the order of first insertion: a replaced value keeps its place, a key removed and added
// again goes to the end. That order is the dictionary's own wherever one is needed, so the same
// dictionary always gives the same bytes.
//
// Copies share the entries until one of them is changed; a change of one never shows in another,
// nor in a value made of it. Look-ups and changes stay fast whatever the keys are, also when
// somebody chose them to be slow. Different threads may use different dictionaries freely, also
// copies of one another.
class Dictionary {
 public:
  // `key` is a view into the dictionary: it holds until the dictionary is changed or gone.
  struct Entry {
    std::string_view key;
    Value value;
  };
  class Iterator;

  Dictionary() noexcept = default;  // empty
  // Entries in order; of several with the same key the last one's value counts.
  Dictionary(std::initializer_list<std::pair<std::string_view, Value>> entries);

  std::size_t size() const noexcept;
  bool empty() const noexcept { return size() == 0; }

  bool contains(std::string_view key) const;
  // The value under `key`, compared byte for byte; nothing when it is not there.
  Value operator[](std::string_view key) const;

  // Sets the value under `key`. A key that is not valid UTF-8 is taken as ISO-8859-1. Answers
  // false, and changes nothing, when the value is nothing: a dictionary cannot hold that.
  bool set(std::string_view key, Value value);
  // Answers whether the key was there.
  bool remove(std::string_view key);

  Iterator begin() const noexcept;
  Iterator end() const noexcept;

  // Equal are dictionaries with equal values under the same keys, whatever their order.
  friend bool operator==(const Dictionary& a, const Dictionary& b);

 private:
  friend class Value;
  explicit Dictionary(Value value) noexcept : value_(std::move(value)) {}

  bool isTable() const noexcept { return value_.slot_.form() == detail::Form::dictionaryBox; }
  const detail::Table* table() const noexcept;
  bool ownsTable() const noexcept;
  detail::Table& ownTable();
  // Places in the order, some of which are vacant in a dictionary that had keys removed.
  std::size_t places() const noexcept {
    if (isTable()) return placesOfTable();
    return value_.isNothing() ? 0 : value_.block().header(value_.slot_.body).count;
  }
  bool isVacant(std::size_t place) const noexcept { return isTable() && isVacantInTable(place); }
  Entry entryAt(std::size_t place) const {
    if (isTable()) return entryOfTable(place);
    const detail::Block& block = value_.block();
    const std::uint32_t header = value_.slot_.body;
    return {block.keyText(block.header(header).firstKey + static_cast<std::uint32_t>(place)),
            Value::in(block, block.items(header)[place])};
  }
  std::size_t placesOfTable() const noexcept;
  bool isVacantInTable(std::size_t place) const noexcept;
  Entry entryOfTable(std::size_t place) const;

  Value value_;  // nothing, or of a dictionary's form
};

// Goes through the entries in order. The dictionary must outlive it and stay unchanged.
class Dictionary::Iterator {
 public:
  using value_type = Entry;
  using difference_type = std::ptrdiff_t;
  using iterator_category = std::input_iterator_tag;
  using reference = Entry;
  using pointer = void;

  Iterator() = default;
  Entry operator*() const { return dictionary_->entryAt(place_); }
  Iterator& operator++() {
    ++place_;
    skipVacant();
    return *this;
  }
  Iterator operator++(int) {
    Iterator old = *this;
    ++*this;
    return old;
  }
  bool operator==(const Iterator&) const = default;

 private:
  friend class Dictionary;
  Iterator(const Dictionary* dictionary, std::size_t place)
      : dictionary_(dictionary), place_(place) {
    skipVacant();
  }
  void skipVacant() {
    while (place_ < dictionary_->places() && dictionary_->isVacant(place_)) ++place_;
  }

  const Dictionary* dictionary_ = nullptr;
  std::size_t place_ = 0;
};

inline Dictionary::Iterator Dictionary::begin() const noexcept { return {this, 0}; }

inline Dictionary::Iterator Dictionary::end() const noexcept { return {this, places()}; }

}  // namespace oxmv
