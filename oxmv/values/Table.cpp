#include "oxmv/values/Table.h"

#include <algorithm>
#include <memory>
#include <utility>

namespace oxmv::detail {
namespace {

// Up to so many entries are searched one by one: dictionaries of tags, which never come to more,
// need no index.
constexpr std::size_t searchedInLine = 256;

bool isOwn(Slot slot) { return slot.form() == HeldEntries::ownForm; }

// Whether the value's payload stands in the block: not that of a number, which the slot holds.
bool isInBlock(Slot slot) { return slot.form() >= Form::text && !isOwn(slot); }

std::size_t countOwnValues(const HeldEntries& entries) {
  if (entries.own == nullptr) return 0;
  return static_cast<std::size_t>(
      std::count_if(entries.slots, entries.slots + entries.count, isOwn));
}

// Added up, for no processor foresees which are numbers.
std::size_t countInBlock(const HeldEntries& entries) {
  std::size_t payloads = 0;
  for (std::size_t i = 0; i < entries.count; ++i)
    payloads += std::size_t{entries.slots[i].form() >= Form::text};
  return payloads - countOwnValues(entries);
}

// How many values and names a table of `entries` has for itself.
std::size_t countOwned(const HeldEntries& entries, bool keepsBlock) {
  const auto isName = [](const Key& key) { return !key.isTag(); };
  const auto names = std::count_if(entries.keys, entries.keys + entries.count, isName);
  const std::size_t values = keepsBlock ? countOwnValues(entries) : entries.count;
  return static_cast<std::size_t>(names) + values;
}

}  // namespace

Ref<Table> Table::make(const HeldEntries& from, std::size_t more) {
  const std::size_t inBlock = countInBlock(from);
  // Where nothing stands in the block it is left, and numbers in slots become the table's own.
  const std::size_t owned = countOwned(from, inBlock != 0);
  const std::size_t mostPlaces = from.count + more;
  const std::size_t mostOwned = owned + more + 1;
  auto table = Ref<Table>::adopt(new (mostPlaces, mostOwned) Table(mostPlaces, mostOwned));
  if (inBlock != 0) {
    from.block->retain();
    table->base_ = Ref<const Block>::adopt(from.block);
    table->streamSize_ = from.streamSize;
    table->inBlock_ = inBlock;
  }
  if (from.own == nullptr && owned == 0) {
    table->takeOverAll(from);
  } else {
    table->takeOverEach(from);
  }
  if (table->places_ > searchedInLine) table->buildIndex();
  return table;
}

Table::Table(std::size_t mostPlaces, std::size_t mostOwned) noexcept
    : mostPlaces_(mostPlaces),
      mostOwned_(mostOwned),
      own_(reinterpret_cast<Value*>(this + 1)),
      slots_(reinterpret_cast<Slot*>(own_ + mostOwned)),
      keys_(reinterpret_cast<Key*>(slots_ + mostPlaces)) {
  static_assert(alignof(Table) >= alignof(Value) && alignof(Value) >= alignof(Slot) &&
                alignof(Slot) >= alignof(Key));
  // Keys are searched past the last one.
  std::fill_n(reinterpret_cast<std::byte*>(keys_), mostPlaces * sizeof(Key) + Block::readAhead,
              std::byte{0});
}

Table::~Table() { std::destroy_n(own_, owned_); }

// The entries of a block, none of them vacant, whose keys are all tags.
void Table::takeOverAll(const HeldEntries& from) noexcept {
  std::copy_n(from.slots, from.count, slots_);
  std::copy_n(from.keys, from.count, keys_);
  places_ = from.count;
}

void Table::takeOverEach(const HeldEntries& from) {
  for (std::size_t place = 0; place < from.count; ++place) {
    if (from.isVacant(place)) continue;
    const Key key = from.keys[place];
    const Slot slot = from.slots[place];
    std::construct_at(keys_ + places_, key.isTag() ? key : keptName(from.nameValue(place)));
    std::construct_at(slots_ + places_, isOwn(slot) || !base_ ? kept(from.value(place)) : slot);
    ++places_;
  }
}

std::optional<std::size_t> Table::find(std::string_view key) const {
  if (index_) {
    const auto found = index_->find(key);
    return found == index_->end() ? std::nullopt : std::optional<std::size_t>(*found);
  }
  const HeldEntries entries = held();
  std::size_t place = 0;
  if (Key::fits(key)) {
    place = entries.find(Key::tag(key));
  } else {
    const auto isThere = [&] {
      return !keys_[place].isTag() && !entries.isVacant(place) && entries.name(place) == key;
    };
    while (place < places_ && !isThere()) ++place;
  }
  return place == places_ ? std::nullopt : std::optional(place);
}

void Table::set(std::string_view key, Value value) {
  const auto place = find(key);
  if (place && isOwn(slots_[*place])) {
    own_[slots_[*place].body()] = std::move(value);
  } else if (place) {
    vacate(slots_[*place]);
    slots_[*place] = kept(std::move(value));
  } else {
    append(key, std::move(value));
  }
}

void Table::append(std::string_view key, Value value) {
  const std::size_t ownedBefore = owned_;
  const Key held = Key::fits(key) ? Key::tag(key) : keptName(Value(key));
  std::construct_at(keys_ + places_, held);
  std::construct_at(slots_ + places_, kept(std::move(value)));
  ++places_;
  try {
    if (index_) {
      index_->insert(static_cast<std::uint32_t>(places_ - 1));
    } else if (places_ > searchedInLine) {
      buildIndex();
    }
  } catch (...) {  // no memory: as if it had not been asked
    --places_;
    std::destroy(own_ + ownedBefore, own_ + owned_);
    owned_ = ownedBefore;
    throw;
  }
}

void Table::remove(std::size_t place) noexcept {
  if (index_) index_->erase(static_cast<std::uint32_t>(place));
  vacate(slots_[place]);
  ++vacant_;
}

// What stood there is no value of the table any more.
void Table::vacate(Slot& slot) noexcept {
  if (isOwn(slot)) own_[slot.body()] = Value();
  if (isInBlock(slot)) --inBlock_;
  slot = Slot();
}

Slot Table::kept(Value value) noexcept {
  std::construct_at(own_ + owned_, std::move(value));
  return Slot::scalar(HeldEntries::ownForm, static_cast<std::uint32_t>(owned_++));
}

Key Table::keptName(Value name) noexcept { return Key::textAt(kept(std::move(name)).body()); }

void Table::buildIndex() {
  Index index(ByKey{this});
  const HeldEntries entries = held();
  for (std::size_t place = 0; place < entries.count; ++place) {
    if (!entries.isVacant(place)) index.insert(static_cast<std::uint32_t>(place));
  }
  index_ = std::move(index);
}

}  // namespace oxmv::detail
