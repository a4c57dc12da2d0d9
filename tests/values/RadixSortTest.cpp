#include <algorithm>
#include <cstdint>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/RadixSort.h"

namespace oxmv::test {
namespace {

struct Item {
  std::uint64_t number;
  int name;
  bool operator==(const Item&) const = default;
};
using Items = std::vector<Item>;

Items sorted(Items items) {
  Items spare(items.size());
  detail::radixSort(std::span(items), std::span(spare),
                    [](const Item& item) { return item.number; });
  return items;
}

TEST(RadixSort, PutsNumbersInOrder) {
  EXPECT_EQ(sorted({{3, 0}, {1, 1}, {2, 2}}), (Items{{1, 1}, {2, 2}, {3, 0}}));
}

TEST(RadixSort, LeavesEqualNumbersInTheirOrder) {
  EXPECT_EQ(sorted({{2, 0}, {1, 1}, {2, 2}, {1, 3}, {2, 4}}),
            (Items{{1, 1}, {1, 3}, {2, 0}, {2, 2}, {2, 4}}));
  EXPECT_EQ(sorted({{7, 0}, {7, 1}, {7, 2}}), (Items{{7, 0}, {7, 1}, {7, 2}}));
}

TEST(RadixSort, TakesNothingAndOne) {
  EXPECT_EQ(sorted({}), Items());
  EXPECT_EQ(sorted({{5, 0}}), (Items{{5, 0}}));
}

TEST(RadixSort, ComparesEveryByteTheHighestFirst) {
  for (int byte = 0; byte < 8; ++byte) {
    const std::uint64_t one = std::uint64_t{1} << 8 * byte;
    EXPECT_EQ(sorted({{0xFF * one, 0}, {0x80 * one, 1}, {0x7F * one, 2}, {0, 3}}),
              (Items{{0, 3}, {0x7F * one, 2}, {0x80 * one, 1}, {0xFF * one, 0}}))
        << byte;
    if (byte == 0) continue;
    EXPECT_EQ(sorted({{one, 0}, {one - 1, 1}, {one + 1, 2}}),
              (Items{{one - 1, 1}, {one, 0}, {one + 1, 2}}))
        << byte;
  }
}

TEST(RadixSort, IsAStableSort) {
  std::mt19937_64 random(1);
  for (const std::uint64_t mask :
       {~std::uint64_t{0}, std::uint64_t{0xFF}, std::uint64_t{0xFF0000FF00000000}}) {
    Items items;
    for (int i = 0; i < 3000; ++i) items.push_back({random() & mask, i});
    Items expected = items;
    std::stable_sort(expected.begin(), expected.end(),
                     [](const Item& a, const Item& b) { return a.number < b.number; });
    EXPECT_EQ(sorted(items), expected) << mask;
  }
}

}  // namespace
}  // namespace oxmv::test
