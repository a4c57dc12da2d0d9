#include <array>

#include <gtest/gtest.h>

#include "oxmv/values/LittleEndian.h"

namespace oxmv::test {
namespace {

// At an odd place on purpose: payloads stand anywhere.
constexpr std::array<std::uint8_t, 9> bytes = {0x00, 0x01, 0x82, 0x03, 0x84,
                                               0x05, 0x86, 0x07, 0x88};

TEST(LittleEndian, LoadsTheLowestByteFirst) {
  EXPECT_EQ(loadLe16(bytes.data() + 1), 0x8201u);
  EXPECT_EQ(loadLe24(bytes.data() + 1), 0x038201u);
  EXPECT_EQ(loadLe32(bytes.data() + 1), 0x84038201u);
  EXPECT_EQ(loadLe64(bytes.data() + 1), 0x8807860584038201u);
}

TEST(LittleEndian, StoresTheLowestByteFirst) {
  std::array<std::uint8_t, 6> stored{};
  storeLe32(stored.data() + 1, 0x84038201u);
  EXPECT_EQ(stored, (std::array<std::uint8_t, 6>{0, 0x01, 0x82, 0x03, 0x84, 0}));
}

static_assert(loadLe32(bytes.data()) == 0x03820100u, "known to the compiler too");

}  // namespace
}  // namespace oxmv::test
