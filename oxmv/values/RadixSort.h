// Sorting by a number of 64 bits, in a time that grows with the count alone whatever the numbers
// are. Internal.

#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <utility>

namespace oxmv::detail {

// Sorts `items`, fewer than 2^32, by number(item), those of the same number in the order in which
// they stood. `spare` has room for as many. Goes through them once for each byte in which any two
// numbers differ, from the lowest on.
template <class T, class Number>
void radixSort(std::span<T> items, std::span<T> spare, Number number) {
  std::uint64_t different = 0;
  for (const T& item : items) different |= number(item) ^ number(items.front());

  T* from = items.data();
  T* to = spare.data();
  for (int shift = 0; shift < 64; shift += 8) {
    if ((different >> shift & 0xFF) == 0) continue;
    const auto byteOf = [&](const T& item) {
      return static_cast<std::uint8_t>(number(item) >> shift);
    };
    std::array<std::uint32_t, 256> places{};
    for (std::size_t i = 0; i < items.size(); ++i) ++places[byteOf(from[i])];
    std::uint32_t next = 0;
    for (std::uint32_t& place : places) next += std::exchange(place, next);
    for (std::size_t i = 0; i < items.size(); ++i) to[places[byteOf(from[i])]++] = from[i];
    std::swap(from, to);
  }
  if (from != items.data()) std::copy_n(from, items.size(), items.data());
}

}  // namespace oxmv::detail
