#include <algorithm>
#include <array>
#include <cstdint>
#include <initializer_list>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/values/Bytes32.h"

namespace oxmv::test {
namespace {

using Thirtytwo = std::array<std::uint8_t, 32>;

std::uint32_t bitsThat(const Thirtytwo& bytes, bool (*holds)(std::uint8_t)) {
  std::uint32_t bits = 0;
  for (std::size_t i = 0; i < bytes.size(); ++i) bits |= std::uint32_t{holds(bytes[i])} << i;
  return bits;
}

// Each value in each place among zeros, among letters and among high ones; and bytes at random.
std::vector<Thirtytwo> samples() {
  std::vector<Thirtytwo> made;
  using Bytes = std::initializer_list<std::uint8_t>;
  for (const std::uint8_t around : Bytes{0x00, 0x41, 0xFF}) {
    for (std::size_t place = 0; place < 32; ++place) {
      for (const std::uint8_t value : Bytes{0x00, 0x01, 0x7F, 0x80, 0x81, 0xFF}) {
        made.emplace_back().fill(around);
        made.back()[place] = value;
      }
    }
  }
  std::mt19937 random(1);
  for (int i = 0; i < 1000; ++i) {
    for (std::uint8_t& byte : made.emplace_back()) byte = static_cast<std::uint8_t>(random());
  }
  return made;
}

template <class Kind>
class Bytes32Kinds : public testing::Test {};
using Kinds = testing::Types<detail::PortableBytes32, detail::Bytes32>;
TYPED_TEST_SUITE(Bytes32Kinds, Kinds);

TYPED_TEST(Bytes32Kinds, TellsWhatIsNoCharacterOfAscii) {
  for (const Thirtytwo& sample : samples()) {
    const auto bytes = TypeParam::at(sample.data());
    ASSERT_EQ(bytes.ends(),
              bitsThat(sample, [](std::uint8_t byte) { return byte == 0 || byte >= 0x80; }));
    ASSERT_EQ(bytes.nuls(), bitsThat(sample, [](std::uint8_t byte) { return byte == 0; }));
    ASSERT_EQ(bytes.notAscii(), bitsThat(sample, [](std::uint8_t byte) { return byte >= 0x80; }));
  }
}

TYPED_TEST(Bytes32Kinds, StoresItsFirstBytesAndZerosAndNothingElse) {
  Thirtytwo sample;
  for (std::size_t i = 0; i < sample.size(); ++i) sample[i] = static_cast<std::uint8_t>(0xE0 + i);
  for (std::size_t count = 0; count <= 32; ++count) {
    std::array<std::uint8_t, 34> stored;
    stored.fill(0xAA);
    TypeParam::at(sample.data()).store(stored.data() + 1, count, 0);
    std::array<std::uint8_t, 34> expected{};
    expected.front() = expected.back() = 0xAA;
    std::copy_n(sample.begin(), count, expected.begin() + 1);
    EXPECT_EQ(stored, expected) << count;
  }
}

TYPED_TEST(Bytes32Kinds, StoresAWordLittleEndian) {
  Thirtytwo sample;
  sample.fill(0x11);
  Thirtytwo stored;
  TypeParam::at(sample.data()).store(stored.data(), 0, 0x84030201);
  EXPECT_EQ(stored, (Thirtytwo{1, 2, 3, 0x84}));
}

}  // namespace
}  // namespace oxmv::test
