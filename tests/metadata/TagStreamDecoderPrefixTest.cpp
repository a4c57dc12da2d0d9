// Streams that are cut anywhere: every prefix of a good stream, and every tail.

#include <cstddef>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

// A stream in which every way of reading occurs, and where each record's payload ends in it.
struct Parts {
  StreamBuilder stream;
  std::vector<std::size_t> starts, ends;

  void add(std::string_view tag, char type, const Bytes& payload) {
    starts.push_back(stream.bytes().size());
    ends.push_back(stream.bytes().size() + 8 + payload.size());
    stream.record(tag, type, payload);
  }
  Bytes first(std::size_t size) const {
    return {stream.bytes().begin(), stream.bytes().begin() + static_cast<std::ptrdiff_t>(size)};
  }
};

Parts everyWayOfReading() {
  StreamBuilder inner;
  inner.record("SATU", 'f', 0.5f).record("TAGN", 'c', "ISO\0"sv).record("TAGV", 'L', 400);
  inner.record("GUID", 'G', Bytes(16, 3)).record("DSPm", 0, Bytes(7, 9));
  StreamBuilder point;
  point.raw({1, 0, 0, 0, 2, 0, 0, 0}).raw(inner.bytes());

  Parts parts;
  parts.add("PRCS", 'L', {1, 0, 0, 0});
  parts.add("TIMC", 'c', bytesOf("01:02:03:04"));
  parts.add("TIMB", 'B', {24, 0, 0, 0});
  parts.add("TAKE", 'B', {1, 2, 0, 0});
  parts.add("SATU", 'f', {0, 0, 0x80, 0x3F});
  parts.add("WBAL", 'f', Bytes(16, 0x3F));
  parts.add("BADP", 'H', Bytes(13, 1));
  parts.add("GUID", 'G', Bytes(16, 7));
  parts.add("FREE", 'c', Bytes(5, 9));
  parts.add("COL1", 0, inner.bytes());
  parts.add("KWRd", 'c', bytesOf("exterior"));
  parts.add("SCPg", 'H', {5, 0, 0, 0});
  parts.add("DSPm", 0, inner.bytes());
  parts.add("CTLp", 0, point.bytes());
  parts.add("TAGN", 'c', bytesOf("Lens"));
  parts.add("TAGV", 'c', bytesOf("35mm T1.5\0\0"sv));
  parts.add("REGN", 'c', bytesOf("Model\0\0\0"sv));
  parts.add("REGV", 'L', {7, 0, 0, 0});
  parts.add("REGN", 'c', bytesOf("Caf\xE9"));
  parts.add("REGV", 'c', bytesOf("text"));
  parts.add("ZZZZ", 'c', bytesOf("unknown"));
  parts.add("REEL", 'c', bytesOf("A001_C003\0"sv));
  return parts;
}

TEST(TagStreamDecoderPrefix, GivesTheRecordsWhosePayloadIsInIt) {
  const Parts parts = everyWayOfReading();
  const std::size_t whole = parts.stream.bytes().size();
  for (std::size_t size = parts.ends[0]; size <= whole; ++size) {
    std::size_t count = 0;
    while (count < parts.ends.size() && parts.ends[count] <= size) ++count;
    const Bytes records = parts.first(count < parts.starts.size() ? parts.starts[count] : whole);
    const Dictionary tags = decoded(parts.first(size));
    const Dictionary expected = decoded(records);
    ASSERT_EQ(tags, expected) << size;
    ASSERT_EQ(keys(tags), keys(expected)) << size;
  }
}

// The length promises more bytes than are there: what is read is read leniently, and in order.
TEST(TagStreamDecoderPrefix, OfAPromisedLengthGivesNoOtherTags) {
  const Parts parts = everyWayOfReading();
  const auto whole = static_cast<std::int32_t>(parts.stream.bytes().size());
  const Names all = keys(decoded(parts.stream.bytes()));
  for (std::size_t size = 0; size <= parts.stream.bytes().size(); ++size) {
    const Names names = keys(decoded(parts.first(size), whole));
    ASSERT_LE(names.size(), all.size());
    ASSERT_EQ(names, Names(all.begin(), all.begin() + static_cast<std::ptrdiff_t>(names.size())))
        << size;
  }
}

TEST(TagStreamDecoderPrefix, StandingAsANestedStreamGivesTheSame) {
  const Parts parts = everyWayOfReading();
  for (std::size_t size = 1; size <= parts.stream.bytes().size(); ++size) {
    StreamBuilder stream;
    stream.record("COL2", 0, parts.first(size)).record("SHOT", 'B', 1);
    ASSERT_EQ(decoded(stream.bytes()),
              (Dictionary{{"COL2", decoded(parts.first(size))}, {"SHOT", 1}}))
        << size;
  }
}

TEST(TagStreamDecoderPrefix, TailGivesNoMoreTagsThanTheWhole) {
  // Walks that begin in the middle of a record meet tags and sizes that nobody wrote.
  const Parts parts = everyWayOfReading();
  const Bytes& stream = parts.stream.bytes();
  const std::size_t most = decoded(stream).size();
  for (std::size_t start = 0; start <= stream.size(); ++start) {
    const Bytes tail(stream.begin() + static_cast<std::ptrdiff_t>(start), stream.end());
    EXPECT_LE(decoded(tail).size(), most) << start;
  }
}

}  // namespace
}  // namespace oxmv::test
