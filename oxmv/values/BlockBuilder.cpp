#include "oxmv/values/BlockBuilder.h"

#include <new>

#include "oxmv/values/Bytes32.h"
#include "oxmv/values/RadixSort.h"
#include "oxmv/values/Text.h"

namespace oxmv::detail {
namespace {

// Bytes of converted names that a block can hold behind the stream's own: offsets have 32 bits.
constexpr std::size_t maxExtra = 0x7FFFFFFF;

// The first eight bytes of a text as a number; numbers that differ are in the order of their texts.
std::uint64_t startOf(std::string_view text) {
  std::uint64_t start = 0;
  for (const char c : text.substr(0, 8)) start = start << 8 | static_cast<std::uint8_t>(c);
  return text.size() < 8 ? start << (64 - 8 * text.size()) % 64 : start;
}

// The index of an entry whose name came before.
constexpr std::uint32_t inNoGroup = 0xFFFFFFFF;

// With more keys than this a group's keys are followed by their order.
constexpr std::size_t searchedInLine = 16;

// So few are sorted sooner by comparing them.
constexpr std::size_t comparedNames = 128;

}  // namespace

BlockBuilder::Open BlockBuilder::open() {
  const Open outer = open_;
  open_ = {.base = outer.base + outer.count,
           .firstElement = elements_.size(),
           .firstNamed = named_.size()};
  openSlots_.shrink(open_.base);
  openSlots_.extend(mostEntries);
  openKeys_.shrink(open_.base);
  openKeys_.extend(mostEntries);
  std::fill_n(places_.extend(mostEntries), mostEntries, std::uint8_t{0});
  findOpen();
  return outer;
}

Slot BlockBuilder::close(const Open& outer) {
  if (elements_.size() > open_.firstElement) putLists();
  if (named_.size() > open_.firstNamed) putGroups();
  const Slot dictionary = putHeader(Form::dictionary, open_.count, false);
  std::copy_n(open_.slots, open_.count, slots_.extend(open_.count));
  std::copy_n(open_.keys, open_.count, keys_.extend(open_.count));

  elements_.shrink(open_.firstElement);
  named_.shrink(open_.firstNamed);
  places_.shrink(places_.size() - mostEntries);
  open_ = outer;
  if (places_.size() > 0) findOpen();
  return dictionary;
}

// What stands where may have moved with one more.
void BlockBuilder::findOpen() {
  open_.slots = openSlots_.data() + open_.base;
  open_.keys = openKeys_.data() + open_.base;
  open_.placeOfId = places_.data() + places_.size() - mostEntries;
}

Slot BlockBuilder::putHeader(Form form, std::size_t count, bool sorted) {
  const auto index = static_cast<std::uint32_t>(slots_.size());
  slots_.push(
      Header{static_cast<std::uint32_t>(count), sorted, static_cast<std::uint32_t>(keys_.size())}
          .slot());
  return Slot::scalar(form, index);
}

// The entry of a list has been counting its elements. With the first of them the list gets its
// room; from then on its header counts those that are in it.
void BlockBuilder::putLists() {
  const std::span<const Element> elements = elements_.from(open_.firstElement);
  for (auto element = elements.begin(); element != elements.end();) {
    const std::uint32_t place = element->place;
    Slot& list = open_.slots[place - 1];
    if (list.form() == Form::nothing) {
      const std::size_t count = list.body();
      list = putHeader(Form::list, 0, false);
      slots_.extend(count);
    }
    Slot* const header = &slots_[list.body()];
    std::uint32_t count = Header::of(*header).count;
    for (; element != elements.end() && element->place == place; ++element)
      header[++count] = element->slot;
    *header = Header{count, false, 0}.slot();
  }
}

void BlockBuilder::putGroups() {
  for (std::size_t i = open_.firstNamed; i < named_.size(); ++i) {
    const std::uint32_t place = named_[i].place;
    Slot& group = open_.slots[place - 1];
    if (group.form() != Form::nothing) continue;  // put with its first entry
    const std::span<Named> entries = named_.from(i);
    if (entries.size() <= searchedInLine) {
      mergeFew(entries, place);
    } else {
      mergeMany(entries, place);
    }
    group = putGroup(entries);
  }
}

// What is in group_, of the entries that were given.
Slot BlockBuilder::putGroup(std::span<const Named> given) {
  const std::span<const Named> entries = group_.from(0);
  const bool isSorted = given.size() > searchedInLine;
  const Slot dictionary = putHeader(Form::dictionary, entries.size(), isSorted);
  Slot* value = slots_.extend(entries.size());
  for (const Named& entry : entries) *value++ = entry.value;
  Key* key = keys_.extend(entries.size());
  for (const Named& entry : entries) *key++ = keyOf(entry.name);
  if (!isSorted) return dictionary;
  // Behind the keys, their order by text.
  Key* order = keys_.extend(entries.size());
  for (const Ranked& ranked : ranked_.from(0)) *order++ = Key::textAt(given[ranked.entry].index);
  return dictionary;
}

// Leaves in group_ one entry a name, in the order in which the names first came, each with its last
// value.
void BlockBuilder::mergeFew(std::span<const Named> entries, std::uint32_t place) {
  std::uint64_t seen = 0;  // a bit for some names each: a name whose bit is new is new
  group_.shrink(0);
  for (const Named& entry : entries) {
    if (entry.place != place) continue;
    const std::string_view name = textOf(entry.name);
    const auto last = static_cast<std::uint8_t>(name.empty() ? '\0' : name.back());
    const std::uint64_t bit = std::uint64_t{1} << (name.size() * 29 + last) % 64;
    Named* same = nullptr;
    if ((seen & bit) != 0) same = findNamed(name);
    seen |= bit;
    if (same != nullptr) {
      same->value = entry.value;
    } else {
      group_.push(entry);
    }
  }
}

// The entry in group_; null when there is none.
BlockBuilder::Named* BlockBuilder::findNamed(std::string_view name) {
  for (Named& entry : group_.from(0)) {
    if (textOf(entry.name) == name) return &entry;
  }
  return nullptr;
}

// The same by sorting, which no choice of names makes slow. Leaves the order of what it has kept in
// ranked_.
void BlockBuilder::mergeMany(std::span<Named> entries, std::uint32_t place) {
  ranked_.shrink(0);
  for (std::uint32_t i = 0; i < entries.size(); ++i) {
    if (entries[i].place == place) ranked_.push({startOf(textOf(entries[i].name)), i});
  }
  sortByName(entries);
  const std::span<Ranked> ranked = ranked_.from(0);
  std::size_t kept = 0;
  Named* first = nullptr;  // of those of the same name
  for (const Ranked& next : ranked) {
    Named& entry = entries[next.entry];
    if (first != nullptr && textOf(first->name) == textOf(entry.name)) {
      first->value = entry.value;
      entry.index = inNoGroup;
    } else {
      first = &entry;
      ranked[kept++] = next;
    }
  }
  ranked_.shrink(kept);
  group_.shrink(0);
  for (Named& entry : entries) {
    if (entry.place != place || entry.index == inNoGroup) continue;
    entry.index = static_cast<std::uint32_t>(group_.size());
    group_.push(entry);
  }
}

// What is in ranked_: those of the same name in the order in which they came.
void BlockBuilder::sortByName(std::span<const Named> entries) {
  const std::span<Ranked> ranked = ranked_.from(0);
  const auto start = [](const Ranked& entry) { return entry.start; };
  if (ranked.size() <= comparedNames) {
    std::ranges::sort(ranked, {}, start);
  } else {
    spare_.shrink(0);
    radixSort(ranked, std::span(spare_.extend(ranked.size()), ranked.size()), start);
  }
  const auto isBefore = [&](const Ranked& a, const Ranked& b) {
    const auto order = textOf(entries[a.entry].name) <=> textOf(entries[b.entry].name);
    return order != 0 ? order < 0 : a.entry < b.entry;
  };
  for (auto first = ranked.begin(); first != ranked.end();) {
    const auto last = std::find_if(
        first, ranked.end(), [&](const Ranked& other) { return other.start != first->start; });
    if (last - first > 1) std::sort(first, last, isBefore);
    first = last;
  }
}

Slot BlockBuilder::asUtf8(Slot text) {
  // What nearly every name is: short, and not at the end of the bytes.
  if (text.size() < Bytes32::size && bytes_.size() - text.body() >= Bytes32::size) {
    const std::uint32_t inside = (1u << text.size()) - 1;
    if ((Bytes32::at(bytes_.data() + text.body()).notAscii() & inside) == 0) return text;
  }
  const std::string_view raw = textOf(text);
  return isUtf8(raw) ? text : addText(utf8FromLatin1(raw));
}

Slot BlockBuilder::addText(std::string_view text) {
  if (text.size() > maxExtra - extra_.size()) throw std::bad_alloc();
  const auto offset = static_cast<std::uint32_t>(bytes_.size() + extra_.size());
  extra_ += text;
  return Slot::place(Form::text, static_cast<std::uint32_t>(text.size()), offset);
}

Key BlockBuilder::keyOf(Slot name) {
  if (const std::string_view text = textOf(name); Key::fits(text)) return Key::tag(text);
  slots_.push(name);
  return Key::textAt(static_cast<std::uint32_t>(slots_.size() - 1));
}

std::string_view BlockBuilder::textOf(Slot place) const {
  if (place.body() >= bytes_.size())
    return std::string_view(extra_).substr(place.body() - bytes_.size(), place.size());
  return {reinterpret_cast<const char*>(bytes_.data()) + place.body(), place.size()};
}

Ref<const Block> BlockBuilder::block() {
  // What is no longer needed makes room for the block.
  elements_.release();
  named_.release();
  group_.release();
  ranked_.release();
  spare_.release();
  return Block::make(bytes_, extra_, slots_.from(0), keys_.from(0));
}

}  // namespace oxmv::detail
