#include <cstdint>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamFormat.h"

namespace oxmv::test {
namespace {

TEST(TagStreamFormat, RecordLengthIsTheHeaderAndTheSizePaddedTo4) {
  for (const auto& [size, length] : {std::pair(0u, 8u),
                                     {1u, 12u},
                                     {3u, 12u},
                                     {4u, 12u},
                                     {5u, 16u},
                                     {8u, 16u},
                                     {0xFFFFu, 0x10008u},
                                     {0xFFFFF0u, 0xFFFFF8u},
                                     {0xFFFFF1u, 0xFFFFFCu},
                                     {0xFFFFF4u, 0xFFFFFCu}}) {
    EXPECT_EQ(recordLength(size), length) << size;
  }
}

TEST(TagStreamFormat, KeepsRecordLengthTo24Bits) {
  for (std::uint32_t size = 0xFFFFF5; size <= 0xFFFFF8; ++size) EXPECT_EQ(recordLength(size), 0u);
  for (std::uint32_t size = 0xFFFFF9; size <= 0xFFFFFC; ++size) EXPECT_EQ(recordLength(size), 4u);
  for (std::uint32_t size = 0xFFFFFD; size <= 0xFFFFFF; ++size) EXPECT_EQ(recordLength(size), 8u);
}

TEST(TagStreamFormat, PaddingReachesTheNextMultipleOf4) {
  for (const auto& [size, padded] :
       {std::pair(0u, 0u), {1u, 4u}, {4u, 4u}, {5u, 8u}, {255u, 256u}, {0xFFFFFDu, 0x1000000u}}) {
    EXPECT_EQ(paddedToFour(size), padded) << size;
  }
}

}  // namespace
}  // namespace oxmv::test
