// Streams and dictionaries that lie in tests/data/ with what they decode and encode to.

#include <algorithm>
#include <cctype>
#include <string>

#include <gtest/gtest.h>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/SampleJson.h"
#include "tests/support/TestData.h"

namespace oxmv::test {
namespace {

std::string testNameOf(const testing::TestParamInfo<std::string>& info) {
  std::string name = info.param;
  std::replace_if(
      name.begin(), name.end(), [](unsigned char c) { return !std::isalnum(c); }, '_');
  return name;
}

class StreamSample : public testing::TestWithParam<std::string> {};

TEST_P(StreamSample, DecodesToTheTagsBesideIt) {
  const Bytes stream = testData("streams/" + GetParam());
  const Dictionary expected = dictionaryFromJson(testData("streams/" + GetParam() + ".json"));
  const Dictionary tags = MetadataDictionary().initWithData(stream).metadata();
  EXPECT_EQ(tags, expected);
  EXPECT_EQ(keys(tags), keys(expected));
}

// However a file is cut, it is read within its bytes.
TEST_P(StreamSample, EveryPrefixDecodes) {
  const Bytes stream = testData("streams/" + GetParam());
  const Names all = keys(decoded(stream));
  for (std::size_t size = 0; size < stream.size(); ++size) {
    const Bytes prefix(stream.begin(), stream.begin() + static_cast<std::ptrdiff_t>(size));
    const Names names = keys(decoded(prefix));
    ASSERT_LE(names.size(), all.size());
    ASSERT_TRUE(std::equal(names.begin(), names.end(), all.begin())) << size;
  }
}

INSTANTIATE_TEST_SUITE_P(TagStream, StreamSample,
                         testing::ValuesIn(testDataNames("streams", ".json")), testNameOf);

class EncodingSample : public testing::TestWithParam<std::string> {
 protected:
  static std::string file(const std::string& ending) { return "encodings/" + GetParam() + ending; }
};

TEST_P(EncodingSample, EncodesExactlyToTheBytesBesideIt) {
  const auto stream = encodeStream(dictionaryFromJson(testData(file(".json"))), Layout::exact);
  EXPECT_EQ(stream, testData(file(".exact.bin")));
}

TEST_P(EncodingSample, EncodesReadablyToTheBytesBesideIt) {
  const auto stream = encodeStream(dictionaryFromJson(testData(file(".json"))), Layout::readable);
  EXPECT_EQ(stream, testData(file(".readable.bin")));
}

INSTANTIATE_TEST_SUITE_P(TagStream, EncodingSample,
                         testing::ValuesIn(testDataNames("encodings", ".json")), testNameOf);

// An empty folder would let the tests above pass without one sample.
TEST(TagStreamSamples, AreThere) {
  EXPECT_GE(testDataNames("streams", ".json").size(), 27u);
  EXPECT_GE(testDataNames("encodings", ".json").size(), 17u);
}

}  // namespace
}  // namespace oxmv::test
