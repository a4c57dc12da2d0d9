#include "oxmv/metadata/TagStreamEncoder.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>
#include <cstring>
#include <new>
#include <span>
#include <stdexcept>
#include <string_view>
#include <utility>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Bytes32.h"
#include "oxmv/values/HeldEntries.h"
#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Text.h"

namespace oxmv {

using detail::Block;
using detail::Bytes32;
using detail::Form;
using detail::HeldEntries;
using detail::Key;
using detail::PlainWrite;
using detail::Slot;

namespace {

// Characters of a text that a record holds; a NUL may follow them.
constexpr std::uint32_t maxCharacters = 255;

// How many characters are kept of a text that is not ASCII.
std::uint32_t keptLength(std::string_view text) {
  // No character takes more than 4 bytes, so this many bytes hold more characters than are kept.
  constexpr std::size_t enough = 4 * (maxCharacters + 1);
  return static_cast<std::uint32_t>(
      std::min<std::size_t>(utf16Length(text.substr(0, enough)), maxCharacters));
}

// Null where there is no block, and so nothing that stands in one.
const std::uint8_t* bytesOf(const Block* block) {
  return block == nullptr ? nullptr : block->bytes().data();
}

Tag tagOf(const Key& key) {
  return Tag{loadLe32(reinterpret_cast<const std::uint8_t*>(key.tagText().data()))};
}

// From wherever a payload stands in a block a look may begin, and one more byte be read behind.
static_assert(Block::readAhead >= Bytes32::size);

// The stream as it grows. Records gather in a chunk: most streams fit there, and then take exactly
// the memory that they need.
class Output {
 public:
  // `likelySize` is what the stream will take, if it takes more than a chunk.
  explicit Output(std::size_t likelySize) : likelySize_(likelySize) {}

  static constexpr std::size_t mostRoom = 512;

  std::size_t size() const { return stream_.size() + filled_; }

  // Where the next bytes go, at most `mostRoom`; add() then takes over the first of them.
  std::uint8_t* room() {
    if (filled_ > chunkSize - mostRoom) flush();
    return chunk_.data() + filled_;
  }
  void add(std::size_t count) { filled_ += count; }

  // Any number of bytes.
  void append(std::span<const std::uint8_t> bytes) {
    if (bytes.size() <= mostRoom) {
      std::copy(bytes.begin(), bytes.end(), room());
      return add(bytes.size());
    }
    flush();
    stream_.insert(stream_.end(), bytes.begin(), bytes.end());
  }
  void appendZeros(std::size_t count) {
    if (count <= mostRoom) {
      std::fill_n(room(), count, std::uint8_t{0});
      return add(count);
    }
    flush();
    stream_.resize(stream_.size() + count);
  }

  // Of bytes that were written.
  std::uint8_t* at(std::size_t offset) {
    return offset < stream_.size() ? stream_.data() + offset
                                   : chunk_.data() + (offset - stream_.size());
  }
  // Takes back all bytes from `size` on, which are more than a chunk holds.
  void cut(std::size_t size) {
    filled_ = 0;
    stream_.resize(size);
  }

  std::vector<std::uint8_t> take() {
    likelySize_ = 0;
    flush();
    return std::move(stream_);
  }

 private:
  static constexpr std::size_t chunkSize = 4096;

  void flush() {
    if (stream_.empty()) stream_.reserve(std::max(likelySize_, filled_));
    stream_.insert(stream_.end(), chunk_.data(), chunk_.data() + filled_);
    filled_ = 0;
  }

  std::size_t likelySize_;
  std::vector<std::uint8_t> stream_;
  std::size_t filled_ = 0;  // of the chunk
  std::array<std::uint8_t, chunkSize> chunk_;
};

// Where a dictionary has the tags that are written after all others.
class Deferred {
 public:
  // In their order.
  enum Turn : std::uint8_t { col1, col2, dtin, dtdr, dtfi, dtfo, ctlp };
  static constexpr std::array tags = {"COL1"_tag, "COL2"_tag, "DTIN"_tag, "DTDR"_tag,
                                      "DTFI"_tag, "DTFO"_tag, "CTLp"_tag};

  explicit Deferred(const HeldEntries& entries) : entries_(entries) {}

  void note(Tag tag, std::size_t place) {
    const auto turn = std::find(tags.begin(), tags.end(), tag) - tags.begin();
    places_[static_cast<std::size_t>(turn)] = static_cast<std::uint32_t>(place + 1);
  }
  // `value` becomes the tag's, and stays as it was if there is none. Answers whether there is.
  bool lend(Value& value, Turn turn) const {
    if (places_[turn] == 0) return false;
    entries_.lend(value, places_[turn] - 1);
    return true;
  }

 private:
  const HeldEntries& entries_;
  std::array<std::uint32_t, tags.size() + 1> places_{};  // from 1; the last one is of no tag
};

class Encoder {
 public:
  Encoder(Layout layout, std::size_t likelySize)
      : isExact_(layout == Layout::exact), stream_(likelySize) {}

  std::vector<std::uint8_t> encode(const HeldEntries& entries) {
    putEntries(entries, 0);
    return stream_.take();
  }

 private:
  void putEntries(const HeldEntries& entries, int level) {
    const std::uint8_t* const bytes = bytesOf(entries.block);
    const Key* const keys = entries.keys;
    const Slot* const slots = entries.slots;
    const std::size_t count = entries.count;
    Deferred deferred(entries);
    putLeading(entries);
    for (std::size_t place = 0; place < count; ++place) {
      const Tag tag = tagOf(keys[place]);
      const PlainWrite& rule = detail::plainWrites[detail::likelyRow(tag)];
      if (rule.tag == tag && !putPlain(rule, slots[place], bytes))
        putOther(tag, entries, place, level, deferred);
    }
    putDeferred(deferred, level);
  }

  // A number, a text or a few floats that stand in the slot or in the block, without a choice by
  // rule: which comes next cannot be foreseen. Answers false for whatever is not plain.
  bool putPlain(const PlainWrite& rule, Slot slot, const std::uint8_t* blockBytes) {
    if (slot.form() != rule.form) return false;
    const std::uint8_t* const payload = blockBytes + (slot.body & rule.placeMask);
    const Bytes32 bytes = Bytes32::at(payload);
    const std::uint32_t ends = bytes.ends() & rule.textMask;
    const auto length = static_cast<std::uint32_t>(
        std::countr_zero(ends | std::uint64_t{1} << std::min(slot.size(), 32u)));
    const bool isWide = (payload[length] & rule.textMask) >= 0x80;
    if (length - rule.least > rule.range || isWide) return false;
    putBytes(rule.tag, rule.header, paddedToFour(length + rule.room), bytes, length,
             slot.body & rule.numberMask);
    return true;
  }

  // A text of the block, in one look as well.
  bool putShortText(Tag tag, Slot text, const Block* block, std::uint32_t room) {
    const std::uint32_t length = text.size();
    if (text.form() != Form::text || length >= Bytes32::size) return false;
    const Bytes32 bytes = Bytes32::at(block->bytes(text).data());
    if ((bytes.notAscii() & ((1u << length) - 1)) != 0) return false;
    putBytes(tag, headerWord(recordType::text, 0), paddedToFour(length + room), bytes, length, 0);
    return true;
  }

  void putBytes(Tag tag, std::uint32_t header, std::uint32_t size, const Bytes32& bytes,
                std::uint32_t length, std::uint32_t word) {
    std::uint8_t* record = stream_.room();
    storeLe32(record, static_cast<std::uint32_t>(tag));
    storeLe32(record + 4, header | size);
    bytes.store(record + recordHeaderSize, length, word);
    stream_.add(recordHeaderSize + size);
  }

  void putOther(Tag tag, const HeldEntries& entries, std::size_t place, int level,
                Deferred& deferred) {
    const TagRow* row = findTagRow(tag);
    if (row == nullptr || entries.isVacant(place)) return;
    if (row->when == When::leading) return;  // written already
    if (row->when == When::deferred) return deferred.note(tag, place);
    const Slot slot = entries.slots[place];
    if (slot.form() == Form::list && row->write == Write::textEach)
      return putTexts(tag, *entries.block, slot);
    Value value;
    entries.lend(value, place);
    const auto words = value.floatWords();
    if (!words.empty() && words.size() == row->count * 4u) return putFloats(tag, words);
    putValue(*row, value, level);
  }

  void putLeading(const HeldEntries& entries) {
    Value value;
    const auto lend = [&](std::string_view tag) {
      const std::size_t place = entries.find(Key::tag(tag));
      if (place != entries.count) entries.lend(value, place);
      return place != entries.count;
    };
    if (lend("PRCS")) putInteger("PRCS"_tag, Write::integerL, value);
    if (lend("UFRM")) putInteger("UFRM"_tag, Write::integerL, value);
    if (lend("TIMC") && !value.text().empty()) putText("TIMC"_tag, value.text(), 0);
  }

  void putDeferred(const Deferred& deferred, int level) {
    Value value;
    for (const auto turn : {Deferred::col1, Deferred::col2}) {
      if (deferred.lend(value, turn) && value.kind() == Value::Kind::dictionary)
        putNested(Deferred::tags[turn], Dictionary::entriesOf(value), level, nullptr);
    }
    putPair(deferred, Deferred::dtin, Deferred::dtdr);
    putPair(deferred, Deferred::dtfi, Deferred::dtfo);
    if (deferred.lend(value, Deferred::ctlp) && value.kind() == Value::Kind::array)
      putControlPoints(value.array(), level);
  }

  // Kept on purpose: one of a pair brings the other, as 0 if it has no value.
  void putPair(const Deferred& deferred, Deferred::Turn first, Deferred::Turn second) {
    Value firstValue, secondValue;
    const bool hasFirst = deferred.lend(firstValue, first);
    const bool hasSecond = deferred.lend(secondValue, second);
    if (!hasFirst && !hasSecond) return;
    putInteger(Deferred::tags[first], Write::integerL, firstValue);
    putInteger(Deferred::tags[second], Write::integerL, secondValue);
  }

  void putValue(const TagRow& row, const Value& value, int level) {
    switch (row.write) {
      case Write::none:
      // Written by putLeading and putDeferred.
      case Write::timecode:
      case Write::nested:
      case Write::controlPoint: break;
      case Write::text:
        if (!value.text().empty()) putText(row.tag, value.text(), 1);
        break;
      case Write::float32: putNumber(row.tag, recordType::floats, value.floatBits()); break;
      case Write::integerH:
      case Write::integerL:
      case Write::integerR:
      case Write::word16:
      case Write::byte8: putInteger(row.tag, row.write, value); break;
      case Write::fourCC: putFourCC(row.tag, value.text()); break;
      case Write::guid:
      case Write::data:
        if (value.kind() == Value::Kind::data) putData(row, value.data());
        break;
      case Write::floatPair:
      case Write::floats: putFloats(row, value.array()); break;
      case Write::integerArray:
        if (value.kind() == Value::Kind::array) putIntegerArray(row.tag, value.array());
        break;
      case Write::integerEach:
        for (const Value& element : value.array())
          putNumber(row.tag, recordType::integerH, integer(element));
        break;
      case Write::textEach:
        for (const Value& element : value.array()) putText(row.tag, element.text(), 0);
        break;
      case Write::nestedEach: putNestedEach(row.tag, value.array(), level); break;
      case Write::tagGroup: putTagGroup(Dictionary::entriesOf(value)); break;
      case Write::regGroup: putRegGroup(Dictionary::entriesOf(value)); break;
    }
  }

  static std::uint32_t integer(const Value& value) {
    return static_cast<std::uint32_t>(value.intValue());
  }

  void putInteger(Tag tag, Write rule, const Value& value) {
    std::uint32_t word = integer(value);
    if (rule == Write::word16) word &= 0xFFFF;
    if (rule == Write::byte8) word &= 0xFF;
    putNumber(tag, recordTypeOf(rule), word);
  }

  // Texts go out in ASCII: one that is not, as zeros. `room` is what the size leaves for a NUL: with
  // 0, kept on purpose for TIMC and for the elements of lists, a text whose length is a multiple of
  // 4 fills its payload to the end.
  void putText(Tag tag, std::string_view text, std::uint32_t room) {
    const std::string_view kept = text.substr(0, maxCharacters);
    const bool isKept = isAscii(kept);
    const std::uint32_t length =
        isKept ? static_cast<std::uint32_t>(kept.size()) : keptLength(text);
    putAscii(tag, recordType::text, paddedToFour(length + room), isKept ? kept : "");
  }

  void putFourCC(Tag tag, std::string_view text) {
    const std::string_view kept = text.substr(0, 4);
    putAscii(tag, recordType::fourCC, 4, isAscii(kept) ? kept : "");
  }

  // A text, then zeros up to `size`.
  void putAscii(Tag tag, std::uint8_t type, std::uint32_t size, std::string_view text) {
    putHeader(tag, type, size);
    std::uint8_t* payload = stream_.room();
    std::fill_n(std::copy(text.begin(), text.end(), payload), size - text.size(), std::uint8_t{0});
    stream_.add(size);
  }

  // The texts of a list in the block.
  void putTexts(Tag tag, const Block& block, Slot list) {
    const Slot* const elements = block.items(list.body);
    const std::uint32_t count = block.header(list.body).count;
    Value value;
    for (std::uint32_t i = 0; i < count; ++i) {
      if (putShortText(tag, elements[i], &block, 0)) continue;
      value.borrow(block, elements[i]);
      putText(tag, value.text(), 0);
    }
  }

  void putData(const TagRow& row, std::span<const std::uint8_t> bytes) {
    if (bytes.size() > maxRecordSize) return;
    const auto size = static_cast<std::uint32_t>(bytes.size());
    // Kept on purpose in the exact layout: a GUID's size is always 16, other sizes keep 16 bits; no
    // padding.
    const std::uint32_t exactSize = row.write == Write::guid ? 16 : size & 0xFFFF;
    putHeader(row.tag, recordTypeOf(row.write), isExact_ ? exactSize : size);
    stream_.append(bytes);
    if (!isExact_) stream_.appendZeros(paddedToFour(size) - size);
  }

  void putFloats(Tag tag, std::span<const std::uint8_t> words) {
    putHeader(tag, recordType::floats, static_cast<std::uint32_t>(words.size()));
    stream_.append(words);
  }

  void putFloats(const TagRow& row, const Array& array) {
    // Kept on purpose: three floats under the tag of a pair are written as a triple, which no
    // reader takes.
    const bool fits =
        array.size() == row.count || (row.write == Write::floatPair && array.size() == 3);
    if (!fits) return;
    putHeader(row.tag, recordType::floats, static_cast<std::uint32_t>(array.size() * 4));
    for (const Value& element : array) putWord(element.floatBits());
  }

  // Kept on purpose: the elements all go into the first word, so the last one stays there and the
  // others are zeros.
  void putIntegerArray(Tag tag, const Array& array) {
    if (array.size() > maxRecordSize / 4) return;
    putHeader(tag, recordType::integerH, static_cast<std::uint32_t>(array.size() * 4));
    if (array.empty()) return;
    putWord(integer(array[array.size() - 1]));
    stream_.appendZeros((array.size() - 1) * 4);
  }

  void putNestedEach(Tag tag, const Array& array, int level) {
    for (const Value& element : array) {
      if (element.kind() != Value::Kind::dictionary) continue;
      const std::uint32_t length = putNested(tag, Dictionary::entriesOf(element), level, nullptr);
      stream_.appendZeros(paddedToFour(length) -
                          length);  // unlike COL1, COL2 and CTLp, in both layouts
    }
  }

  void putControlPoints(const Array& array, int level) {
    for (const Value& element : array) {
      if (element.kind() != Value::Kind::dictionary) continue;
      const HeldEntries entries = Dictionary::entriesOf(element);
      const Point point = pointOf(entries);
      putNested("CTLp"_tag, entries, level, &point);
    }
    // Kept on purpose: a terminator of zeros, which readers take for an unknown tag.
    stream_.appendZeros(recordHeaderSize);
  }

  using Point = std::array<std::uint32_t, 2>;

  // The two integers of a control point, zeros if it has not exactly two.
  static Point pointOf(const HeldEntries& entries) {
    for (std::size_t place = 0; place < entries.count; ++place) {
      if (entries.keys[place].isTag() || entries.name(place) != controlPointKey ||
          entries.isVacant(place))
        continue;
      const Array array = entries.value(place).array();
      if (array.size() == 2) return {integer(array[0]), integer(array[1])};
    }
    return {};
  }

  // A nested stream, with the two integers of a control point before it unless `point` is null.
  // Left out if it is nested too deep or too large. Answers the stream's length, 0 if left out.
  std::uint32_t putNested(Tag tag, const HeldEntries& entries, int level, const Point* point) {
    if (level + 1 >= maxNesting) return 0;
    const std::size_t start = stream_.size();
    const std::uint32_t before = point == nullptr ? 0 : controlPointSize;
    putHeader(tag, recordType::nested, 0);
    if (point != nullptr) {
      for (const std::uint32_t word : *point) putWord(word);
    }
    const std::size_t nestedStart = stream_.size();
    putEntries(entries, level + 1);
    const std::size_t length = stream_.size() - nestedStart;
    if (before + length > maxRecordSize) {  // so far more than a chunk holds
      stream_.cut(start);
      return 0;
    }
    // Kept on purpose in the exact layout: the length keeps 16 bits.
    const std::size_t size = before + (isExact_ ? length & 0xFFFF : length);
    storeLe32(stream_.at(start + 4),
              headerWord(recordType::nested, static_cast<std::uint32_t>(size)));
    return static_cast<std::uint32_t>(length);
  }

  void putTagGroup(const HeldEntries& group) {
    for (std::size_t place = 0; place < group.count; ++place) {
      if (group.isVacant(place)) continue;
      putName("TAGN"_tag, group, place);
      if (putShortText("TAGV"_tag, group.slots[place], group.block, 1)) continue;
      Value value;
      group.lend(value, place);
      if (value.isText()) {
        putText("TAGV"_tag, value.text(), 1);
      } else {
        putNumber("TAGV"_tag, recordType::integerL, integer(value));
      }
    }
  }

  // Kept on purpose: a text goes out as a second name, and text of a derived kind as a number.
  void putRegGroup(const HeldEntries& group) {
    for (std::size_t place = 0; place < group.count; ++place) {
      if (group.isVacant(place)) continue;
      putName("REGN"_tag, group, place);
      if (putShortText("REGN"_tag, group.slots[place], group.block, 1)) continue;
      Value value;
      group.lend(value, place);
      if (value.isText() && !value.isDerivedText()) {
        putText("REGN"_tag, value.text(), 1);
      } else {
        putNumber("REGV"_tag, recordType::integerL, integer(value));
      }
    }
  }

  void putName(Tag tag, const HeldEntries& group, std::size_t place) {
    const Key& key = group.keys[place];
    const bool isInBlock = !key.isTag() && group.own == nullptr;
    if (isInBlock && putShortText(tag, group.block->nameOf(key), group.block, 1)) return;
    putText(tag, group.name(place), 1);
  }

  void putNumber(Tag tag, std::uint8_t type, std::uint32_t word) {
    putHeader(tag, type, 4);
    putWord(word);
  }

  void putHeader(Tag tag, std::uint8_t type, std::uint32_t size) {
    putWord(static_cast<std::uint32_t>(tag));
    putWord(headerWord(type, size));
  }

  void putWord(std::uint32_t word) {
    storeLe32(stream_.room(), word);
    stream_.add(4);
  }

  const bool isExact_;
  Output stream_;
};

}  // namespace

std::optional<std::vector<std::uint8_t>> encodeStream(const Dictionary& tags,
                                                      Layout layout) noexcept {
  try {
    const HeldEntries entries = tags.entries();
    // What was decoded gives about the bytes that it came from.
    return Encoder(layout, entries.streamSize).encode(entries);
  } catch (const std::bad_alloc&) {
    return std::nullopt;
  } catch (const std::length_error&) {  // larger than a vector can be
    return std::nullopt;                // Not reached: memory ends first.
  }
}

}  // namespace oxmv
