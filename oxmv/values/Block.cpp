#include "oxmv/values/Block.h"

#include <algorithm>
#include <bit>
#include <memory>
#include <new>

#if defined(__SSE2__)
#include <immintrin.h>
#endif

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

#if defined(__SSE2__)

// Eight at a time.
std::size_t placeOf(Key wanted, const Key* keys, std::size_t count) {
  static_assert(Block::readAhead >= 8 * sizeof(Key));
  const __m128i eachWanted = _mm_set1_epi32(std::bit_cast<std::int32_t>(wanted));
  for (std::size_t at = 0; at < count; at += 8) {
    const auto* eight = reinterpret_cast<const __m128i*>(keys + at);
    const __m128i low = _mm_cmpeq_epi32(_mm_loadu_si128(eight), eachWanted);
    const __m128i high = _mm_cmpeq_epi32(_mm_loadu_si128(eight + 1), eachWanted);
    const __m128i isWanted = _mm_packs_epi16(_mm_packs_epi32(low, high), _mm_setzero_si128());
    const auto found = static_cast<std::uint32_t>(_mm_movemask_epi8(isWanted));
    if (found != 0) return std::min(at + static_cast<std::size_t>(std::countr_zero(found)), count);
  }
  return count;
}

#else

std::size_t placeOf(Key wanted, const Key* keys, std::size_t count) {
  return static_cast<std::size_t>(std::find(keys, keys + count, wanted) - keys);
}

#endif

Ref<const Block> Block::make(std::span<const std::uint8_t> head, std::string_view tail,
                             std::span<const Slot> slots, std::span<const Key> keys) {
  static_assert(alignof(Block) >= alignof(Slot) && alignof(Slot) >= alignof(Key));
  const std::size_t trailing =
      slots.size_bytes() + keys.size_bytes() + head.size() + tail.size() + readAhead;
  auto* block = new (trailing) Block;
  auto* place = reinterpret_cast<std::byte*>(block + 1);
  block->slots_ = put(place, slots);
  block->slotCount_ = slots.size();
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
    const std::size_t place = placeOf(Key::tag(key), keys, dictionary.count);
    return place == dictionary.count ? nullptr : items(headerIndex) + place;
  }
  for (std::uint32_t i = 0; i < dictionary.count; ++i) {
    if (!keys[i].isTag() && textOf(i) == key) return items(headerIndex) + i;
  }
  return nullptr;
}

}  // namespace oxmv::detail
