#include "oxmv/metadata/TagStreamEncoder.h"

#include <algorithm>
#include <bit>
#include <cstddef>
#include <new>
#include <span>
#include <stdexcept>
#include <string_view>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

// Characters of a text that a record holds; a NUL may follow them.
constexpr std::uint32_t maxCharacters = 255;

// The characters of a text that are kept, as bytes: the same thing if they are ASCII.
std::string_view keptBytes(std::string_view text) { return text.substr(0, maxCharacters); }

// How many characters of a text are kept.
std::uint32_t keptLength(std::string_view text) {
  if (isAscii(keptBytes(text))) return static_cast<std::uint32_t>(keptBytes(text).size());
  // No character takes more than 4 bytes, so this many bytes hold more characters than are kept.
  constexpr std::size_t enough = 4 * (maxCharacters + 1);
  return static_cast<std::uint32_t>(
      std::min<std::size_t>(utf16Length(text.substr(0, enough)), maxCharacters));
}

class Encoder {
 public:
  explicit Encoder(Layout layout) : isExact_(layout == Layout::exact) {}

  std::vector<std::uint8_t> encode(const Dictionary& tags) {
    constexpr std::size_t ordinary = 4096;  // most clips fit, so that they grow no further
    if (!tags.empty()) stream_.reserve(ordinary);
    putDictionary(tags, 0);
    return std::move(stream_);
  }

 private:
  void putDictionary(const Dictionary& tags, int level) {
    putLeading(tags);
    for (const auto& [key, value] : tags) {
      const TagRow* row = findTagRow(key);
      if (row != nullptr && row->when == When::inOrder) putValue(*row, value, level);
    }
    putDeferred(tags, level);
  }

  void putLeading(const Dictionary& tags) {
    for (const char* key : {"PRCS", "UFRM"}) {
      if (const Value value = tags[key]; !value.isNothing()) putInteger(*findTagRow(key), value);
    }
    if (const Value value = tags["TIMC"]; !value.text().empty())
      putText("TIMC"_tag, value.text(), 0);
  }

  void putDeferred(const Dictionary& tags, int level) {
    for (const char* key : {"COL1", "COL2"}) {
      if (const Value value = tags[key]; value.kind() == Value::Kind::dictionary) {
        putNested(findTagRow(key)->tag, value.dictionary(), level, nullptr);
      }
    }
    putPair(tags, "DTIN", "DTDR");
    putPair(tags, "DTFI", "DTFO");
    if (const Value value = tags["CTLp"]; value.kind() == Value::Kind::array)
      putControlPoints(value.array(), level);
  }

  // Kept on purpose: one of a pair brings the other, as 0 if it has no value.
  void putPair(const Dictionary& tags, const char* first, const char* second) {
    if (!tags.contains(first) && !tags.contains(second)) return;
    for (const char* key : {first, second}) putInteger(*findTagRow(key), tags[key]);
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
      case Write::float32: putWord(row.tag, recordType::floats, value.floatBits()); break;
      case Write::integerH:
      case Write::integerL:
      case Write::integerR:
      case Write::word16:
      case Write::byte8: putInteger(row, value); break;
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
          putWord(row.tag, recordType::integerH, integer(element));
        break;
      case Write::textEach:
        for (const Value& element : value.array()) putText(row.tag, element.text(), 0);
        break;
      case Write::nestedEach: putNestedEach(row.tag, value.array(), level); break;
      case Write::tagGroup: putTagGroup(value.dictionary()); break;
      case Write::regGroup: putRegGroup(value.dictionary()); break;
    }
  }

  static std::uint32_t integer(const Value& value) {
    return static_cast<std::uint32_t>(value.intValue());
  }

  void putInteger(const TagRow& row, const Value& value) {
    std::uint32_t word = integer(value);
    if (row.write == Write::word16) word &= 0xFFFF;
    if (row.write == Write::byte8) word &= 0xFF;
    putWord(row.tag, integerType(row.write), word);
  }

  static std::uint8_t integerType(Write rule) {
    if (rule == Write::integerH) return recordType::integerH;
    if (rule == Write::integerR) return recordType::integerR;
    if (rule == Write::word16 || rule == Write::byte8) return recordType::small;
    return recordType::integerL;
  }

  // Texts go out in ASCII. `room` is what the size leaves for a NUL: with 0, kept on purpose for
  // TIMC and for the elements of lists, a text whose length is a multiple of 4 fills its payload to
  // the end.
  void putText(Tag tag, std::string_view text, std::uint32_t room) {
    const std::uint32_t size = paddedToFour(keptLength(text) + room);
    putHeader(tag, recordType::text, size);
    putAscii(keptBytes(text), size);
  }

  void putFourCC(Tag tag, std::string_view text) {
    putHeader(tag, recordType::fourCC, 4);
    putAscii(text.substr(0, 4), 4);
  }

  // A text, then zeros up to `size`; zeros only if it is not ASCII.
  void putAscii(std::string_view text, std::uint32_t size) {
    const std::size_t start = grow(size);
    if (isAscii(text)) std::copy(text.begin(), text.end(), stream_.data() + start);
  }

  void putData(const TagRow& row, std::span<const std::uint8_t> bytes) {
    if (bytes.size() > maxRecordSize) return;
    const auto size = static_cast<std::uint32_t>(bytes.size());
    // Kept on purpose in the exact layout: a GUID's size is always 16, other sizes keep 16 bits; no
    // padding.
    const bool isGuid = row.write == Write::guid;
    const std::uint32_t exactSize = isGuid ? 16 : size & 0xFFFF;
    putHeader(row.tag, isGuid ? recordType::guid : recordType::text, isExact_ ? exactSize : size);
    stream_.insert(stream_.end(), bytes.begin(), bytes.end());
    if (!isExact_) grow(paddedToFour(size) - size);
  }

  void putFloats(const TagRow& row, const Array& array) {
    // Kept on purpose: three floats under the tag of a pair are written as a triple, which no
    // reader takes.
    const bool fits =
        array.size() == row.count || (row.write == Write::floatPair && array.size() == 3);
    if (!fits) return;
    putHeader(row.tag, recordType::floats, static_cast<std::uint32_t>(array.size() * 4));
    for (const Value& element : array) putLe32(element.floatBits());
  }

  // Kept on purpose: the elements all go into the first word, so the last one stays there and the
  // others are zeros.
  void putIntegerArray(Tag tag, const Array& array) {
    if (array.size() > maxRecordSize / 4) return;
    const auto size = static_cast<std::uint32_t>(array.size() * 4);
    putHeader(tag, recordType::integerH, size);
    const std::size_t start = grow(size);
    if (!array.empty()) storeLe32(stream_.data() + start, integer(array[array.size() - 1]));
  }

  void putNestedEach(Tag tag, const Array& array, int level) {
    for (const Value& element : array) {
      if (element.kind() != Value::Kind::dictionary) continue;
      const std::uint32_t length = putNested(tag, element.dictionary(), level, nullptr);
      grow(paddedToFour(length) - length);  // unlike COL1, COL2 and CTLp, in both layouts
    }
  }

  void putControlPoints(const Array& array, int level) {
    for (const Value& element : array) {
      if (element.kind() != Value::Kind::dictionary) continue;
      const Dictionary nested = element.dictionary();
      const Array point = nested[controlPointKey].array();
      putNested("CTLp"_tag, nested, level, &point);
    }
    // Kept on purpose: a terminator of zeros, which readers take for an unknown tag.
    grow(recordHeaderSize);
  }

  // A nested stream, with the two integers of a control point before it unless `point` is null.
  // Left out if it is nested too deep or too large. Answers the stream's length, 0 if left out.
  std::uint32_t putNested(Tag tag, const Dictionary& tags, int level, const Array* point) {
    if (level + 1 >= maxNesting) return 0;
    const std::size_t start = stream_.size();
    putHeader(tag, recordType::nested, 0);
    if (point != nullptr) {
      const bool isPair = point->size() == 2;
      for (std::size_t i = 0; i < 2; ++i) putLe32(isPair ? integer((*point)[i]) : 0);
    }
    const std::size_t nestedStart = stream_.size();
    putDictionary(tags, level + 1);
    const std::size_t length = stream_.size() - nestedStart;
    const std::size_t before = nestedStart - start - recordHeaderSize;
    if (before + length > maxRecordSize) {
      stream_.resize(start);
      return 0;
    }
    // Kept on purpose in the exact layout: the length keeps 16 bits.
    const std::size_t size = before + (isExact_ ? length & 0xFFFF : length);
    storeLe32(stream_.data() + start + 4,
              headerWord(recordType::nested, static_cast<std::uint32_t>(size)));
    return static_cast<std::uint32_t>(length);
  }

  void putTagGroup(const Dictionary& group) {
    for (const auto& [name, value] : group) {
      putText("TAGN"_tag, name, 1);
      if (value.isText()) {
        putText("TAGV"_tag, value.text(), 1);
      } else {
        putWord("TAGV"_tag, recordType::integerL, integer(value));
      }
    }
  }

  // Kept on purpose: a text goes out as a second name, and text of a derived kind as a number.
  void putRegGroup(const Dictionary& group) {
    for (const auto& [name, value] : group) {
      putText("REGN"_tag, name, 1);
      if (value.isText() && !value.isDerivedText()) {
        putText("REGN"_tag, value.text(), 1);
      } else {
        putWord("REGV"_tag, recordType::integerL, integer(value));
      }
    }
  }

  void putWord(Tag tag, std::uint8_t type, std::uint32_t word) {
    putHeader(tag, type, 4);
    putLe32(word);
  }

  static std::uint32_t headerWord(std::uint8_t type, std::uint32_t size) {
    return std::uint32_t{type} << 24 | size;
  }

  void putHeader(Tag tag, std::uint8_t type, std::uint32_t size) {
    const std::size_t start = grow(recordHeaderSize);
    storeLe32(stream_.data() + start, static_cast<std::uint32_t>(tag));
    storeLe32(stream_.data() + start + 4, headerWord(type, size));
  }

  void putLe32(std::uint32_t word) {
    const std::size_t start = grow(4);  // may move the data
    storeLe32(stream_.data() + start, word);
  }

  // Appends zeros; answers where they start.
  std::size_t grow(std::size_t count) {
    const std::size_t start = stream_.size();
    stream_.resize(start + count);
    return start;
  }

  const bool isExact_;
  std::vector<std::uint8_t> stream_;
};

}  // namespace

std::optional<std::vector<std::uint8_t>> encodeStream(const Dictionary& tags,
                                                      Layout layout) noexcept {
  try {
    return Encoder(layout).encode(tags);
  } catch (const std::bad_alloc&) {
    return std::nullopt;
  } catch (const std::length_error&) {  // larger than a vector can be
    return std::nullopt;                // Not reached: memory ends first.
  }
}

}  // namespace oxmv
