// What the codecs take from the heap, and whether our paths grow in step with their input.
//
//   oxmv_bench_memory
//
//   allocations   of one decode and one encode, of every library, counted
//   kept          the memory that a decoded dictionary holds, in multiples of its stream
//   growth        processor time and peak memory of each of our paths over ten doublings of the
//                 input: the exponent that fits, 1 for twice as much for twice the input

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <ctime>
#include <exception>
#include <stdexcept>
#include <string>
#include <vector>

#include "Codec.h"
#include "CodecOurs.h"
#include "Corpus.h"
#include "Heap.h"
#include "Operation.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/values/Array.h"

namespace {

using namespace bench;

constexpr double keptAim = 1.8;
constexpr double exponentAim = 1.1;

const char* verdict(bool met) { return met ? "met" : "NOT"; }

// The fewest that decoding and encoding need: the result. A large clip may have a second one on the
// way.
double aimOf(const Operation& operation) {
  return operation.what == nameOf(What::decode) && operation.corpus == "large" ? 2 : 1;
}

void printAllocations() {
  std::printf("allocations a clip\n");
  for (const Operation& operation : operations()) {
    if (operation.what != nameOf(What::decode) && operation.what != nameOf(What::encode)) continue;
    operation.run(0, operation.clips);  // makes the documents, and whatever is made once
    const std::size_t before = heapUse().allocations;
    operation.run(0, operation.clips);
    const double each =
        static_cast<double>(heapUse().allocations - before) / static_cast<double>(operation.clips);
    std::printf("  %-7s %-8s %-21s %9.1f", operation.what.data(), operation.corpus.data(),
                operation.by.data(), each);
    if (operation.by == ours)
      std::printf("   aim %.0f, %s", aimOf(operation), verdict(each <= aimOf(operation)));
    std::printf("\n");
  }
}

void printKept() {
  std::printf("\nmemory of decoded dictionaries, in multiples of their streams\n");
  for (const Corpus& corpus : corpora()) {
    std::vector<oxmv::Dictionary> decoded;
    decoded.reserve(corpus.streams.size());
    const std::size_t before = heapUse().bytes;
    for (const Bytes& stream : corpus.streams) decoded.push_back(CodecOurs::decode(stream));
    const double kept = static_cast<double>(heapUse().bytes - before);
    const double multiple =
        kept / (corpus.meanStreamSize * static_cast<double>(corpus.streams.size()));
    std::printf("  %-8s %5.2f", corpus.name.data(), multiple);
    // Of a dozen tags hardly anything is payload: the aim is for clips as they are.
    if (corpus.name != "small")
      std::printf("   aim %.1f, %s", keptAim, verdict(multiple <= keptAim));
    std::printf("\n");
  }
}

// One path of ours over a clip: a function that is given a stream and the same clip decoded.
struct Path {
  const char* name;
  void (*run)(const Bytes& stream, const oxmv::Dictionary& clip);
};

void decode(const Bytes& stream, const oxmv::Dictionary& /*clip*/) {
  auto decoded = CodecOurs::decode(stream);
  benchmark::DoNotOptimize(&decoded);
}

void encode(const Bytes& /*stream*/, const oxmv::Dictionary& clip) {
  auto encoded = CodecOurs::encode(clip);
  benchmark::DoNotOptimize(&encoded);
}

void edit(const Bytes& stream, const oxmv::Dictionary& /*clip*/) {
  oxmv::TagStreamEditor editor(stream);
  const auto refused = editor.set(
      "WBAL", oxmv::Array::of(newBalance[0], newBalance[1], newBalance[2], newBalance[3]));
  if (refused) throw std::logic_error("an edit was refused: " + refused->message);
  benchmark::DoNotOptimize(&editor);
}

void metadataString(const Bytes& /*stream*/, const oxmv::Dictionary& clip) {
  oxmv::MetadataDictionary metadata;
  metadata.setMetadata(clip);
  const std::string digits = metadata.metadataString();
  benchmark::DoNotOptimize(digits.data());
}

constexpr Path paths[] = {
    {"decode", decode}, {"encode", encode}, {"edit", edit}, {"metadataString", metadataString}};

struct Measure {
  double seconds = 0;  // the least of its rounds
  double peak = 0;     // bytes beyond those that were there
};

constexpr std::size_t doublings = 10;
constexpr std::size_t sizes = doublings + 1;
using Measures = std::array<Measure, sizes>;

struct Inputs {
  std::array<Bytes, sizes> streams;
  std::array<oxmv::Dictionary, sizes> clips;

  Inputs() {
    for (std::size_t i = 0; i < sizes; ++i) {
      streams[i] = CodecOurs::encode(growingClip(std::size_t{1} << i));
      clips[i] = CodecOurs::decode(streams[i]);
    }
  }
};

double processorSeconds() {
  return static_cast<double>(std::clock()) / static_cast<double>(CLOCKS_PER_SEC);
}

// Each round takes all sizes in turn, the small ones so often that all take about the same time.
Measures measure(const Path& path, const Inputs& inputs) {
  constexpr int rounds = 15;
  Measures measures;
  for (int round = 0; round < rounds; ++round) {
    for (std::size_t i = 0; i < sizes; ++i) {
      const std::size_t times = std::size_t{1} << (doublings - i);
      const std::size_t before = heapUse().bytes;
      startPeak();
      const double start = processorSeconds();
      for (std::size_t n = 0; n < times; ++n) path.run(inputs.streams[i], inputs.clips[i]);
      const double seconds = (processorSeconds() - start) / static_cast<double>(times);
      Measure& least = measures[i];
      least.seconds = round == 0 ? seconds : std::min(least.seconds, seconds);
      least.peak = static_cast<double>(heapUse().peak - before);
    }
  }
  return measures;
}

// The slope of the straight line that fits best where both axes are logarithmic.
double exponentOf(const Measures& measures, const Inputs& inputs, double Measure::*quantity) {
  double x = 0, y = 0, xx = 0, xy = 0;
  for (std::size_t i = 0; i < sizes; ++i) {
    const double a = std::log(static_cast<double>(inputs.streams[i].size()));
    const double b = std::log(measures[i].*quantity);
    x += a, y += b, xx += a * a, xy += a * b;
  }
  constexpr double n = sizes;
  return (n * xy - x * y) / (n * xx - x * x);
}

void printGrowth() {
  const Inputs inputs;
  std::printf("\ngrowth from %zu to %zu bytes\n", inputs.streams.front().size(),
              inputs.streams.back().size());
  std::printf("  %-15s %10s %10s %8s %18s\n", "", "ns a byte", "the same", "exponent",
              "peak, its exponent");
  for (const Path& path : paths) {
    const Measures measures = measure(path, inputs);
    const auto nanosecondsPerByte = [&](std::size_t i) {
      return measures[i].seconds * 1e9 / static_cast<double>(inputs.streams[i].size());
    };
    const double time = exponentOf(measures, inputs, &Measure::seconds);
    const double peak = exponentOf(measures, inputs, &Measure::peak);
    std::printf("  %-15s %10.2f %10.2f %8.2f %9.2fx %7.2f   aim %.1f, %s\n", path.name,
                nanosecondsPerByte(0), nanosecondsPerByte(sizes - 1), time,
                measures.back().peak / static_cast<double>(inputs.streams.back().size()), peak,
                exponentAim, verdict(std::max(time, peak) <= exponentAim));
  }
}

}  // namespace

int main() {
  try {
    addAll();
    printAllocations();
    printKept();
    printGrowth();
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "oxmv_bench_memory: %s\n", error.what());
    return 1;
  }
}
