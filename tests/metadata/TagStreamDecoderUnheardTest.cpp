// With nobody listening the decoder has a shorter way through records that are whole. Whatever the
// stream, it gives what the long way gives: decoded() takes both, and compares.

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <optional>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagTable.h"
#include "tests/support/Decoding.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

// Streams made of records of every tag, of sizes about those that matter, with everything between
// them that a stream can hold. The same from run to run.
class StreamMaker {
 public:
  explicit StreamMaker(std::uint32_t seed) : state_(seed) {}

  std::uint32_t below(std::uint32_t bound) {
    state_ = state_ * 1664525u + 1013904223u;  // a linear congruential generator
    return (state_ >> 8) % bound;
  }

  Bytes stream(int level) {
    StreamBuilder made;
    for (std::uint32_t records = below(12); records > 0; --records) addRecord(made, level);
    return made.bytes();
  }

 private:
  void addRecord(StreamBuilder& made, int level) {
    const std::array<char, 4> tag = tagOfNext();
    const std::string_view name(tag.data(), tag.size());
    const char type = "cLBHfG\0\xFF"[below(8)];
    Bytes payload = payloadOf(name, level);
    const std::uint32_t kind = below(40);
    if (kind == 0) {  // a size that wraps
      made.header(name, 0xFFFFFF - below(12), type).raw(payload);
    } else if (kind == 1) {  // a size that is not the payload's
      made.header(name, below(24), type).raw(payload);
    } else {
      made.record(name, type, payload);
    }
    if (below(16) == 0) made.marker(static_cast<std::uint16_t>(below(64)));
    if (below(64) == 0) made.raw(Bytes(below(4), 0xBF));
  }

  // Few tags make most of the records, so that they come again, and names meet values.
  std::array<char, 4> tagOfNext() {
    constexpr std::string_view often[] = {"TAGN", "TAGV", "REGN", "REGV", "COL1", "CTLp", "DSPm",
                                          "KWRd", "SCPg", "GUID", "ZZZZ", "REEL", "PRCS", "WBAL"};
    std::array<char, 4> tag{};
    if (below(2) == 0) {
      const std::string_view text = often[below(std::size(often))];
      std::copy(text.begin(), text.end(), tag.begin());
      return tag;
    }
    const auto rows = tagRows();
    return charactersOf(rows[below(static_cast<std::uint32_t>(rows.size()))].tag);
  }

  Bytes payloadOf(std::string_view tag, int level) {
    const bool isNested = tag == "COL1" || tag == "COL2" || tag == "DSPm" || tag == "CTLp";
    if (isNested && level < 4) {
      StreamBuilder nested;
      nested.raw(Bytes(tag == "CTLp" ? 8 : 0, 1)).raw(stream(level + 1));
      return nested.bytes();
    }
    constexpr std::uint32_t sizes[] = {0, 1, 2, 3, 4, 4, 5, 8, 8, 12, 16, 16, 17, 32, 36, 48};
    Bytes payload(sizes[below(std::size(sizes))]);
    for (std::uint8_t& byte : payload)
      byte = static_cast<std::uint8_t>("ab\0\0\xE9\xC3\xA9z"[below(8)]);
    return payload;
  }

  std::uint32_t state_;
};

Bytes firstOf(const Bytes& stream, std::size_t size) {
  return {stream.begin(), stream.begin() + static_cast<std::ptrdiff_t>(size)};
}

TEST(TagStreamDecoderUnheard, GivesTheSameForRecordsOfEveryTagAndSize) {
  for (const TagRow& row : tagRows()) {
    const std::array<char, 4> tag = charactersOf(row.tag);
    for (std::uint32_t size = 0; size <= 50; ++size) {
      for (const char type : {'c', 'L'}) {
        StreamBuilder stream;
        stream.record("TAGN", 'c', "n").record("REGN", 'c', "n");
        stream.header({tag.data(), 4}, size, type).raw(Bytes((size + 3) & ~3u, 'x'));
        decoded(stream.bytes());
        decoded(stream.bytes(), static_cast<std::int32_t>(stream.bytes().size()) - 3);
        decoded(stream.record({tag.data(), 4}, type, "again").bytes());
      }
    }
  }
}

TEST(TagStreamDecoderUnheard, GivesTheSameForStreamsOfEveryMake) {
  for (std::uint32_t seed = 0; seed < 4000; ++seed) {
    StreamMaker maker(seed);
    const Bytes stream = maker.stream(0);
    myGUID guid;
    decoded(stream, std::nullopt, &guid);
    decoded(stream, static_cast<std::int32_t>(maker.below(200)), &guid);
    decoded(stream, 0x7FFFFFFF, &guid);
    if (HasFailure()) FAIL() << "seed " << seed;
  }
}

TEST(TagStreamDecoderUnheard, GivesTheSameForEveryPrefix) {
  for (std::uint32_t seed = 0; seed < 40; ++seed) {
    const Bytes stream = StreamMaker(seed).stream(0);
    for (std::size_t size = 0; size <= stream.size(); ++size) {
      myGUID guid;
      decoded(firstOf(stream, size), std::nullopt, &guid);
      decoded(firstOf(stream, size), static_cast<std::int32_t>(stream.size()), &guid);
      decoded(stream, static_cast<std::int32_t>(size), &guid);
      if (HasFailure()) FAIL() << "seed " << seed << ", the first " << size;
    }
  }
}

TEST(TagStreamDecoderUnheard, ReadsAMarkerAsATagInFirstPlaceOnly) {
  StreamBuilder stream;
  stream.marker(2).raw({0, 0, 0, 0}).record("TAKE", 'B', 1);
  EXPECT_EQ(decoded(stream.bytes()), (Dictionary{{"TAKE", 1}}));
}

}  // namespace
}  // namespace oxmv::test
