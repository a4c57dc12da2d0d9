// Whether a path of ours grows in step with its input: processor time and peak memory over ten
// doublings, and the exponent of the curve that fits, 1 for twice as much for twice the input.

#pragma once

#include <array>
#include <cstddef>
#include <functional>
#include <span>
#include <string>

namespace bench {

constexpr std::size_t doublings = 10;
constexpr std::size_t growthSizes = doublings + 1;

struct GrowingPath {
  std::string name;
  std::array<double, growthSizes> bytes;  // of each input, in ascending order
  std::function<void(std::size_t input)> run;
  // Before each run, and not measured; may be null.
  std::function<void(std::size_t input)> prepare = nullptr;
};

// Prints a line for each. The heap must be one that counts: see Heap.h.
void printGrowth(std::span<const GrowingPath> paths);

// Looks and the database.
void printGrowthOfFiles();

}  // namespace bench
