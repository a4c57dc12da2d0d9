#include "oxmv/metadata/TagStreamDecoder.h"

#include <algorithm>
#include <array>
#include <memory_resource>
#include <new>
#include <optional>
#include <string>
#include <vector>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Text.h"

namespace oxmv {

using detail::Block;
using detail::Form;
using detail::Header;
using detail::Key;
using detail::Slot;

namespace {

// The bytes of one stream, as offsets into the outermost one. No read on the stream's behalf goes
// past `end`.
struct Extent {
  std::size_t begin;
  std::size_t end;
};

// Where a record stands in its stream, and how much is behind it.
struct Place {
  std::size_t payload;  // offset of its payload
  std::size_t
      available;  // bytes from there to the end of the stream, its own payload and what follows
};

// The names that wait for their values: each walk has its own.
struct PendingNames {
  std::optional<Slot> tag, reg;
  Record tagRecord, regRecord;  // for the observer
};

// Something that a walk has read, not yet put in its place in the dictionary.
struct Reading {
  std::uint8_t row;  // index into tagRows()
  Slot slot;         // in a group: the name; its value is the reading behind it
};

// Bytes of converted names that a block can hold behind the stream's own: offsets have 32 bits.
constexpr std::size_t maxExtra = 0x7FFFFFFF;

constexpr std::size_t maxStream = 0x7FFFFFFF;

// With more keys than this a group's keys are followed by their order.
constexpr std::size_t searchedInLine = 16;

bool takesWholePayload(const Record& record) {
  switch (record.row->read) {
    case Read::floats:
    case Read::integers:
    case Read::data:
    case Read::guid:
    case Read::nested:
    case Read::texts:
    case Read::nestedList:
    case Read::controlPoint:
    case Read::tagName:
    case Read::regName: return true;
    case Read::tagValue: return record.type == recordType::text;
    case Read::regValue: return record.type != recordType::integerL;
    case Read::none:
    case Read::text:
    case Read::int32:
    case Read::uint8:
    case Read::uint16:
    case Read::float32:
    case Read::ints: return false;
  }
  return false;
}

bool isList(Read rule) {
  return rule == Read::texts || rule == Read::ints || rule == Read::nestedList ||
         rule == Read::controlPoint;
}

bool isGroup(Write rule) { return rule == Write::tagGroup || rule == Write::regGroup; }

std::uint8_t indexOf(const TagRow& row) {
  return static_cast<std::uint8_t>(&row - tagRows().data());
}

class Decoder {
 public:
  Decoder(std::span<const std::uint8_t> bytes, myGUID* guid, StreamObserver* observer)
      : bytes_(bytes.first(std::min(bytes.size(), maxStream))),
        guid_(guid),
        observer_(observer),
        overlapLeft_(bytes_.size()) {
    readings_.reserve(192);
    slots_.reserve(256);
    keys_.reserve(256);
  }

  Dictionary decode(std::int32_t length) {
    const Slot root = decodeExtent({0, bytes_.size()}, length, 0, nullptr);
    if (Header::of(slots_[root.body]).count == 0) return {};
    const auto block = Block::make(bytes_, extra_, slots_, keys_);
    return Value::in(*block, root).dictionary();
  }

 private:
  // One stream: the slot of its dictionary. `controlPoint`, if not null, is one more value in it.
  Slot decodeExtent(Extent stream, std::int64_t length, int level, const Slot* controlPoint) {
    const std::size_t first = readings_.size();
    walk(stream, length, level);
    const Slot dictionary = putDictionary(first, controlPoint);
    readings_.erase(readings_.begin() + static_cast<std::ptrdiff_t>(first), readings_.end());
    return dictionary;
  }

  // The walk over the records of one stream; appends what it reads to readings_.
  void walk(Extent stream, std::int64_t length, int level) {
    if (length <= 0) return;
    PendingNames names;
    std::int64_t consumed = 0;  // markers are not counted
    std::int64_t limit = length;
    std::size_t at = stream.begin;
    // The first record is read whatever its size; those behind it only if they end within the
    // limit.
    for (bool isFirst = true;; isFirst = false) {
      if (!isFirst && !stepOverMarker(stream, at, limit, level)) break;
      if (bytesLeft(stream, at) < recordHeaderSize) {
        stop(stream, at, level, SkipReason::cutHeader, nullptr);
        break;
      }
      const Record record = recordAt(stream, at, level);
      if (!isFirst && consumed + std::int64_t{recordHeaderSize} + record.size > limit) {
        stop(stream, at, level, SkipReason::truncatedRecord, &record);
        break;
      }
      if (!mayOverlap(record)) {
        stop(stream, at, level, SkipReason::overlappingRecord, &record);
        break;
      }
      if (observer_ != nullptr) observer_->onRecord(record);
      if (!interpret(record, {at + recordHeaderSize, stream.end - at - recordHeaderSize}, names)) {
        stop(stream, at, level, SkipReason::incompleteRecord, &record);
        break;
      }
      if (record.length == 0) {
        stop(stream, at, level, SkipReason::lengthZero, &record);
        break;
      }
      consumed += record.length;
      at += record.length;
      if (consumed >= limit) break;
    }
    if (names.tag) skip(names.tagRecord, SkipReason::nameWithoutValue);
    if (names.reg) skip(names.regRecord, SkipReason::nameWithoutValue);
  }

  static std::size_t bytesLeft(Extent stream, std::size_t at) {
    return at < stream.end ? stream.end - at : 0;
  }

  // A marker raises the limit, and takes 4 bytes that are counted nowhere. Answers false when it is
  // cut off.
  bool stepOverMarker(Extent stream, std::size_t& at, std::int64_t& limit, int level) {
    const std::size_t left = bytesLeft(stream, at);
    if (left < 2 || bytes_[at] != markerBytes[0] || bytes_[at + 1] != markerBytes[1]) return true;
    if (left < markerSize) {
      stop(stream, at, level, SkipReason::cutMarker, nullptr);
      return false;
    }
    const std::uint32_t raise = 4u * (bytes_[at + 2] * 256u + bytes_[at + 3]);
    if (observer_ != nullptr) observer_->onMarker(at, raise, level);
    limit += raise;
    at += markerSize;
    return true;
  }

  Record recordAt(Extent stream, std::size_t at, int level) const {
    const std::uint8_t* header = bytes_.data() + at;
    Record record;
    record.offset = at;
    record.tag = Tag{loadLe32(header)};
    record.size = loadLe24(header + 4);
    record.type = header[7];
    record.length = recordLength(record.size);
    record.level = level;
    record.row = findTagRow(record.tag);
    const std::size_t payload = at + recordHeaderSize;
    record.payload =
        bytes_.subspan(payload, std::min<std::size_t>(record.size, stream.end - payload));
    return record;
  }

  // A length that wrapped to 4 or 8 makes the next record stand in this one's payload. A few such
  // records may claim the same bytes over and over; together they get as many as the outermost
  // stream has.
  bool mayOverlap(const Record& record) {
    const bool overlaps = record.length != 0 && record.length < record.size;
    if (!overlaps) return true;
    if (record.payload.size() > overlapLeft_) return false;
    overlapLeft_ -= record.payload.size();
    return true;
  }

  // Reads a record by the rule of its tag. Answers false when it needs bytes that are not there: it
  // is left out, and the walk ends.
  bool interpret(const Record& record, Place place, PendingNames& names) {
    if (record.row == nullptr || record.row->read == Read::none) {
      skip(record, SkipReason::unknownTag);
      return true;
    }
    if (takesWholePayload(record) && record.payload.size() < record.size) return false;
    switch (record.row->read) {
      case Read::none: break;
      case Read::text: store(record, payloadAs(Form::textToNul, record, place)); break;
      case Read::int32:
      case Read::uint8:
      case Read::uint16:
      case Read::float32:
      case Read::ints:
        if (const auto number = readNumber(record, place)) store(record, *number);
        break;
      case Read::floats:
        if (record.size == record.row->count * 4u) {
          store(record, payloadAs(Form::floats, record, place));
        } else {
          skip(record, SkipReason::wrongSize);
        }
        break;
      case Read::integers: store(record, payloadAs(Form::integers, record, place)); break;
      case Read::guid: takeGuid(place); [[fallthrough]];
      case Read::data: store(record, payloadAs(Form::data, record, place)); break;
      case Read::texts: store(record, payloadAs(Form::text, record, place)); break;
      case Read::nested:
      case Read::nestedList:
      case Read::controlPoint: interpretNested(record, place); break;
      case Read::tagName:
        takeName(record, withoutPadding(record, place), names.tag, names.tagRecord);
        break;
      case Read::regName:
        takeName(record, payloadAs(Form::text, record, place), names.reg, names.regRecord);
        break;
      case Read::tagValue: interpretValue(record, place, "TAG "_tag, names.tag); break;
      case Read::regValue: interpretValue(record, place, "REG "_tag, names.reg); break;
    }
    return true;
  }

  static Slot payloadAs(Form form, const Record& record, Place place) {
    return Slot::place(form, static_cast<std::uint32_t>(record.payload.size()),
                       static_cast<std::uint32_t>(place.payload));
  }

  // The payload as text, without the NULs at its end.
  static Slot withoutPadding(const Record& record, Place place) {
    std::size_t size = record.payload.size();
    while (size > 0 && record.payload[size - 1] == 0) --size;
    return Slot::place(Form::text, static_cast<std::uint32_t>(size),
                       static_cast<std::uint32_t>(place.payload));
  }

  // A number takes its own bytes whatever the record's size, also from behind the payload, while
  // they are there.
  std::optional<Slot> readNumber(const Record& record, Place place) {
    const Read rule = record.row->read;
    const std::size_t width = rule == Read::uint8 ? 1 : rule == Read::uint16 ? 2 : 4;
    if (place.available < width) {
      skip(record, SkipReason::shortPayload);
      return std::nullopt;
    }
    const std::uint8_t* payload = bytes_.data() + place.payload;
    const std::uint32_t word = width == 1   ? payload[0]
                               : width == 2 ? loadLe16(payload)
                                            : loadLe32(payload);
    return Slot::scalar(rule == Read::float32 ? Form::float32 : Form::integer, word);
  }

  // As many bytes as a myGUID takes, whatever the record's size.
  void takeGuid(Place place) {
    if (guid_ == nullptr) return;
    copyOverImage(*guid_, bytes_.subspan(place.payload, std::min(place.available, sizeof(myGUID))));
  }

  void interpretNested(const Record& record, Place place) {
    const Read rule = record.row->read;
    const bool isControlPoint = rule == Read::controlPoint;
    if (rule == Read::nested && record.size == 0) return skip(record, SkipReason::emptyNested);
    if (isControlPoint && place.available < controlPointSize)
      return skip(record, SkipReason::shortPayload);
    if (record.level + 1 >= maxNesting) return skip(record, SkipReason::tooDeep);
    const std::uint32_t before = isControlPoint ? controlPointSize : 0;
    const std::int64_t length = std::int64_t{record.size} - before;
    const std::size_t begin = place.payload + before;
    const Extent stream{begin, begin + static_cast<std::size_t>(std::max<std::int64_t>(length, 0))};
    const Slot point =
        Slot::place(Form::integers, controlPointSize, static_cast<std::uint32_t>(place.payload));
    const Slot nested =
        decodeExtent(stream, length, record.level + 1, isControlPoint ? &point : nullptr);
    readings_.push_back({indexOf(*record.row), nested});
  }

  // A name that is still waiting is given up for the new one.
  void takeName(const Record& record, Slot name, std::optional<Slot>& pending,
                Record& pendingRecord) {
    if (pending) skip(pendingRecord, SkipReason::nameWithoutValue);
    pending = asUtf8(name);
    pendingRecord = record;
    announce(record, name);
  }

  void interpretValue(const Record& record, Place place, Tag group, std::optional<Slot>& name) {
    if (!name) return skip(record, SkipReason::valueWithoutName);
    std::optional<Slot> value;
    if (!takesWholePayload(record)) {
      value = readNumber(record, place);
    } else if (record.row->read == Read::tagValue) {
      value = withoutPadding(record, place);
    } else {
      value = payloadAs(Form::text, record, place);
    }
    if (!value) return;
    announce(record, *value);
    const std::uint8_t row = indexOf(*findTagRow(group));
    readings_.push_back({row, *name});
    readings_.push_back({row, *value});
    name.reset();
  }

  void store(const Record& record, Slot slot) {
    announce(record, slot);
    readings_.push_back({indexOf(*record.row), slot});
  }

  // The same name in UTF-8: where it is not, a converted copy behind the stream's own bytes.
  Slot asUtf8(Slot name) {
    const std::string_view raw = textOf(name);
    if (isUtf8(raw)) return name;
    const std::string converted = utf8FromLatin1(raw);
    return putExtra(converted);
  }

  Slot putExtra(std::string_view text) {
    static_assert(2 * maxRecordSize <= Slot::maxSize, "each byte of a name becomes at most two");
    if (text.size() > maxExtra - extra_.size()) throw std::bad_alloc();
    const auto offset = static_cast<std::uint32_t>(bytes_.size() + extra_.size());
    extra_ += text;
    return Slot::place(Form::text, static_cast<std::uint32_t>(text.size()), offset);
  }

  std::string_view textOf(Slot place) const {
    if (place.body >= bytes_.size())
      return std::string_view(extra_).substr(place.body - bytes_.size(), place.size());
    return {reinterpret_cast<const char*>(bytes_.data()) + place.body, place.size()};
  }

  // Puts the readings from `first` on in their places: one entry a tag, in the order in which the
  // tags first came. A list takes all its tag's readings, a group makes a dictionary of them, any
  // other tag keeps the last.
  Slot putDictionary(std::size_t first, const Slot* controlPoint) {
    placeOfRow_.fill(0);
    std::size_t count = 0;
    for (std::size_t i = first; i < readings_.size(); ++i) {
      const Reading& reading = readings_[i];
      std::uint8_t& place = placeOfRow_[reading.row];
      if (place == 0) {
        items_[count] = {reading.row, {}};
        place = static_cast<std::uint8_t>(++count);
      }
      items_[place - 1u].slot = reading.slot;
    }
    for (Item& item : std::span(items_).first(count)) {
      const TagRow& row = tagRows()[item.row];
      if (isList(row.read)) item.slot = putList(first, item.row);
      if (isGroup(row.write)) item.slot = putGroup(first, item.row);
    }
    std::optional<Key> pointKey;
    if (controlPoint != nullptr) pointKey = keyOfControlPoint();

    const Slot dictionary = putHeader(Form::dictionary, count + (pointKey ? 1 : 0), false);
    for (const Item& item : std::span(items_).first(count)) {
      slots_.push_back(item.slot);
      const std::array<char, 4> characters = charactersOf(tagRows()[item.row].tag);
      keys_.push_back(Key::tag({characters.data(), characters.size()}));
    }
    if (pointKey) {
      slots_.push_back(*controlPoint);
      keys_.push_back(*pointKey);
    }
    return dictionary;
  }

  Slot putHeader(Form form, std::size_t count, bool sorted) {
    const auto index = static_cast<std::uint32_t>(slots_.size());
    slots_.push_back(
        Header{static_cast<std::uint32_t>(count), sorted, static_cast<std::uint32_t>(keys_.size())}
            .slot());
    return Slot::scalar(form, index);
  }

  Slot putList(std::size_t first, std::uint8_t row) {
    const Slot list = putHeader(Form::list, 0, false);
    const std::size_t elements = slots_.size();
    for (std::size_t i = first; i < readings_.size(); ++i) {
      if (readings_[i].row == row) slots_.push_back(readings_[i].slot);
    }
    slots_[list.body] =
        Header{static_cast<std::uint32_t>(slots_.size() - elements), false, 0}.slot();
    return list;
  }

  // A group's entry: its name first stood at `name`, its value stands at `value` (both in
  // readings_).
  struct GroupEntry {
    std::size_t name, value;
  };

  Slot putGroup(std::size_t first, std::uint8_t row) {
    gatherGroup(first, row);
    const bool sorted = group_.size() > searchedInLine;
    std::vector<Key> names;
    names.reserve(group_.size());
    for (const GroupEntry& entry : group_) names.push_back(keyOf(readings_[entry.name].slot));

    const Slot dictionary = putHeader(Form::dictionary, group_.size(), sorted);
    keys_.insert(keys_.end(), names.begin(), names.end());
    for (const GroupEntry& entry : group_) slots_.push_back(readings_[entry.value].slot);
    if (sorted) putOrder(Header::of(slots_[dictionary.body]));
    return dictionary;
  }

  // Fills group_: one entry a name, in the order in which the names first came, each with its last
  // value. By sorting, which no choice of names makes slow.
  void gatherGroup(std::size_t first, std::uint8_t row) {
    const auto nameOf = [&](const GroupEntry& entry) { return textOf(readings_[entry.name].slot); };
    group_.clear();
    for (std::size_t i = first; i < readings_.size(); ++i) {
      if (readings_[i].row != row) continue;
      group_.push_back({i, i + 1});
      ++i;
    }
    std::stable_sort(group_.begin(), group_.end(), [&](const GroupEntry& a, const GroupEntry& b) {
      return nameOf(a) < nameOf(b);
    });
    std::size_t kept = 0;
    for (const GroupEntry& entry : group_) {
      if (kept > 0 && nameOf(group_[kept - 1]) == nameOf(entry)) {
        group_[kept - 1].value = entry.value;
      } else {
        group_[kept++] = entry;
      }
    }
    group_.resize(kept);
    std::sort(group_.begin(), group_.end(),
              [](const GroupEntry& a, const GroupEntry& b) { return a.name < b.name; });
  }

  // Behind the keys of a dictionary: their order by text.
  void putOrder(Header dictionary) {
    const auto textOfKey = [&](Key place) {
      const Key& key = keys_[dictionary.firstKey + place.slot()];
      return key.isTag() ? key.tagText() : textOf(slots_[key.slot()]);
    };
    std::vector<Key> order;
    order.reserve(dictionary.count);
    for (std::uint32_t i = 0; i < dictionary.count; ++i) order.push_back(Key::textAt(i));
    std::sort(order.begin(), order.end(),
              [&](Key a, Key b) { return textOfKey(a) < textOfKey(b); });
    keys_.insert(keys_.end(), order.begin(), order.end());
  }

  Key keyOf(Slot name) {
    if (const std::string_view text = textOf(name); Key::fits(text)) return Key::tag(text);
    slots_.push_back(name);
    return Key::textAt(static_cast<std::uint32_t>(slots_.size() - 1));
  }

  // One name for all control points.
  Key keyOfControlPoint() {
    if (!nameOfControlPoint_) nameOfControlPoint_ = keyOf(putExtra(controlPointKey));
    return *nameOfControlPoint_;
  }

  // The observer.

  void announce(const Record& record, Slot slot) {
    if (observer_ != nullptr) observer_->onValue(record, valueOf(slot));
  }
  Value valueOf(Slot slot) const {
    const bool isScalar = slot.form() == Form::integer || slot.form() == Form::float32;
    const auto payload = isScalar ? bytes_.first(0) : bytes_.subspan(slot.body, slot.size());
    const auto block = Block::make(payload, {}, {}, {});
    return Value::in(*block, isScalar ? slot : Slot::place(slot.form(), slot.size(), 0));
  }
  void skip(const Record& record, SkipReason reason) {
    if (observer_ != nullptr) observer_->onSkip(record, reason);
  }
  void stop(Extent stream, std::size_t at, int level, SkipReason reason, const Record* record) {
    if (observer_ != nullptr)
      observer_->onStop(std::min(at, stream.end), stream.end, level, reason, record);
  }

  const std::span<const std::uint8_t> bytes_;
  myGUID* const guid_;
  StreamObserver* const observer_;
  std::size_t overlapLeft_;

  // Streams of ordinary size are gathered on the stack, so that their block is the only allocation.
  // Larger ones are not, for this memory never takes back what a vector has outgrown.
  static constexpr std::size_t ordinarySize = 4 * 1024;
  std::array<std::byte, 8 * 1024> arena_;
  std::pmr::monotonic_buffer_resource memory_{arena_.data(), arena_.size()};
  std::pmr::memory_resource* const resource_ =
      bytes_.size() <= ordinarySize ? &memory_ : std::pmr::new_delete_resource();
  std::pmr::vector<Reading> readings_{
      resource_};  // of the streams being walked, inner ones behind outer ones
  std::pmr::vector<Slot> slots_{resource_};  // of the block to be
  std::pmr::vector<Key> keys_{resource_};    // of the block to be
  std::string extra_;                        // bytes behind those of the stream: converted names
  std::vector<GroupEntry> group_;            // scratch of gatherGroup
  std::optional<Key> nameOfControlPoint_;

  // Scratch of putDictionary. Not on its stack, which would be there once for every level.
  struct Item {
    std::uint8_t row;
    Slot slot;
  };
  std::array<Item, 256> items_;
  std::array<std::uint8_t, 256> placeOfRow_;  // in items_, counted from 1
};

}  // namespace

Dictionary decodeStream(std::span<const std::uint8_t> bytes, std::int32_t length, myGUID* guid,
                        StreamObserver* observer) {
  return Decoder(bytes, guid, observer).decode(length);
}

}  // namespace oxmv
