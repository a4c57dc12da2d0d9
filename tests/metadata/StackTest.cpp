// Hosts call the library from threads of theirs, whose stacks may be small.

#include <functional>
#include <string>

#include <gtest/gtest.h>

#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"
#include "tests/support/SmallStack.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TestData.h"

namespace oxmv::test {
namespace {

#ifdef OXMV_ADDRESS_SANITIZER
// The sanitizer surrounds every variable with bytes that nobody may touch, which makes each of the
// 64 frames of a deep stream several times larger.
constexpr std::size_t stackSize = 1024 * 1024;
constexpr std::size_t mayTake = stackSize;
#else
constexpr std::size_t stackSize = 256 * 1024;
#if defined(__OPTIMIZE__) && defined(__x86_64__)
constexpr std::size_t mayTake = 64 * 1024;  // what we promise hosts
#elif defined(__OPTIMIZE__)
// Where a call has more to save, such as at least 160 bytes on s390x.
constexpr std::size_t mayTake = 128 * 1024;
#else
constexpr std::size_t mayTake = stackSize;  // an unoptimised build has a place for every temporary
#endif
#endif

void expectSmallStack(const std::function<void()>& work) {
  EXPECT_LE(stackUsedBy(work, stackSize), mayTake);
}

// Streams nest 64 levels deep; this one deeper, unless told, with something of every kind at every
// level.
Bytes deepStream(int levels = 100) {
  Bytes level;
  for (int i = 0; i < levels; ++i) {
    StreamBuilder outer;
    outer.record("TAGN", 'c', "Caf\xE9").record("TAGV", 'L', i).record("KWRd", 'c', "word");
    const Bytes point = StreamBuilder().raw(Bytes(8, 1)).raw(level).bytes();
    outer.record(i % 2 == 0 ? "CTLp" : "COL1", 0, i % 2 == 0 ? point : level);
    for (int name = 0; name < 20; ++name)
      outer.record("REGN", 'c', std::to_string(name)).record("REGV", 'L', name);
    level = outer.bytes();
  }
  return level;
}

Dictionary decodedFrom(const Bytes& stream) {
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

TEST(Stack, DecodesEncodesComparesAndDropsADeepStream) {
  const Bytes stream = deepStream();
  expectSmallStack([&] {
    const Dictionary tags = decodedFrom(stream);
    EXPECT_EQ(tags.size(), 4u);
    const auto encodedTags = encodeStream(tags, Layout::readable);
    ASSERT_TRUE(encodedTags);
    EXPECT_GT(encodedTags->size(), 64u * 100u);
    EXPECT_TRUE(decodedFrom(stream) == tags);
  });
}

TEST(Stack, ChangesADeepDictionary) {
  const Bytes stream = deepStream();
  expectSmallStack([&] {
    Dictionary tags = decodedFrom(stream);
    tags.set("REEL", "A001");
    const Dictionary copy = tags;
    tags.remove("REG ");
    EXPECT_EQ(copy.size(), 5u);
    EXPECT_EQ(tags.size(), 4u);
  });
}

// Too deep and in twenty ways not to be read back, so that each level has something to explain.
TEST(Stack, FindsTheLossesOfADeepDictionary) {
  Value level(1);
  for (int i = 0; i < 100; ++i) {
    Dictionary outer{{"REEL", "Caf\u00E9"}, {"XXXX", 1}, {"TAKE", "text"}, {"SATU", 1}};
    outer.set(i % 2 == 0 ? "COL1" : "CTLp", i % 2 == 0 ? level : Value(Array::of(level)));
    level = outer;
  }
  expectSmallStack([&] { EXPECT_GT(findLosses(level.dictionary(), Layout::exact).size(), 100u); });
}

TEST(Stack, EditsADeepStream) {
  const Bytes stream = deepStream(60);
  expectSmallStack([&] {
    TagStreamEditor editor(stream);
    const auto error = editor.set("COL1/REEL", "A001");
    EXPECT_FALSE(error);
    EXPECT_GT(editor.stream().size(), stream.size());
  });
}

TEST(Stack, EditsTheDeepestStreamThatIsRead) {
  std::string path;
  for (int i = 0; i < 63; ++i) path += "COL1/";
  path += "REEL";
  expectSmallStack([&] {
    TagStreamEditor editor(Bytes{});
    EXPECT_FALSE(editor.set(path, "A001"));
    EXPECT_FALSE(editor.set(path, "another one"));
    EXPECT_EQ(editor.stream().size(), 63u * 8 + 20);
  });
}

TEST(Stack, RefusesAPathOfManyLevels) {
  std::string path;
  for (int i = 0; i < 100'000; ++i) path += "COL1/";
  path += "PRCS";
  const Bytes streams[] = {{}, deepStream()};
  expectSmallStack([&] {
    for (const Bytes& stream : streams) {
      TagStreamEditor editor(stream);
      const auto error = editor.set(path, 1);
      ASSERT_TRUE(error);
      EXPECT_EQ(codeOf(error->refusal), "too-deep");
      EXPECT_EQ(editor.stream(), stream);
    }
  });
}

TEST(Stack, DecodesEncodesAndDropsAnOrdinaryStream) {
  const Bytes stream = testData("streams/typical-clip.colr");
  expectSmallStack([&] {
    MetadataDictionary clip;
    clip.initWithData(stream);
    EXPECT_TRUE(clip.haveMetadata());
    const auto written = clip.metaDataData();
    ASSERT_TRUE(written);
    EXPECT_FALSE(clip.metadataString().empty());
    clip.init();
  });
}

TEST(Stack, DropsValuesAMillionDeep) {
  expectSmallStack([] {
    Value value(1);
    for (int i = 0; i < 1'000'000; ++i) {
      if (i % 2 == 0) {
        value = Array::of(value);
      } else {
        value = Dictionary{{"COL1", value}};
      }
    }
    EXPECT_EQ(value.kind(), Value::Kind::dictionary);
  });
}

TEST(Stack, DecodesMillionsOfLevelsAndManyNames) {
  StreamBuilder levels, names;
  for (std::uint32_t size = 0xFFFFF0;; size -= 8) {
    levels.header("COL1", size, 0);
    if (size == 0) break;
  }
  for (int i = 0; i < 10'000; ++i)
    names.record("TAGN", 'c', std::to_string(i) + '\xE9').record("TAGV", 'L', i);
  expectSmallStack([&] {
    EXPECT_EQ(decodedFrom(levels.bytes()).size(), 1u);
    EXPECT_EQ(decodedFrom(names.bytes())["TAG "].dictionary().size(), 10'000u);
  });
}

}  // namespace
}  // namespace oxmv::test
