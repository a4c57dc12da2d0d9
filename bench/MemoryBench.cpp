// What the codecs take from the heap, and whether our paths grow in step with their input.
//
//   oxmv_bench_memory
//
//   allocations   of one decode and one encode, of every library, counted
//   kept          the memory that a decoded dictionary holds, in multiples of its stream
//   growth        processor time and peak memory of each of our paths; see Growth.h

#include <algorithm>
#include <array>
#include <cstdio>
#include <exception>
#include <stdexcept>
#include <string>
#include <vector>

#include "Codec.h"
#include "CodecOurs.h"
#include "Corpus.h"
#include "Growth.h"
#include "Heap.h"
#include "Operation.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/values/Array.h"

namespace {

using namespace bench;

constexpr double keptAim = 1.8;

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

struct Inputs {
  std::array<Bytes, growthSizes> streams;
  std::array<oxmv::Dictionary, growthSizes> clips;

  Inputs() {
    for (std::size_t i = 0; i < growthSizes; ++i) {
      streams[i] = CodecOurs::encode(growingClip(std::size_t{1} << i));
      clips[i] = CodecOurs::decode(streams[i]);
    }
  }
};

void printGrowthOfCodec() {
  const Inputs inputs;
  std::vector<GrowingPath> growing;
  for (const Path& path : paths) {
    growing.push_back(
        {path.name, {}, [&](std::size_t i) { path.run(inputs.streams[i], inputs.clips[i]); }});
    for (std::size_t i = 0; i < growthSizes; ++i)
      growing.back().bytes[i] = static_cast<double>(inputs.streams[i].size());
  }
  printGrowth(growing);
}

}  // namespace

int main() {
  try {
    addAll();
    printAllocations();
    printKept();
    printGrowthOfCodec();
#ifdef OXMV_BENCH_FILES
    printGrowthOfFiles();
#endif
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "oxmv_bench_memory: %s\n", error.what());
    return 1;
  }
}
