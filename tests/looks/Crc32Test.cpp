#include <random>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/Crc32.h"

namespace oxmv {
namespace {

using Bytes = std::vector<std::uint8_t>;

constexpr Instructions bothKinds[] = {Instructions::portable, Instructions::vector};

// The definition, bit by bit, with nothing made beforehand.
std::uint32_t plainUpdate(std::uint32_t crc, const std::uint8_t* bytes, std::size_t length) {
  for (std::size_t i = 0; i < length; ++i) {
    crc ^= bytes[i];
    for (int bit = 0; bit < 8; ++bit) crc = (crc & 1) != 0 ? crc >> 1 ^ 0xEDB88320 : crc >> 1;
  }
  return crc;
}

Bytes randomBytes(std::mt19937& random, std::size_t count) {
  Bytes bytes(count);
  for (auto& byte : bytes) byte = static_cast<std::uint8_t>(random());
  return bytes;
}

TEST(Crc32, HasTheUsualCheckValue) {
  const Bytes digits = {'1', '2', '3', '4', '5', '6', '7', '8', '9'};
  EXPECT_EQ(calccrc(digits.data(), 9), 0xCBF43926u);
}

TEST(Crc32, OfNothingIsZero) {
  EXPECT_EQ(calccrc(nullptr, 0), 0u);
  EXPECT_EQ(calccrc(nullptr, -1), 0u);
}

TEST(Crc32, OfOneByte) {
  const std::uint8_t letter = 'a';
  EXPECT_EQ(calccrc(&letter, 1), 0xE8B7BE43u);
}

TEST(Crc32, OfThirtyTwoZeroBytes) {
  const Bytes zeros(32);
  EXPECT_EQ(calccrc(zeros.data(), 32), 0x190A55ADu);
}

TEST(UpdateCrc, LengthBelowOneGivesItsInput) {
  const std::uint8_t byte = 1;
  EXPECT_EQ(update_crc(0x12345678, &byte, 0), 0x12345678u);
  EXPECT_EQ(update_crc(0x12345678, &byte, -1), 0x12345678u);
  EXPECT_EQ(update_crc(0x12345678, nullptr, -2147483647 - 1), 0x12345678u);
}

TEST(UpdateCrc, GoesOnFromTheEntriesOfTheTable) {
  make_crc_table();
  for (std::uint32_t n = 0; n < 256; ++n) {
    const auto byte = static_cast<std::uint8_t>(n);
    EXPECT_EQ(update_crc(0, &byte, 1), plainUpdate(0, &byte, 1));
  }
  const std::uint8_t one = 1;
  EXPECT_EQ(update_crc(0, &one, 1), 0x77073096u);  // entry 1 of the usual table
}

TEST(UpdateCrc, EveryShortLengthAtEveryAlignmentIsAsDefined) {
  std::mt19937 random(1);
  const Bytes bytes = randomBytes(random, 400);
  for (std::size_t start = 0; start < 17; ++start) {
    for (std::size_t length = 0; length < 300; ++length) {
      const std::uint32_t expected = plainUpdate(0xFFFFFFFF, &bytes[start], length);
      for (const Instructions kind : bothKinds) {
        ASSERT_EQ(update_crc(0xFFFFFFFF, &bytes[start], static_cast<int>(length), kind), expected)
            << length << " bytes from " << start;
      }
    }
  }
}

TEST(UpdateCrc, RandomLengthsAndStartsAreAsDefined) {
  std::mt19937 random(2);
  for (int i = 0; i < 200; ++i) {
    const Bytes bytes = randomBytes(random, 1 + random() % 20000);
    const std::size_t start = random() % bytes.size();
    const std::size_t length = bytes.size() - start;
    const auto crc = static_cast<std::uint32_t>(random());
    const std::uint32_t expected = plainUpdate(crc, &bytes[start], length);
    for (const Instructions kind : bothKinds) {
      ASSERT_EQ(update_crc(crc, &bytes[start], static_cast<int>(length), kind), expected);
    }
  }
}

TEST(UpdateCrc, InPiecesIsAsInOne) {
  std::mt19937 random(3);
  const Bytes bytes = randomBytes(random, 5000);
  for (const int cut : {1, 15, 16, 63, 64, 65, 127, 1000, 4999}) {
    const std::uint32_t first = update_crc(0xFFFFFFFF, bytes.data(), cut);
    EXPECT_EQ(update_crc(first, bytes.data() + cut, 5000 - cut) ^ 0xFFFFFFFF,
              calccrc(bytes.data(), 5000));
  }
}

TEST(UpdateCrc, ReadsExactlyItsBytes) {
  for (std::size_t length = 1; length < 200; ++length) {
    const Bytes bytes(length, 0x5A);  // of exactly this size: a sanitizer sees one read too many
    EXPECT_EQ(update_crc(7, bytes.data(), static_cast<int>(length)),
              plainUpdate(7, bytes.data(), length));
  }
}

TEST(UpdateCrc, ThreadsAtOnceGetTheSame) {
  const Bytes bytes(10000, 0xA5);
  const std::uint32_t expected = plainUpdate(0, bytes.data(), bytes.size());
  std::vector<std::uint32_t> got(4);
  std::vector<std::thread> threads;
  for (auto& crc : got) {
    threads.emplace_back([&] {
      make_crc_table();
      crc = update_crc(0, bytes.data(), 10000);
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(got, std::vector<std::uint32_t>(4, expected));
}

}  // namespace
}  // namespace oxmv
