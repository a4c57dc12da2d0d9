// What nobody can do without: memory for a stream's bytes and a copy of them, and a walk that does
// nothing but step from record to record.

#include <cstring>
#include <memory>

#include "Codec.h"
#include "CodecOurs.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/LittleEndian.h"

namespace bench {
namespace {

void copy(const Bytes& stream) {
  const auto made = std::make_unique_for_overwrite<std::uint8_t[]>(stream.size());
  std::memcpy(made.get(), stream.data(), stream.size());
  benchmark::DoNotOptimize(made.get());
  benchmark::ClobberMemory();
}

void walk(const Bytes& stream) {
  std::size_t records = 0;
  for (std::size_t at = 0; stream.size() - at >= oxmv::recordHeaderSize; ++records) {
    const std::uint32_t length = oxmv::recordLength(oxmv::loadLe24(&stream[at + 4]));
    if (length > stream.size() - at) break;
    at += length;
  }
  benchmark::DoNotOptimize(records);
}

void add(std::string_view name, const Corpus& corpus, void (*body)(const Bytes&)) {
  operations().push_back({corpus.name, "floor", name, false, corpus.clips.size(),
                          [&corpus, body](std::size_t first, std::size_t count) {
                            overAll(corpus.streams, first, count, body);
                          }});
}

}  // namespace

void addFloors() {
  for (const Corpus& corpus : corpora()) {
    add(copyFloor, corpus, copy);
    add(walkFloor, corpus, walk);
  }
}

}  // namespace bench
