#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagPicker.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TestData.h"

namespace oxmv::test {
namespace {

std::vector<Value> picked(const Bytes& stream, const std::vector<Tag>& tags) {
  std::vector<Value> values;
  pickTags(stream, tags, values);
  return values;
}

// What a decoder gives.
std::vector<Value> expected(const Bytes& stream, const std::vector<Tag>& tags) {
  const Dictionary all = decodeStream(stream, static_cast<std::int32_t>(stream.size()));
  std::vector<Value> values;
  for (const Tag tag : tags) {
    const auto characters = charactersOf(tag);
    values.push_back(all[{characters.data(), characters.size()}]);
  }
  return values;
}

const std::vector<Tag> plain = {"REEL"_tag, "TIMC"_tag, "DATE"_tag, "SCEN"_tag, "SHOT"_tag,
                                "TAKE"_tag, "LOOK"_tag, "LCRC"_tag, "PROJ"_tag};

std::vector<std::string> samples() { return testDataNames("streams", ".json"); }

TEST(TagPicker, GivesTextsAndNumbers) {
  const Bytes stream = StreamBuilder()
                           .record("REEL", 'c', std::string("A001\0xyz", 8))
                           .record("TAKE", 'B', std::string("\x07\x01\0\0", 4))
                           .record("PROJ", 'B', std::string("\xFF\x01\0\0", 4))
                           .record("LCRC", 'H', std::string("\xFF\xFF\xFF\xFF", 4))
                           .bytes();
  EXPECT_EQ(picked(stream, {"LCRC"_tag, "REEL"_tag, "DATE"_tag, "TAKE"_tag, "PROJ"_tag}),
            (std::vector<Value>{-1, "A001", Value(), 0x107, 255}));
}

TEST(TagPicker, GivesOtherKindsToo) {
  const Bytes stream = testData("streams/typical-clip.colr");
  const std::vector<Tag> tags = {"WBAL"_tag, "SATU"_tag, "REEL"_tag, "COL1"_tag, "TAG "_tag};
  EXPECT_EQ(picked(stream, tags), expected(stream, tags));
  EXPECT_FALSE(picked(stream, tags)[0].isNothing());
}

// No record has the tag that is asked for.
TEST(TagPicker, GivesAGroupThatIsAskedForAlone) {
  const Bytes stream = StreamBuilder()
                           .record("TAGN", 'c', "ISO")
                           .record("TAGV", 'L', 400)
                           .record("REGN", 'c', "gain")
                           .record("REGV", 'L', 3)
                           .bytes();
  EXPECT_EQ(picked(stream, {"TAG "_tag}), (std::vector<Value>{Dictionary{{"ISO", 400}}}));
  EXPECT_EQ(picked(stream, {"REEL"_tag, "REG "_tag}),
            (std::vector<Value>{Value(), Dictionary{{"gain", 3}}}));
}

TEST(TagPicker, LeavesToTheDecoderWhatTakesMoreThanTheRecord) {
  const Bytes stream = StreamBuilder()
                           .record("GHTL", 'H', 1)
                           .record("ZZZZ", 'H', 2)
                           .record("WBAL", 'f', std::string(16, '\0'))
                           .record("TAGN", 'c', "ISO")
                           .record("TAGV", 'L', 400)
                           .record("PROJ", 'B', "")
                           .record("TAKE", 'B', "\x05")
                           .record("PRCS", 'L', "\x05\x06")
                           .bytes();
  const Array zeros = Array::of(0.0f, 0.0f, 0.0f, 0.0f);
  EXPECT_EQ(picked(stream, {"WBAL"_tag}), std::vector<Value>{zeros});
  for (const Tag tag : {"GHTL"_tag, "ZZZZ"_tag, "TAGN"_tag, "TAGV"_tag})
    EXPECT_EQ(picked(stream, {tag}), std::vector<Value>{Value()});
  // Numbers go on behind their record.
  EXPECT_EQ(picked(stream, {"PROJ"_tag}), std::vector<Value>{0x54});  // T
  EXPECT_EQ(picked(stream, {"TAKE"_tag}), std::vector<Value>{5});
  EXPECT_EQ(picked(stream, {"PRCS"_tag}), std::vector<Value>{0x0605});
}

TEST(TagPicker, LastOfSeveralRecordsCounts) {
  const Bytes stream =
      StreamBuilder().record("REEL", 'c', "first").record("REEL", 'c', "second").bytes();
  EXPECT_EQ(picked(stream, {"REEL"_tag}), std::vector<Value>{"second"});
}

TEST(TagPicker, GivesATagAsOftenAsItIsAskedFor) {
  const Bytes stream = StreamBuilder().record("REEL", 'c', "x").bytes();
  EXPECT_EQ(picked(stream, {"REEL"_tag, "TAKE"_tag, "REEL"_tag}),
            (std::vector<Value>{"x", Value(), "x"}));
}

TEST(TagPicker, GivesNothingOfNothing) {
  EXPECT_EQ(picked({}, {"REEL"_tag}), std::vector<Value>{Value()});
  EXPECT_EQ(picked({}, {}), std::vector<Value>());
  std::vector<Value> values = {"old", "values"};
  pickTags({}, plain, values);
  EXPECT_EQ(values, std::vector<Value>(plain.size()));
}

TEST(TagPicker, AgreesWithTheDecoderOnEveryPrefixOfEverySample) {
  ASSERT_GT(samples().size(), 20u);
  for (const std::string& name : samples()) {
    const Bytes stream = testData("streams/" + name);
    for (std::size_t size = 0; size <= stream.size(); ++size) {
      const Bytes prefix(stream.begin(), stream.begin() + static_cast<std::ptrdiff_t>(size));
      ASSERT_EQ(picked(prefix, plain), expected(prefix, plain)) << name << ", " << size;
    }
  }
}

TEST(TagPicker, AgreesWithTheDecoderOnDamagedSamples) {
  std::mt19937 random(20261121);
  for (const std::string& name : samples()) {
    const Bytes stream = testData("streams/" + name);
    for (int i = 0; i < 200 && !stream.empty(); ++i) {
      Bytes damaged = stream;
      for (int k = 0; k < 3; ++k) {
        const std::uint8_t bytes[] = {0x00, 0xFF, 0xBF, 0xFE, static_cast<std::uint8_t>(random())};
        damaged[random() % damaged.size()] = bytes[random() % 5];
      }
      ASSERT_EQ(picked(damaged, plain), expected(damaged, plain)) << name << ", " << i;
    }
  }
}

}  // namespace
}  // namespace oxmv::test
