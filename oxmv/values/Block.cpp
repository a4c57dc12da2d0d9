#include "oxmv/values/Block.h"

#include <algorithm>
#include <memory>
#include <new>

namespace oxmv::detail {
namespace {

// Copies to `*place`, and moves `*place` behind the copy.
template <class T>
const T* put(std::byte*& place, std::span<const T> items) {
  T* start = reinterpret_cast<T*>(place);
  std::uninitialized_copy(items.begin(), items.end(), start);
  place += items.size_bytes();
  return start;
}

}  // namespace

Ref<const Block> Block::make(std::span<const std::uint8_t> head, std::string_view tail,
                             std::span<const Slot> slots, std::span<const Key> keys) {
  static_assert(alignof(Block) >= alignof(Slot) && alignof(Slot) >= alignof(Key));
  const std::size_t trailing =
      slots.size_bytes() + keys.size_bytes() + head.size() + tail.size() + readAhead;
  auto* block = new (trailing) Block;
  auto* place = reinterpret_cast<std::byte*>(block + 1);
  block->slots_ = put(place, slots);
  block->keys_ = put(place, keys);
  block->bytes_ = put(place, head);
  put(place, std::span(reinterpret_cast<const std::uint8_t*>(tail.data()), tail.size()));
  std::fill_n(place, readAhead, std::byte{0});
  block->byteCount_ = head.size() + tail.size();
  return Ref<const Block>::adopt(block);
}

const Slot* Block::find(std::uint32_t headerIndex, std::string_view key) const {
  const Header dictionary = header(headerIndex);
  const Key* keys = keys_ + dictionary.firstKey;
  const Key* end = keys + dictionary.count;
  const auto textOf = [&](std::uint32_t index) { return keyText(keys[index]); };
  if (dictionary.sorted) {
    // The order: for each place the index of the key there, held as if it were a slot's.
    const Key* orderEnd = end + dictionary.count;
    const Key* found = std::lower_bound(end, orderEnd, key, [&](Key place, std::string_view text) {
      return textOf(place.slot()) < text;
    });
    const bool isThere = found != orderEnd && textOf(found->slot()) == key;
    return isThere ? items(headerIndex) + found->slot() : nullptr;
  }
  if (Key::fits(key)) {
    const Key* found = std::find(keys, end, Key::tag(key));
    return found == end ? nullptr : items(headerIndex) + (found - keys);
  }
  for (std::uint32_t i = 0; i < dictionary.count; ++i) {
    if (!keys[i].isTag() && textOf(i) == key) return items(headerIndex) + i;
  }
  return nullptr;
}

}  // namespace oxmv::detail
