#include "oxmv/metadata/TagStreamDecoder.h"

#include <algorithm>
#include <array>
#include <bit>
#include <optional>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/BlockBuilder.h"
#include "oxmv/values/LittleEndian.h"

namespace oxmv {

using detail::Block;
using detail::BlockBuilder;
using detail::Form;
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

// A name that waits for its value, and where its record stands.
struct PendingName {
  std::optional<Slot> name;
  std::size_t record = 0;
};

// Each walk has its own.
struct PendingNames {
  PendingName tag, reg;
};

constexpr std::size_t maxStream = 0x7FFFFFFF;

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
  return false;  // Not reached: every case is above.
}

bool isList(Read rule) {
  return rule == Read::texts || rule == Read::ints || rule == Read::nestedList ||
         rule == Read::controlPoint;
}

// Whether the first bytes of a record are those of a marker.
bool isMarker(Tag tag) {
  constexpr auto marker = static_cast<std::uint32_t>(tagOf({markerBytes[0], markerBytes[1], 0, 0}));
  return (static_cast<std::uint32_t>(tag) & 0xFFFF) == marker;
}

// A dictionary has at most an entry for each row, whose index is its id, and that of a control
// point.
static_assert(BlockBuilder::mostEntries >= detail::noRow);

std::uint8_t indexOf(const TagRow& row) {
  return static_cast<std::uint8_t>(&row - tagRows().data());
}

Key keyOf(Tag tag) {
  const std::array<char, 4> characters = charactersOf(tag);
  return Key::tag({characters.data(), characters.size()});
}

class Decoder {
 public:
  Decoder(std::span<const std::uint8_t> bytes, myGUID* guid, StreamObserver* observer)
      : bytes_(bytes.first(std::min(bytes.size(), maxStream))),
        guid_(guid),
        observer_(observer),
        overlapLeft_(bytes_.size()),
        builder_(bytes_) {}

  Dictionary decode(std::int32_t length) {
    const Slot root = decodeExtent({0, bytes_.size()}, length, 0, nullptr);
    if (builder_.isEmpty(root)) return {};
    return Value::in(*builder_.block(), root).dictionary();
  }

 private:
  // One stream: the slot of its dictionary. `controlPoint`, if not null, is one more value in it.
  Slot decodeExtent(Extent stream, std::int64_t length, int level, const Slot* controlPoint) {
    const BlockBuilder::Open outer = builder_.open();
    walk(stream, length, level);
    if (controlPoint != nullptr) builder_.putOnce(keyOfControlPoint(), *controlPoint);
    return builder_.close(outer);
  }

  // The walk over the records of one stream. The first record is read whatever its size; those
  // behind it only if they end within the limit.
  void walk(Extent stream, std::int64_t length, int level) {
    PendingNames names;
    std::int64_t limit = length;
    std::int64_t consumed = 0;  // markers are not counted
    if (observer_ == nullptr) consumed = readWholeRecords(stream, length, level, names);
    std::size_t at = stream.begin + static_cast<std::size_t>(consumed);
    while (consumed < limit) {
      const bool isFirst = consumed == 0;
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
      if (!interpret(record, stream, names)) {
        stop(stream, at, level, SkipReason::incompleteRecord, &record);
        break;
      }
      if (record.length == 0) {
        stop(stream, at, level, SkipReason::lengthZero, &record);
        break;
      }
      consumed += record.length;
      at += record.length;
    }
    giveUp(names.tag, stream, level);
    giveUp(names.reg, stream, level);
  }

  // The same with nobody listening, for as long as each record is whole, a word is there behind its
  // header and no length wraps: what a clip's stream is from beginning to end. Answers how many
  // bytes it has taken, all of them or up to a record or marker that the walk has to look at.
  std::int64_t readWholeRecords(Extent stream, std::int64_t length, int level,
                                PendingNames& names) {
    const std::size_t there = stream.end - stream.begin;
    const std::size_t end =
        length < static_cast<std::int64_t>(there)
            ? stream.begin + static_cast<std::size_t>(std::max<std::int64_t>(length, 0))
            : stream.end;
    fetch(stream.begin, end);
    std::size_t at = stream.begin;
    while (at + recordHeaderSize + sizeof(std::uint32_t) <= end) {
      const std::uint8_t* header = bytes_.data() + at;
      const Tag tag{loadLe32(header)};
      const std::uint32_t size = loadLe32(header + 4) & maxRecordSize;
      if (size > end - at - recordHeaderSize) break;
      const std::uint8_t row = detail::likelyRow(tag);
      const detail::PlainRule& rule = detail::plainRules[row];
      if (rule.tag == tag && size - rule.least <= rule.range) {
        builder_.put(row, keyOf(tag), plainSlot(rule, size, at + recordHeaderSize));
      } else if (size > longestRecord || (at != stream.begin && isMarker(tag))) {
        break;
      } else if (rule.tag == tag && !readText(row, size, at + recordHeaderSize, names)) {
        interpret(recordAt(stream, at, level), stream, names);
      }
      at += recordLength(size);
    }
    return static_cast<std::int64_t>(at - stream.begin);
  }

  // The walk has to read a record to find the next, and would wait for every line of memory that no
  // cache has. Once it is under way the processor foresees the rest.
  void fetch(std::size_t begin, std::size_t end) const {
    constexpr std::size_t atFirst = 4096, line = 64;
    for (std::size_t at = begin; at < std::min(end, begin + atFirst); at += line)
      __builtin_prefetch(bytes_.data() + at);
  }

  Slot plainSlot(const detail::PlainRule& rule, std::uint32_t size, std::size_t payload) const {
    const std::uint32_t word = loadLe32(bytes_.data() + payload);
    const auto offset = static_cast<std::uint32_t>(payload);
    return {static_cast<std::uint32_t>(rule.form) | (size << Slot::sizeShift & rule.placeMask),
            (word & rule.numberMask) | (offset & rule.placeMask)};
  }

  // Of whole records that are not plain, those that come by the dozen: texts of lists, names and
  // texts of groups. Answers false for any other.
  bool readText(std::uint8_t row, std::uint32_t size, std::size_t payload, PendingNames& names) {
    const detail::PlainRule& rule = detail::plainRules[row];
    const std::uint8_t type = bytes_[payload - 1];
    const Slot text = Slot::place(Form::text, size, static_cast<std::uint32_t>(payload));
    switch (rule.read) {
      case Read::texts: builder_.append(row, keyOf(rule.tag), text); return true;
      case Read::tagName: names.tag.name = builder_.asUtf8(withoutPadding(text)); return true;
      case Read::regName: names.reg.name = builder_.asUtf8(text); return true;
      case Read::tagValue:
        if (type != recordType::text) return false;
        putNamed("TAG "_tag, names.tag, withoutPadding(text));
        return true;
      case Read::regValue:
        if (type == recordType::integerL) return false;
        putNamed("REG "_tag, names.reg, text);
        return true;
      case Read::none:
      case Read::text:
      case Read::int32:
      case Read::uint8:
      case Read::uint16:
      case Read::float32:
      case Read::floats:
      case Read::integers:
      case Read::data:
      case Read::guid:
      case Read::nested:
      case Read::ints:
      case Read::nestedList:
      case Read::controlPoint: break;
    }
    return false;
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
  bool interpret(const Record& record, Extent stream, PendingNames& names) {
    if (record.row == nullptr || record.row->read == Read::none) {
      skip(record, SkipReason::unknownTag);
      return true;
    }
    if (takesWholePayload(record) && record.payload.size() < record.size) return false;
    const std::size_t payload = record.offset + recordHeaderSize;
    const Place place{payload, stream.end - payload};
    switch (record.row->read) {
      case Read::none: break;  // Not reached: skipped above.
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
        takeName(record, stream, withoutPadding(payloadAs(Form::text, record, place)), names.tag);
        break;
      case Read::regName:
        takeName(record, stream, payloadAs(Form::text, record, place), names.reg);
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

  // A text without the NULs at its end.
  Slot withoutPadding(Slot text) const {
    const std::uint8_t* const bytes = bytes_.data() + text.body();
    std::uint32_t size = text.size();
    // By the word: names end with 0 to 3 of them, which no processor foresees.
    while (size >= 4) {
      const std::uint32_t last = loadLe32(bytes + size - 4);
      size -= static_cast<std::uint32_t>(std::countl_zero(last)) / 8;
      if (last != 0) break;
    }
    while (size > 0 && bytes[size - 1] == 0) --size;
    return Slot::place(Form::text, size, text.body());
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
    put(record, nested);
  }

  // A name that is still waiting is given up for the new one.
  void takeName(const Record& record, Extent stream, Slot name, PendingName& pending) {
    giveUp(pending, stream, record.level);
    pending = {builder_.asUtf8(name), record.offset};
    announce(record, name);
  }

  void giveUp(const PendingName& pending, Extent stream, int level) {
    if (observer_ == nullptr || !pending.name) return;
    skip(recordAt(stream, pending.record, level), SkipReason::nameWithoutValue);
  }

  void interpretValue(const Record& record, Place place, Tag group, PendingName& pending) {
    if (!pending.name) return skip(record, SkipReason::valueWithoutName);
    std::optional<Slot> value;
    if (!takesWholePayload(record)) {
      value = readNumber(record, place);
    } else if (record.row->read == Read::tagValue) {
      value = withoutPadding(payloadAs(Form::text, record, place));
    } else {
      value = payloadAs(Form::text, record, place);
    }
    if (!value) return;
    announce(record, *value);
    putNamed(group, pending, *value);
  }

  // A value without a name is left out.
  void putNamed(Tag group, PendingName& pending, Slot value) {
    if (!pending.name) return;
    builder_.putNamed(detail::likelyRow(group), keyOf(group), *pending.name, value);
    pending.name.reset();
  }

  void store(const Record& record, Slot slot) {
    announce(record, slot);
    put(record, slot);
  }

  void put(const Record& record, Slot slot) {
    const std::uint8_t row = indexOf(*record.row);
    if (isList(record.row->read)) {
      builder_.append(row, keyOf(record.tag), slot);
    } else {
      builder_.put(row, keyOf(record.tag), slot);
    }
  }

  // One name for all control points.
  Key keyOfControlPoint() {
    if (!keyOfControlPoint_) keyOfControlPoint_ = builder_.keyOf(builder_.addText(controlPointKey));
    return *keyOfControlPoint_;
  }

  // The observer.

  void announce(const Record& record, Slot slot) {
    if (observer_ != nullptr) observer_->onValue(record, valueOf(slot));
  }
  Value valueOf(Slot slot) const {
    const bool isScalar = slot.form() == Form::integer || slot.form() == Form::float32;
    const auto payload = isScalar ? bytes_.first(0) : bytes_.subspan(slot.body(), slot.size());
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
  BlockBuilder builder_;
  std::optional<Key> keyOfControlPoint_;
};

}  // namespace

Dictionary decodeStream(std::span<const std::uint8_t> bytes, std::int32_t length, myGUID* guid,
                        StreamObserver* observer) {
  return Decoder(bytes, guid, observer).decode(length);
}

}  // namespace oxmv
