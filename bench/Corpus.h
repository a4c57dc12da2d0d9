// What the codecs are measured on: many clips of one size, each a dictionary of its own.
//
// Many, because a processor learns the branches of a few by heart: with some dozens of clips every
// figure is half of what a user sees. Tags stand in shuffled order and values are random, the same
// ones on every machine.

#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

#include "oxmv/values/Dictionary.h"

namespace bench {

using Bytes = std::vector<std::uint8_t>;

struct Corpus {
  std::string_view name;
  std::vector<oxmv::Dictionary> clips;  // as decoded, so in the order in which all formats get them
  std::vector<Bytes> streams;           // the same clips as tag streams
  double meanStreamSize = 0;            // bytes
};

// `count` clips of one of three sizes. Every clip has a WBAL.
//
//   small    12 tags                                                                   about 216 bytes
//   typical  60 tags, COL1 of 20 tags, "TAG " group of 15, 5 keywords                       2 KB
//   large    200 tags (170 and a COL1 of 30), 50 control points of 6 tags, 1,000 keywords  30 KB
//
// Throws std::logic_error for another name, and if a clip would not come back from its stream as it
// was.
Corpus makeCorpus(std::string_view name, std::size_t count);

// All three, made at the first call: 2,048 clips of the first two sizes, 128 of the last one.
std::span<const Corpus> corpora();

// One clip of `tagCount` tags that differ from clip to clip (at most 170, the plain ones there are),
// `keywords` keywords and `controlPoints` control points of six tags.
oxmv::Dictionary clipOf(std::uint32_t seed, std::size_t tagCount, std::size_t keywords,
                        std::size_t controlPoints);

}  // namespace bench
