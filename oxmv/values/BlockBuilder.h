// Puts the block of a decoded stream together. Internal: only the decoder meets it.

#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

#include "oxmv/values/Block.h"

namespace oxmv::detail {

// A vector whose first items stand in itself: most streams need no more, and so nothing of the
// heap.
template <class T, std::size_t inItself>
class Scratch {
  static_assert(std::is_trivially_copyable_v<T> && std::is_trivially_destructible_v<T>);

 public:
  Scratch() = default;
  Scratch(const Scratch&) = delete;
  Scratch& operator=(const Scratch&) = delete;

  std::size_t size() const { return size_; }
  T* data() { return items_; }
  T& operator[](std::size_t index) { return items_[index]; }
  std::span<T> from(std::size_t first) { return {items_ + first, size_ - first}; }

  void push(const T& item) { *extend(1) = item; }
  // Room for `count` more, to be filled by the caller.
  T* extend(std::size_t count) {
    if (count > capacity_ - size_) grow(count);
    T* added = items_ + size_;
    size_ += count;
    return added;
  }
  void shrink(std::size_t size) { size_ = size; }
  // Gives back what it has of the heap, and with it what stands there.
  void release() {
    if (heap_ == nullptr) return;
    heap_.reset();
    items_ = reinterpret_cast<T*>(own_.data());
    capacity_ = inItself;
    size_ = 0;
  }

 private:
  // Seldom: kept out of the way of what it is called from.
  [[gnu::noinline]] void grow(std::size_t count) {
    // What outgrows itself may well be long.
    const std::size_t factor = heap_ == nullptr ? 8 : 2;
    const std::size_t capacity = std::max(factor * capacity_, size_ + count);
    auto memory = std::make_unique_for_overwrite<std::byte[]>(capacity * sizeof(T));
    T* items = reinterpret_cast<T*>(memory.get());
    std::uninitialized_copy_n(items_, size_, items);
    items_ = items;
    capacity_ = capacity;
    heap_ = std::move(memory);
  }

  alignas(T) std::array<std::byte, inItself * sizeof(T)> own_;
  T* items_ = reinterpret_cast<T*>(own_.data());
  std::size_t size_ = 0;
  std::size_t capacity_ = inItself;
  std::unique_ptr<std::byte[]> heap_;
};

// Dictionaries are made one within another, between open() and close(). Each is gathered apart and
// gets its place among the slots and keys of the block when it is closed, so that its own stand
// together.
//
// Whoever fills a dictionary numbers its keys: an id stands for the same key every time. That is
// all that finding a key again takes.
class BlockBuilder {
 public:
  using Id = std::uint8_t;
  // The entries of one dictionary, and the ids.
  static constexpr std::size_t mostEntries = 255;

  // The block will hold a copy of `bytes`, which must stay until it is made.
  explicit BlockBuilder(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

  // A dictionary being filled.
  struct Open {
    std::size_t base = 0;   // of its entries, in the scratch of all that are open
    std::size_t count = 0;  // of its entries
    std::size_t firstElement = 0;
    std::size_t firstNamed = 0;
    // Found again whenever it is the one to be filled.
    Slot* slots = nullptr;
    Key* keys = nullptr;
    std::uint8_t* placeOfId =
        nullptr;  // where an id's entry stands, counted from 1; 0 = nowhere yet
  };
  // Begins one in a value of the current one, which is answered: close() wants it back.
  [[nodiscard]] Open open();
  Slot close(const Open& outer);

  // The value of a key. Of several the last one counts, in the place of the first.
  void put(Id id, Key key, Slot value) {
    std::uint8_t& place = open_.placeOfId[id];
    if (place == 0) {
      putOnce(key, value);
      place = static_cast<std::uint8_t>(open_.count);
    } else {
      open_.slots[place - 1u] = value;
    }
  }
  // One more element of the list that is the key's value.
  void append(Id id, Key key, Slot element) {
    const std::uint32_t place = gatheredAt(id, key);
    Slot& list = open_.slots[place - 1];
    list = Slot(list.formAndSize(), list.body() + 1);
    elements_.push({element, place});
  }
  // An entry of the group that is the key's value. `name` is in UTF-8.
  void putNamed(Id id, Key key, Slot name, Slot value) {
    named_.push({name, value, gatheredAt(id, key)});
  }
  // An entry under a key that no id stands for.
  void putOnce(Key key, Slot value) {
    open_.keys[open_.count] = key;
    open_.slots[open_.count++] = value;
  }

  // The same text in UTF-8: where it is not, a converted copy behind the bytes.
  Slot asUtf8(Slot text);
  // A copy of `text` behind the bytes.
  Slot addText(std::string_view text);
  Key keyOf(Slot name);

  bool isEmpty(Slot dictionary) { return Header::of(slots_[dictionary.body()]).count == 0; }
  Ref<const Block> block();

 private:
  // An element of a list, an entry of a group; the list or group stands at `place`, counted from 1,
  // in the dictionary being filled.
  struct Element {
    Slot slot;
    std::uint32_t place;
  };
  struct Named {
    Slot name, value;
    std::uint32_t place;
    std::uint32_t index = 0;  // in the group, once that is put
  };
  // An entry of a group by its place in the order by text.
  struct Ranked {
    std::uint64_t start;  // of its name, as a number
    std::uint32_t entry;  // of those that were given
  };

  // Where the entry of a list or group stands. Its slot is no value until the dictionary is closed.
  std::uint32_t gatheredAt(Id id, Key key) {
    if (const std::uint8_t place = open_.placeOfId[id]; place != 0) return place;
    putOnce(key, {});
    open_.placeOfId[id] = static_cast<std::uint8_t>(open_.count);
    return static_cast<std::uint32_t>(open_.count);
  }

  void findOpen();
  Slot putHeader(Form form, std::size_t count, bool sorted);
  void putLists();
  void putGroups();
  Slot putGroup(std::span<const Named> given);
  void mergeFew(std::span<const Named> entries, std::uint32_t place);
  void mergeMany(std::span<Named> entries, std::uint32_t place);
  // Takes some stack, and is kept apart from what is on it once for each level.
  [[gnu::noinline]] void sortByName(std::span<const Named> entries);
  Named* findNamed(std::string_view name);
  void putOrder(std::span<const Named> entries);
  std::string_view textOf(Slot place) const;

  const std::span<const std::uint8_t> bytes_;
  std::string extra_;  // bytes behind those: converted names

  Open open_;

  // All that stand in themselves take half of the stack that decoding may need.

  // Inner ones behind outer ones.
  Scratch<Slot, 2 * (mostEntries + 1)> openSlots_;
  Scratch<Key, 2 * (mostEntries + 1)> openKeys_;
  Scratch<std::uint8_t, 2 * (mostEntries + 1)> places_;
  Scratch<Element, 160> elements_;
  Scratch<Named, 32> named_;
  Scratch<Named, 16> group_;    // the entries of one group, while it is put
  Scratch<Ranked, 16> ranked_;  // the same by name, where they are many
  Scratch<Ranked, 1> spare_;    // for sorting those

  Scratch<Slot, 1664> slots_;  // of the block to be
  Scratch<Key, 640> keys_;     // of the block to be
};

}  // namespace oxmv::detail
