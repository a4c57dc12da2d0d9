#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <type_traits>
#include <vector>

#include <gtest/gtest.h>
#include <sys/mman.h>

#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

const Bytes timecode = {'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1', ':', '0', 0};

Bytes guidStream(std::uint8_t byte) {
  return StreamBuilder().record("GUID", 'G', Bytes(24, byte)).bytes();
}

TEST(MetadataDictionary, IsEmptyAtFirst) {
  const MetadataDictionary clip;
  EXPECT_FALSE(clip.haveMetadata());
  EXPECT_TRUE(clip.metadata().empty());
  EXPECT_EQ(clip.GUID(), myGUID());
  EXPECT_FALSE(clip.isSingle());
  EXPECT_EQ(clip.eye(), 0u);
  EXPECT_EQ(clip.metaDataData(), Bytes());
  EXPECT_EQ(clip.metadataString(), "");
  EXPECT_EQ(clip.layout(), Layout::exact);
}

// From streams.

TEST(MetadataDictionary, DataOf12BytesAreDecoded) {
  MetadataDictionary clip;
  clip.initWithData(timecode);
  EXPECT_TRUE(clip.haveMetadata());
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TIMC", "1:0"}}));
}

TEST(MetadataDictionary, DataOf11BytesChangeNothing) {
  const Bytes eleven(timecode.begin(), timecode.end() - 1);
  MetadataDictionary clip;
  clip.initWithData(eleven);
  EXPECT_FALSE(clip.haveMetadata());

  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  clip.initWithData(eleven);
  clip.initWithData({});
  EXPECT_EQ(clip.metadata(), (Dictionary{{"REEL", "A001"}}));
}

TEST(MetadataDictionary, BytesAreDecodedWhateverTheirLength) {
  MetadataDictionary clip;
  clip.initWithBytes(Bytes{'T', 'I', 'M', 'B', 1, 0, 0, 'B', 24}, 9);
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TIMB", 24}}));
}

TEST(MetadataDictionary, LengthOf0OrLessTakesAwayTheTags) {
  for (const std::int32_t length : {0, -1}) {
    MetadataDictionary clip;
    clip.setMetadata(Dictionary{{"REEL", "A001"}});
    clip.initWithBytes(timecode, length);
    EXPECT_FALSE(clip.haveMetadata());
  }
}

TEST(MetadataDictionary, LengthMayBeShorterThanTheBytes) {
  StreamBuilder stream;
  stream.raw(timecode).record("TAKE", 'B', 1);
  MetadataDictionary clip;
  clip.initWithBytes(stream.bytes(), 12);
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TIMC", "1:0"}}));
}

TEST(MetadataDictionary, StreamReplacesTheTagsAndNothingElse) {
  MetadataDictionary clip;
  clip.initWithData(guidStream(0x11));
  clip.setLayout(Layout::readable);
  const myGUID guid = clip.GUID();
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  clip.initWithData(timecode);
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TIMC", "1:0"}}));
  EXPECT_EQ(clip.GUID(), guid);
  EXPECT_EQ(clip.layout(), Layout::readable);
}

TEST(MetadataDictionary, MalformedStreamGivesWhatCouldBeRead) {
  StreamBuilder stream;
  stream.raw(timecode).header("FREE", 1000, 'c').raw({1, 2, 3});
  EXPECT_EQ(MetadataDictionary().initWithData(stream.bytes()).metadata(),
            (Dictionary{{"TIMC", "1:0"}}));
}

TEST(MetadataDictionary, DataOf2GibibytesAreOfNegativeLength) {
  // Nothing of such data is looked at, so that the pages need not exist.
  constexpr std::size_t size = std::size_t{1} << 31;
  void* pages = mmap(nullptr, size, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
  if (pages == MAP_FAILED) GTEST_SKIP() << "no room for 2 GiB of addresses";
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  clip.initWithData({static_cast<const std::uint8_t*>(pages), size});
  EXPECT_FALSE(clip.haveMetadata());
  munmap(pages, size);
}

TEST(MetadataDictionary, ProcessedBytesLeaveTheTagsAlone) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  EXPECT_EQ(clip.processBytes(timecode, 12), (Dictionary{{"TIMC", "1:0"}}));
  EXPECT_EQ(clip.metadata(), (Dictionary{{"REEL", "A001"}}));
}

TEST(MetadataDictionary, ObserverIsHeard) {
  Witness first, second, third;
  MetadataDictionary clip;
  clip.processBytes(timecode, 12, &first);
  clip.initWithBytes(timecode, 12, &second);
  clip.initWithData(timecode, &third);
  for (const Witness* witness : {&first, &second, &third}) EXPECT_EQ(witness->visits.size(), 1u);
}

TEST(MetadataDictionary, DecodingThatFailsChangesNothing) {
  class Thrower final : public StreamObserver {
    void onRecord(const Record& record) override {
      if (record.tag == "TAKE"_tag) throw std::runtime_error("enough");
    }
  } thrower;
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  StreamBuilder stream;
  stream.raw(guidStream(0x11)).record("TAKE", 'B', 1);
  EXPECT_THROW(clip.initWithData(stream.bytes(), &thrower), std::runtime_error);
  EXPECT_EQ(clip.metadata(), (Dictionary{{"REEL", "A001"}}));
  EXPECT_EQ(clip.GUID(), myGUID());
}

// The identity.

TEST(MetadataDictionary, GuidRecordIsTheIdentity) {
  MetadataDictionary clip;
  clip.initWithData(guidStream(0x42));
  EXPECT_EQ(guidText(clip.GUID()), "42424242-4242-4242-4242-424242424242");
  EXPECT_EQ(clip.metadata(), (Dictionary{{"GUID", Value::data(Bytes(24, 0x42))}}));
}

TEST(MetadataDictionary, ProcessedGuidRecordIsTheIdentityToo) {
  MetadataDictionary clip;
  clip.processBytes(guidStream(0x42), 32);
  EXPECT_EQ(clip.GUID().Data2, 0x4242);
  EXPECT_FALSE(clip.haveMetadata());
}

// init.

TEST(MetadataDictionary, InitOfATemporaryGivesItByValue) {
  const auto loaded = [] { return MetadataDictionary().initWithData(guidStream(0x42)); };
  const MetadataDictionary clip = loaded().init();
  EXPECT_FALSE(clip.haveMetadata());
  EXPECT_EQ(clip.GUID(), loaded().GUID());
  static_assert(std::is_same_v<decltype(MetadataDictionary().init()), MetadataDictionary>);
}

TEST(MetadataDictionary, InitTakesAwayTheTags) {
  MetadataDictionary clip;
  clip.initWithData(timecode);
  clip.init();
  EXPECT_FALSE(clip.haveMetadata());
  EXPECT_FALSE(clip.isSingle());
  EXPECT_EQ(clip.eye(), 0u);
}

TEST(MetadataDictionary, InitKeepsTheIdentity) {
  MetadataDictionary clip;
  clip.initWithData(guidStream(0x42));
  const myGUID guid = clip.GUID();
  clip.init();
  EXPECT_EQ(clip.GUID(), guid);
  EXPECT_NE(guid.Data2, 0);
}

TEST(MetadataDictionary, InitialisersAnswerTheObject) {
  MetadataDictionary clip;
  EXPECT_EQ(&clip.init(), &clip);
  EXPECT_EQ(&clip.initWithData(timecode), &clip);
  EXPECT_EQ(&clip.initWithData({}), &clip);
  EXPECT_EQ(&clip.initWithBytes(timecode, 12), &clip);
}

// Tags in and out.

TEST(MetadataDictionary, HandsOutACopy) {
  MetadataDictionary clip;
  Dictionary tags = clip.metadata();
  tags.set("REEL", "A001");
  EXPECT_FALSE(clip.haveMetadata());

  clip.initWithData(timecode);
  tags = clip.metadata();
  tags.set("TIMC", "2:0");
  tags.set("REEL", "A001");
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TIMC", "1:0"}}));
}

TEST(MetadataDictionary, TakesInACopy) {
  Dictionary tags{{"REEL", "A001"}};
  MetadataDictionary clip;
  clip.setMetadata(tags);
  EXPECT_TRUE(clip.haveMetadata());
  tags.set("REEL", "B002");
  tags.set("TAKE", 1);
  EXPECT_EQ(clip.metadata(), (Dictionary{{"REEL", "A001"}}));
}

TEST(MetadataDictionary, SetMetadataReplacesAllTags) {
  MetadataDictionary clip;
  clip.initWithData(timecode);
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  EXPECT_EQ(clip.metadata(), (Dictionary{{"REEL", "A001"}}));
}

TEST(MetadataDictionary, SetMetadataOfNoneGivesNoTags) {
  MetadataDictionary clip;
  clip.initWithData(timecode);
  clip.setMetadata(std::nullopt);
  EXPECT_FALSE(clip.haveMetadata());
  EXPECT_TRUE(clip.metadata().empty());
}

TEST(MetadataDictionary, EmptyDictionaryIsNoMetadata) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary());
  EXPECT_FALSE(clip.haveMetadata());
}

TEST(MetadataDictionary, RemovesATag) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"REEL", "A001"}, {"TAKE", 1}});
  clip.removeObject("REEL");
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TAKE", 1}}));
}

TEST(MetadataDictionary, RemovingAnAbsentTagChangesNothing) {
  MetadataDictionary clip;
  clip.removeObject("REEL");
  EXPECT_FALSE(clip.haveMetadata());
  clip.setMetadata(Dictionary{{"TAKE", 1}});
  clip.removeObject("REEL");
  clip.removeObject("take");
  EXPECT_EQ(clip.metadata(), (Dictionary{{"TAKE", 1}}));
}

TEST(MetadataDictionary, CopiesAreIndependent) {
  MetadataDictionary original;
  original.initWithData(guidStream(0x11));
  original.setMetadata(Dictionary{{"REEL", "A001"}, {"TAKE", 1}});
  MetadataDictionary copy = original;
  copy.removeObject("REEL");
  copy.initWithData(guidStream(0x22));
  copy.setLayout(Layout::readable);
  EXPECT_EQ(original.metadata(), (Dictionary{{"REEL", "A001"}, {"TAKE", 1}}));
  EXPECT_EQ(original.GUID().Data2, 0x1111);
  EXPECT_EQ(original.layout(), Layout::exact);

  original.init();
  EXPECT_EQ(copy.metadata(), (Dictionary{{"GUID", Value::data(Bytes(24, 0x22))}}));
}

// To streams.

TEST(MetadataDictionary, EncodesItsTags) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"TIMC", "1:0"}});
  EXPECT_EQ(clip.metaDataData(), timecode);
}

TEST(MetadataDictionary, EncodesAnyDictionary) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"TAKE", 1}});
  EXPECT_EQ(clip.parseMetadata(Dictionary{{"TIMC", "1:0"}}), timecode);
  EXPECT_EQ(clip.parseMetadata(Dictionary()), Bytes());
  EXPECT_EQ(clip.parseMetadata(std::nullopt), Bytes());
}

TEST(MetadataDictionary, LayoutIsTheObjectsUnlessACallSaysOtherwise) {
  const Dictionary tags{{"FREE", Value::data(Bytes{1})}};
  const Bytes exact = {'F', 'R', 'E', 'E', 1, 0, 0, 'c', 1};
  const Bytes readable = {'F', 'R', 'E', 'E', 1, 0, 0, 'c', 1, 0, 0, 0};
  MetadataDictionary clip;
  clip.setMetadata(tags);
  EXPECT_EQ(clip.metaDataData(), exact);
  EXPECT_EQ(clip.metaDataData(Layout::readable), readable);
  EXPECT_EQ(clip.parseMetadata(tags, Layout::readable), readable);
  clip.setLayout(Layout::readable);
  EXPECT_EQ(clip.layout(), Layout::readable);
  EXPECT_EQ(clip.metaDataData(), readable);
  EXPECT_EQ(clip.parseMetadata(tags), readable);
  EXPECT_EQ(clip.metaDataData(Layout::exact), exact);
  clip.init();
  EXPECT_EQ(clip.layout(), Layout::readable);
}

TEST(MetadataDictionary, StringIsTheStreamInLowerCaseHexadecimal) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"TIMC", "1:0"}, {"LCRC", 0x0FAB00CD}});
  EXPECT_EQ(clip.metadataString(),
            "54494d4304000063313a3000"
            "4c43524304000048cd00ab0f");
}

TEST(MetadataDictionary, StringFollowsTheLayout) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"FREE", Value::data(Bytes{1})}});
  EXPECT_EQ(clip.metadataString(), "465245450100006301");
  clip.setLayout(Layout::readable);
  EXPECT_EQ(clip.metadataString(), "465245450100006301000000");
}

TEST(MetadataDictionary, WithoutMemoryThereIsNoStream) {
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"TIMC", "1:0"}});
  std::optional<Bytes> stream = Bytes();
  {
    const MemoryShortage shortage(0);
    stream = clip.metaDataData();
  }
  EXPECT_EQ(stream, std::nullopt);
}

// Threads.

TEST(MetadataDictionary, ThreadsAtOnceUseTheirOwn) {
  const Bytes stream = StreamBuilder()
                           .record("REEL", 'c', "A001")
                           .record("WBAL", 'f', Bytes(16, 0))
                           .record("TAKE", 'B', Bytes{3, 0, 0, 0})
                           .bytes();
  std::vector<Dictionary> results(4);
  std::vector<std::thread> threads;
  for (std::size_t number = 0; number < results.size(); ++number) {
    threads.emplace_back([&stream, &result = results[number]] {
      for (int i = 0; i < 50; ++i) {
        auto clip = MetadataDictionary().initWithData(stream);
        clip.addObject("B002", "REEL");
        TagStreamEditor editor(clip.metaDataData().value());
        const auto error = editor.set("COL1/REEL", "nested");
        clip.initWithData(editor.stream());
        result = clip.metadata();
        if (error || !findLosses(result, Layout::readable).empty()) result = {};
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(results[0]["REEL"], Value("B002"));
  for (const Dictionary& result : results) EXPECT_EQ(result, results[0]);
}

}  // namespace
}  // namespace oxmv::test
