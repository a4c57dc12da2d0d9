#include <array>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/values/Block.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;
using detail::Block;
using detail::Form;
using detail::Header;
using detail::Key;
using detail::Slot;

static_assert(Slot::maxSize >= 2 * 0xFFFFFF, "a name of 24 bits of ISO-8859-1 fits in UTF-8");
static_assert(sizeof(Slot) == 8 && sizeof(Key) == 4, "a block is as small as that");

TEST(Slot, HoldsFormSizeAndPlace) {
  const Slot slot = Slot::place(Form::data, Slot::maxSize, 0xFFFFFFFEu);
  EXPECT_EQ(slot.form(), Form::data);
  EXPECT_EQ(slot.size(), Slot::maxSize);
  EXPECT_EQ(slot.body(), 0xFFFFFFFEu);
}

TEST(Slot, DiffersByFormSizeAndPlace) {
  const Slot slot = Slot::place(Form::data, 3, 5);
  EXPECT_EQ(slot, Slot::place(Form::data, 3, 5));
  EXPECT_NE(slot, Slot::place(Form::text, 3, 5));
  EXPECT_NE(slot, Slot::place(Form::data, 4, 5));
  EXPECT_NE(slot, Slot::place(Form::data, 3, 6));
}

TEST(Slot, MarkOfALentValueLeavesTheRest) {
  const Slot slot = Slot::place(Form::wholeData, Slot::maxSize, 0xFFFFFFFEu);
  EXPECT_FALSE(slot.isLent());
  EXPECT_TRUE(slot.lent().isLent());
  EXPECT_EQ(slot.lent().form(), Form::wholeData);
  EXPECT_EQ(slot.lent().size(), Slot::maxSize);
  EXPECT_EQ(slot.lent().body(), 0xFFFFFFFEu);
  EXPECT_EQ(slot.lent().kept(), slot);
}

TEST(Header, KeepsItsCountBesideTheSortedBit) {
  for (const bool sorted : {false, true}) {
    const Header header = Header::of(Header{0x7FFFFFFF, sorted, 5}.slot());
    EXPECT_EQ(header.count, 0x7FFFFFFFu);
    EXPECT_EQ(header.sorted, sorted);
    EXPECT_EQ(header.firstKey, 5u);
  }
}

TEST(Key, HoldsFourAsciiCharacters) {
  for (const std::string_view text : {"REEL"sv, "TAG "sv, "\0\0\0\0"sv, "\x7F\x7F\x7F\x7F"sv}) {
    EXPECT_TRUE(Key::fits(text));
    EXPECT_TRUE(Key::tag(text).isTag());
    EXPECT_EQ(Key::tag(text).tagText(), text);
  }
  for (const std::string_view text : {""sv, "REE"sv, "REELS"sv,
                                      "\x80"
                                      "EEL"sv,
                                      "R\x80"
                                      "EL"sv,
                                      "RE\x80L"sv, "REE\x80"sv}) {
    EXPECT_FALSE(Key::fits(text)) << text;
  }
}

TEST(Key, HoldsThePlaceOfAnyOtherText) {
  for (const std::uint32_t slot : {0u, 1u, 0x80u, 0x12345678u, 0x7FFFFFFFu}) {
    EXPECT_FALSE(Key::textAt(slot).isTag());
    EXPECT_EQ(Key::textAt(slot).slot(), slot);
  }
  EXPECT_FALSE(Key::textAt(0) == Key::tag("\0\0\0\0"sv));
}

TEST(Block, HoldsCopiesOfAllThatItIsGiven) {
  std::array<std::uint8_t, 3> head = {1, 2, 3};
  std::array<Slot, 2> slots = {Header{1, false, 0}.slot(), Slot::place(Form::text, 2, 2)};
  std::array<Key, 1> keys = {Key::textAt(1)};
  const auto block = Block::make(head, "xy", slots, keys);
  head.fill(0);
  slots.fill({});
  keys.fill(Key::tag("NONE"));

  EXPECT_EQ(std::vector(block->bytes().begin(), block->bytes().end()),
            (std::vector<std::uint8_t>{1, 2, 3, 'x', 'y'}));
  EXPECT_EQ(block->text(Slot::place(Form::text, 2, 3)), "xy");
  EXPECT_EQ(block->keyText(block->keys(0)[0]), "\3x");
}

}  // namespace
}  // namespace oxmv::test
