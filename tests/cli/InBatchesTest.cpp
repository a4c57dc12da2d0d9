#include <array>
#include <atomic>
#include <chrono>
#include <cstddef>
#include <stdexcept>
#include <thread>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "cli/InBatches.h"

namespace oxmv::cli {
namespace {

using Numbers = std::vector<std::size_t>;

// What a worker keeps from batch to batch, in memory of its own.
using Worker = Numbers;

TEST(InBatches, ThreadsAtOnceMakeAllThingsInOrder) {
  for (const std::size_t count : {0u, 1u, 2u, 3u, 1000u, 20000u}) {
    Numbers taken, expected;
    for (std::size_t i = 0; i < count; ++i) expected.push_back(i * i);
    inBatches(
        count, std::array<Worker, 2>(),
        [](Worker& worker, std::size_t first, std::size_t last) {
          worker.clear();
          for (std::size_t i = first; i < last; ++i) worker.push_back(i * i);
          return worker;
        },
        [&](const Numbers& made) { taken.insert(taken.end(), made.begin(), made.end()); });
    EXPECT_EQ(taken, expected);
  }
}

// Each longer than a batch is to take.
TEST(InBatches, SlowThingsAreMadeOneByOne) {
  Numbers sizes;
  inBatches(
      6, std::array<int, 2>(),
      [](int, std::size_t first, std::size_t last) {
        std::this_thread::sleep_for((last - first) * std::chrono::milliseconds(21));
        return last - first;
      },
      [&](std::size_t size) { sizes.push_back(size); });
  EXPECT_EQ(sizes, Numbers(6, 1));
}

// What is thrown comes out when nobody works any more, by whatever thread it was thrown.
TEST(InBatches, ThreadsAtOnceEndWithWhatOneThrows) {
  for (std::size_t bad = 0; bad < 40; ++bad) {
    std::atomic<int> working = 0;
    Numbers taken;
    const auto make = [&](int, std::size_t first, std::size_t last) {
      ++working;
      if (first <= bad && bad < last) {
        --working;
        throw std::runtime_error("bad");
      }
      --working;
      return std::pair(first, last);
    };
    const auto take = [&](const std::pair<std::size_t, std::size_t>& made) {
      for (std::size_t i = made.first; i < made.second; ++i) taken.push_back(i);
    };
    EXPECT_THROW(inBatches(1000, std::array<int, 2>(), make, take), std::runtime_error);
    EXPECT_EQ(working, 0);
    EXPECT_LE(taken.size(), bad);
    for (std::size_t i = 0; i < taken.size(); ++i) EXPECT_EQ(taken[i], i);
  }
}

TEST(InBatches, ThreadsAtOnceEndWithWhatTheTakerThrows) {
  std::atomic<int> working = 0;
  const auto make = [&](int, std::size_t first, std::size_t last) {
    ++working;
    std::this_thread::yield();
    --working;
    return last - first;
  };
  const auto take = [](std::size_t) { throw std::runtime_error("full"); };
  EXPECT_THROW(inBatches(1000, std::array<int, 2>(), make, take), std::runtime_error);
  EXPECT_EQ(working, 0);
}

}  // namespace
}  // namespace oxmv::cli
