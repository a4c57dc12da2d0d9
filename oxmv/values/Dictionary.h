// A dictionary from text keys to values: the metadata of a clip, a nested stream or a named group.

#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <iterator>
#include <optional>
#include <string_view>
#include <utility>

#include "oxmv/values/HeldEntries.h"
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

  Iterator begin() const;
  Iterator end() const noexcept;

  // Internal: the entries of a dictionary that is a value; none of any other value.
  static detail::HeldEntries entriesOf(const Value& value) noexcept;
  detail::HeldEntries entries() const noexcept { return entriesOf(value_); }

  // Equal are dictionaries with equal values under the same keys, whatever their order.
  friend bool operator==(const Dictionary& a, const Dictionary& b);

 private:
  friend class Entries;
  friend class Value;
  explicit Dictionary(Value value) noexcept : value_(std::move(value)) {}

  bool isTable() const noexcept { return value_.slot_.form() == detail::Form::dictionaryBox; }
  // Where `key`, in UTF-8, stands in the order.
  std::optional<std::size_t> placeOf(std::string_view key) const;
  // `value` becomes that of `key`, in UTF-8, and stays as it was if there is none; see
  // Value::borrow. Answers whether there is.
  bool lend(Value& value, std::string_view key) const;

  const detail::Table* table() const noexcept;
  bool ownsTable() const noexcept;
  detail::Table& ownTable() noexcept;
  Value renewTable(std::size_t more);
  void compact() noexcept;
  // Places in the order, some of which are vacant in a dictionary that had keys removed.
  std::size_t places() const noexcept {
    if (isTable()) return placesOfTable();
    return value_.isNothing() ? 0 : value_.block().header(value_.slot_.body()).count;
  }
  std::size_t placesOfTable() const noexcept;

  Value value_;  // nothing, or of a dictionary's form
};

// Goes through the entries in order. The dictionary must outlive it and stay unchanged.
//
// The entry that it has come to stands in the iterator itself, until it moves on or is gone; the
// payload of its value is only lent by the dictionary, so that a loop
//
//   for (const auto& [key, value] : tags) ...
//
// need not count itself in and out at every entry. Whatever is copied from there (`auto entry =
// *at`, `kept = value`, `value.dictionary()`) has its share in the payload and may stay longer than
// the dictionary. An iterator without a name answers such a copy: `*tags.begin()`, `*at++`.
class Dictionary::Iterator {
 public:
  using value_type = Entry;
  using difference_type = std::ptrdiff_t;
  using iterator_category = std::input_iterator_tag;
  using reference = const Entry&;
  using pointer = void;

  Iterator() = default;
  const Entry& operator*() const& { return entry_; }
  Entry operator*() const&& { return entry_; }
  Iterator& operator++() {
    ++place_;
    arrive();
    return *this;
  }
  Iterator operator++(int) {
    Iterator old = *this;
    ++*this;
    return old;
  }
  // Of iterators through the same dictionary.
  bool operator==(const Iterator& other) const { return place_ == other.place_; }

 private:
  friend class Dictionary;
  Iterator(const Dictionary* dictionary, std::size_t place, std::size_t end)
      : dictionary_(dictionary), place_(place), end_(end) {
    if (place_ == end_) return;
    if (!dictionary->isTable()) {
      const std::uint32_t header = dictionary->value_.slot_.body();
      block_ = &dictionary->value_.block();
      slots_ = block_->items(header);
      keys_ = block_->keys(header);
    }
    arrive();
  }
  // The end, which holds nothing.
  explicit Iterator(std::size_t end) : place_(end), end_(end) {}
  // Borrows the entry of the place; from a vacant one it goes on to the next that is not.
  void arrive() {
    if (place_ == end_) return;
    if (block_ == nullptr) return arriveInTable();
    entry_.key = block_->keyText(keys_[place_]);
    entry_.value.borrow(*block_, slots_[place_]);
  }
  void arriveInTable();

  const Dictionary* dictionary_ = nullptr;
  std::size_t place_ = 0;
  std::size_t end_ = 0;
  const detail::Block* block_ = nullptr;  // null: the entries stand in a table
  const detail::Slot* slots_ = nullptr;
  const detail::Key* keys_ = nullptr;
  Entry entry_;
};

inline Dictionary::Iterator Dictionary::begin() const { return {this, 0, places()}; }

inline Dictionary::Iterator Dictionary::end() const noexcept { return Iterator(places()); }

// The entries of the dictionary that a value is, to go through; see Value::entries().
class Entries {
 public:
  Entries(const Entries&) = delete;
  Entries& operator=(const Entries&) = delete;

  std::size_t size() const noexcept { return dictionary_.size(); }
  bool empty() const noexcept { return dictionary_.empty(); }

  Dictionary::Iterator begin() const { return dictionary_.begin(); }
  Dictionary::Iterator end() const noexcept { return dictionary_.end(); }

 private:
  friend class Value;
  explicit Entries(const Value& value) noexcept {
    if (value.kind() == Value::Kind::dictionary) dictionary_.value_.borrow(value);
  }

  Dictionary dictionary_;  // has no share in its payload
};

inline Entries Value::entries() const& noexcept { return Entries(*this); }
inline Dictionary Value::entries() const&& { return dictionary(); }

}  // namespace oxmv
