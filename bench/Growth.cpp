#include "Growth.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <ctime>

#include "Heap.h"

namespace bench {
namespace {

constexpr double exponentAim = 1.1;

struct Measure {
  double seconds = 0;  // the least of its rounds
  double peak = 0;     // bytes beyond those that were there
};

using Measures = std::array<Measure, growthSizes>;

double processorSeconds() {
  return static_cast<double>(std::clock()) / static_cast<double>(CLOCKS_PER_SEC);
}

// Each round takes all sizes in turn, the small ones so often that all take about the same time.
Measures measure(const GrowingPath& path) {
  // What has to be prepared takes longer, and then less often is often enough.
  const int rounds = path.prepare == nullptr ? 15 : 3;
  const std::size_t mostTimes = path.prepare == nullptr ? std::size_t{1} << doublings : 64;
  Measures measures;
  for (int round = 0; round < rounds; ++round) {
    for (std::size_t i = 0; i < growthSizes; ++i) {
      const std::size_t times = std::min(mostTimes, std::size_t{1} << (doublings - i));
      const std::size_t before = heapUse().bytes;
      startPeak();
      double seconds = 0;
      for (std::size_t n = 0; n < times;) {
        if (path.prepare != nullptr) path.prepare(i);
        const double start = processorSeconds();
        const std::size_t end = path.prepare == nullptr ? times : n + 1;
        for (; n < end; ++n) path.run(i);
        seconds += processorSeconds() - start;
      }
      seconds /= static_cast<double>(times);
      Measure& least = measures[i];
      least.seconds = round == 0 ? seconds : std::min(least.seconds, seconds);
      least.peak = static_cast<double>(heapUse().peak - before);
    }
  }
  return measures;
}

// The slope of the straight line that fits best where both axes are logarithmic.
double exponentOf(const Measures& measures, const GrowingPath& path, double Measure::*quantity) {
  double x = 0, y = 0, xx = 0, xy = 0;
  for (std::size_t i = 0; i < growthSizes; ++i) {
    const double a = std::log(path.bytes[i]);
    const double b = std::log(measures[i].*quantity);
    x += a, y += b, xx += a * a, xy += a * b;
  }
  constexpr double n = growthSizes;
  return (n * xy - x * y) / (n * xx - x * x);
}

}  // namespace

void printGrowth(std::span<const GrowingPath> paths) {
  std::printf("\ngrowth over %zu doublings\n  %-15s %21s %10s %10s %8s %18s\n", doublings, "",
              "bytes", "ns a byte", "the same", "exponent", "peak, its exponent");
  for (const GrowingPath& path : paths) {
    const Measures measures = measure(path);
    const auto nanosecondsPerByte = [&](std::size_t i) {
      return measures[i].seconds * 1e9 / path.bytes[i];
    };
    const double time = exponentOf(measures, path, &Measure::seconds);
    const double peak = exponentOf(measures, path, &Measure::peak);
    std::printf("  %-15s %9.0f .. %9.0f %10.2f %10.2f %8.2f %9.2fx %7.2f   aim %.1f, %s\n",
                path.name.c_str(), path.bytes.front(), path.bytes.back(), nanosecondsPerByte(0),
                nanosecondsPerByte(growthSizes - 1), time, measures.back().peak / path.bytes.back(),
                peak, exponentAim, std::max(time, peak) <= exponentAim ? "met" : "NOT");
    std::fflush(stdout);
  }
}

}  // namespace bench
