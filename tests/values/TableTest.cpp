#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Table.h"
#include "tests/support/Decoding.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {
namespace {

using detail::HeldEntries;
using detail::Ref;
using detail::Table;

std::string nameIn(const HeldEntries& entries, std::size_t place) {
  return std::string(entries.name(place));
}

TEST(Table, HasRoomForOneMoreWhateverItsKey) {
  for (const std::string_view key : {"REEL", "a key of its own"}) {
    const Ref<Table> table = Table::make({}, 1);
    ASSERT_TRUE(table->hasRoom());
    table->set(key, "x");
    EXPECT_FALSE(table->hasRoom());
    EXPECT_EQ(table->size(), 1u);
    ASSERT_TRUE(table->find(key));
    EXPECT_EQ(table->held().value(*table->find(key)), Value("x"));
  }
}

TEST(Table, HasRoomForAsManyTagsAsItIsAskedFor) {
  const Ref<Table> table = Table::make({}, 100);
  for (int i = 0; i < 100; ++i) {
    ASSERT_TRUE(table->hasRoom()) << i;
    table->set(std::to_string(1000 + i), i);
  }
  EXPECT_FALSE(table->hasRoom());
  for (int i = 0; i < 100; ++i) {
    const auto place = table->find(std::to_string(1000 + i));
    ASSERT_TRUE(place);
    EXPECT_EQ(table->held().value(*place), Value(i));
  }
}

// A place is taken once and for all; another table of the same entries has none that is vacant.
TEST(Table, RemovedEntryLeavesItsPlaceVacant) {
  const Ref<Table> table = Table::make({}, 8);
  for (const char* key : {"AAAA", "a name", "CCCC"}) table->set(key, key);
  table->remove(*table->find("a name"));
  EXPECT_EQ(table->size(), 2u);
  EXPECT_EQ(table->held().count, 3u);
  EXPECT_TRUE(table->held().isVacant(1));
  EXPECT_FALSE(table->find("a name"));
  ASSERT_TRUE(table->hasRoom());
  table->set("a name", 4);
  EXPECT_EQ(table->find("a name"), 3u);

  const Ref<Table> copy = Table::make(table->held(), 1);
  const HeldEntries entries = copy->held();
  ASSERT_EQ(entries.count, 3u);
  EXPECT_EQ(copy->size(), 3u);
  EXPECT_EQ(nameIn(entries, 0), "AAAA");
  EXPECT_EQ(nameIn(entries, 1), "CCCC");
  EXPECT_EQ(nameIn(entries, 2), "a name");
  EXPECT_EQ(entries.value(1), Value("CCCC"));
  EXPECT_EQ(entries.value(2), Value(4));
}

TEST(Table, IsWastefulOnceMostPlacesAreVacant) {
  constexpr int all = 100;
  const Ref<Table> table = Table::make({}, all);
  for (int i = 0; i < all; ++i) table->set(std::to_string(1000 + i), i);
  // Of 100 places 66 are vacant when 34 are not: that is 32 more.
  for (int i = 0; i < 66; ++i) {
    EXPECT_FALSE(table->isWasteful()) << i;
    table->remove(*table->find(std::to_string(1000 + i)));
  }
  EXPECT_TRUE(table->isWasteful());
}

TEST(Table, IsWastefulOnceNothingStandsInItsBlock) {
  const Bytes stream =
      StreamBuilder().record("REEL", 'c', "A001").record("LOOK", 'c', "warm").bytes();
  const Dictionary tags = decoded(stream);
  const Ref<Table> table = Table::make(tags.entries(), 1);
  table->set("REEL", "B002");
  EXPECT_FALSE(table->isWasteful());
  table->set("LOOK", "cold");
  EXPECT_TRUE(table->isWasteful());
}

TEST(Table, TakesOverWhatWasDecoded) {
  const Bytes stream = StreamBuilder()
                           .record("REEL", 'c', std::string_view("A001\0\0\0\0", 8))
                           .record("TAKE", 'B', 3)
                           .bytes();
  const Dictionary tags = decoded(stream);
  const Ref<Table> table = Table::make(tags.entries(), 1);
  EXPECT_EQ(table->size(), 2u);
  EXPECT_EQ(table->held().block, tags.entries().block);
  EXPECT_EQ(table->held().streamSize, stream.size());
  EXPECT_EQ(table->held().value(*table->find("REEL")), Value("A001"));
  table->set("TAKE", 4);
  EXPECT_EQ(table->held().value(*table->find("TAKE")), Value(4));
  EXPECT_EQ(tags["TAKE"], Value(3));
}

}  // namespace
}  // namespace oxmv::test
