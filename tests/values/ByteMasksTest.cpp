#include <array>
#include <cstdint>

#include <gtest/gtest.h>

#include "oxmv/values/ByteMasks.h"

namespace oxmv::test {
namespace {

using detail::ByteMasks;
using detail::masksOf;

using Window = std::array<std::uint8_t, ByteMasks::width>;

TEST(ByteMasks, AreEmptyWhereAllIsAscii) {
  Window bytes;
  bytes.fill('a');
  EXPECT_EQ(masksOf(bytes.data()).nul, 0u);
  EXPECT_EQ(masksOf(bytes.data()).high, 0u);
}

TEST(ByteMasks, AreFullWhereAllIsTheSame) {
  Window bytes{};
  EXPECT_EQ(masksOf(bytes.data()).nul, 0xFFFFFFFFu);
  EXPECT_EQ(masksOf(bytes.data()).high, 0u);
  bytes.fill(0x80);
  EXPECT_EQ(masksOf(bytes.data()).nul, 0u);
  EXPECT_EQ(masksOf(bytes.data()).high, 0xFFFFFFFFu);
}

TEST(ByteMasks, TellEveryByteAtEveryPlace) {
  for (std::uint32_t place = 0; place < ByteMasks::width; ++place) {
    for (int byte = 0; byte < 256; ++byte) {
      Window bytes;
      bytes.fill(0x7F);
      bytes[place] = static_cast<std::uint8_t>(byte);
      const ByteMasks masks = masksOf(bytes.data());
      ASSERT_EQ(masks.nul, byte == 0 ? 1u << place : 0u) << byte << " at " << place;
      ASSERT_EQ(masks.high, byte >= 0x80 ? 1u << place : 0u) << byte << " at " << place;
    }
  }
}

}  // namespace
}  // namespace oxmv::test
