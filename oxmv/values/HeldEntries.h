// The entries of a dictionary as they are held. Internal: for loops in which even a lent handle for
// each entry costs too much.

#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <utility>

#include "oxmv/values/Block.h"
#include "oxmv/values/Value.h"

namespace oxmv::detail {

// Holds as long as the dictionary, unchanged. Entries that were removed leave vacant places, whose
// slots are nothing.
struct HeldEntries {
  const Block* block = nullptr;  // that the slots point into; null if none does
  const Slot* slots = nullptr;
  const Key* keys = nullptr;
  std::size_t count = 0;
  // What does not stand in the block: values whose slots are of the form `ownForm`, and names whose
  // keys are texts. Null: such keys are the block's, and such slots are not there.
  const Value* own = nullptr;
  // Bytes of the stream of which these entries are the outermost; 0 of all others.
  std::size_t streamSize = 0;

  // No slot of a block has it.
  static constexpr Form ownForm = Form::dictionaryBox;

  static HeldEntries of(const Block& block, std::uint32_t headerIndex) {
    const Header header = block.header(headerIndex);
    return {&block,
            block.items(headerIndex),
            block.keys(headerIndex),
            header.count,
            nullptr,
            block.isOutermost(headerIndex) ? block.bytes().size() : 0};
  }

  bool isVacant(std::size_t place) const { return slots[place].form() == Form::nothing; }
  std::string_view name(std::size_t place) const {
    const Key& key = keys[place];
    if (key.isTag()) return key.tagText();
    return own == nullptr ? block->text(block->nameOf(key)) : own[key.slot()].text();
  }
  // The same as a value, of a key that is no tag.
  Value nameValue(std::size_t place) const {
    const Key& key = keys[place];
    return own == nullptr ? Value::in(*block, block->nameOf(key)) : own[key.slot()];
  }
  // The place of a key that is a tag; `count` if there is none.
  std::size_t find(Key tag) const {
    std::size_t place = placeOf(tag, keys, count);
    while (place < count && isVacant(place))
      place += 1 + placeOf(tag, keys + place + 1, count - place - 1);
    return place;
  }
  // `value` becomes that of a place that is not vacant; see Value::borrow.
  void lend(Value& value, std::size_t place) const {
    const Slot slot = slots[place];
    if (slot.form() == ownForm) {
      value.borrow(own[slot.body()]);
    } else {
      value.borrow(*block, slot);
    }
  }
  Value value(std::size_t place) const {
    Value lent;
    lend(lent, place);
    return Value(std::move(lent));  // a share of its own
  }
};

}  // namespace oxmv::detail
