#include "oxmv/metadata/Losses.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <new>
#include <set>
#include <utility>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

constexpr auto codes = std::to_array<std::pair<LossCode, std::string_view>>({
    {LossCode::unknownTag, "unknown-tag"},
    {LossCode::noDecoder, "no-decoder"},
    {LossCode::badKey, "bad-key"},
    {LossCode::textNonAscii, "text-nonascii"},
    {LossCode::textLong, "text-long"},
    {LossCode::textEmpty, "text-empty"},
    {LossCode::textNul, "text-nul"},
    {LossCode::listPads, "list-pads"},
    {LossCode::listEmpty, "list-empty"},
    {LossCode::listCount, "list-count"},
    {LossCode::intRange, "int-range"},
    {LossCode::intArray, "int-array"},
    {LossCode::floatPrecision, "float-precision"},
    {LossCode::wrongKind, "wrong-kind"},
    {LossCode::dataUnaligned, "data-unaligned"},
    {LossCode::size16bit, "size-16bit"},
    {LossCode::size24bit, "size-24bit"},
    {LossCode::guidLength, "guid-length"},
    {LossCode::regText, "reg-text"},
    {LossCode::nameGrows, "name-grows"},
    {LossCode::pairAdded, "pair-added"},
    {LossCode::ctlpData, "ctlp-data"},
    {LossCode::emptyNested, "empty-nested"},
    {LossCode::tooDeep, "too-deep"},
    {LossCode::shortStream, "short-stream"},
    {LossCode::notReadBack, "not-read-back"},
});

constexpr bool codesStandInOrder() {
  for (std::size_t i = 0; i < codes.size(); ++i) {
    if (static_cast<std::size_t>(codes[i].first) != i) return false;
  }
  return static_cast<std::size_t>(LossCode::notReadBack) + 1 == codes.size();
}
static_assert(codesStandInOrder(), "every code, in the order of the enumeration");

using Stream = std::vector<std::uint8_t>;

Stream encoded(const Dictionary& tags, Layout layout) {
  auto stream = encodeStream(tags, layout);
  if (!stream) throw std::bad_alloc();
  return std::move(*stream);
}

Dictionary decoded(const Stream& stream) {
  return decodeStream(stream, static_cast<std::int32_t>(static_cast<std::uint32_t>(stream.size())));
}

// The start of a text, in quotes.
std::string quoted(std::string_view text) {
  constexpr std::size_t most = 40;
  std::size_t end = std::min(text.size(), most);
  while (end < text.size() && (static_cast<std::uint8_t>(text[end]) & 0xC0) == 0x80) --end;
  return '"' + std::string(text.substr(0, end)) + (end < text.size() ? "...\"" : "\"");
}

std::string_view nameOf(Value::Kind kind) {
  switch (kind) {
    case Value::Kind::nothing: return "nothing";
    case Value::Kind::integer: return "an integer";
    case Value::Kind::float32: return "a float";
    case Value::Kind::float64: return "a double";
    case Value::Kind::text: return "a text";
    case Value::Kind::data: return "data";
    case Value::Kind::array: return "a list";
    case Value::Kind::dictionary: return "a dictionary";
  }
  return {};  // Not reached: every case is above.
}

// The key that is always written along with this one; null for most.
const char* partnerOf(std::string_view key) {
  if (key == "DTIN") return "DTDR";
  if (key == "DTDR") return "DTIN";
  if (key == "DTFI") return "DTFO";
  if (key == "DTFO") return "DTFI";
  return nullptr;
}

class LossFinder {
 public:
  explicit LossFinder(Layout layout) : layout_(layout) {}

  std::vector<Loss> find(const Dictionary& tags) {
    const Stream stream = encoded(tags, layout_);
    const Dictionary back = decoded(stream);
    const bool isShort = !back.empty() && stream.size() < shortestData;
    if (back == tags && !isShort) return {};
    explain(tags, "", 0);
    for (std::size_t i = 0; i < nested_.size(); ++i) {
      const Nested next = nested_[i];  // explaining it may bring more
      explain(next.tags, next.prefix, next.level);
    }
    if (isShort) {
      add(LossCode::shortStream, std::string((*back.begin()).key),
          "takes " + std::to_string(stream.size()) +
              " bytes with all the rest, and fewer than 12 are not read");
    }
    addUnless(!losses_.empty(), std::string((*tags.begin()).key));
    return std::move(losses_);
  }

 private:
  Dictionary roundTrip(const Dictionary& tags) const { return decoded(encoded(tags, layout_)); }

  // Explains why a dictionary, a stream of its own at that level, does not come back as it is.
  void explain(const Dictionary& tags, const std::string& prefix, int level) {
    Dictionary expected;  // what comes back if each entry does as it does alone
    for (const auto& [key, value] : tags) {
      const Dictionary alone = roundTrip({{key, value}});
      const Value back = alone[key];
      expected.set(key, back);
      if (const char* partner = partnerOf(key); partner != nullptr && !tags.contains(partner)) {
        expected.set(partner, alone[partner]);
        add(LossCode::pairAdded, prefix + partner,
            "would come into being as 0, because " + std::string(key) + " is there");
      }
      const bool isWhole = back == value && !nestsTooDeep(key, value, level);
      if (!isWhole) explainEntry(key, value, back, prefix + std::string(key), level);
    }
    if (roundTrip(tags) != expected) findCulprits(tags, prefix);
  }

  void explainEntry(std::string_view key, const Value& value, const Value& back,
                    const std::string& path, int level) {
    const std::size_t before = explained();
    const TagRow* row = findTagRow(key);
    if (row == nullptr || row->write == Write::none) {
      explainKey(key, path);
    } else if (row->read == Read::none && row->write != Write::tagGroup &&
               row->write != Write::regGroup) {
      add(LossCode::noDecoder, path, "would be written, but no reader knows it");
    } else {
      explainValue(*row, value, back, path, level);
    }
    addUnless(explained() != before, path);
  }

  void explainKey(std::string_view key, const std::string& path) {
    if (key.size() != 4 || !isAscii(key))
      return add(LossCode::badKey, path, "is no tag: a tag has four ASCII characters");
    const std::string hint = key == "MKGD" ? "; the tag that is stored is MRKG" : "";
    add(LossCode::unknownTag, path, "is a tag that is never stored" + hint);
  }

  void explainValue(const TagRow& row, const Value& value, const Value& back,
                    const std::string& path, int level) {
    switch (row.write) {
      case Write::none: break;  // Not reached: see explainEntry().
      case Write::timecode:
      case Write::text: return explainText(value, back, path, 255);
      case Write::fourCC: return explainText(value, back, path, 4);
      case Write::float32:
      case Write::integerH:
      case Write::integerL:
      case Write::integerR:
      case Write::word16:
      case Write::byte8: return explainNumber(value, back, path);
      case Write::guid:
      case Write::data: return explainData(row, value, path);
      case Write::floatPair:
      case Write::floats: return explainFloats(row, value, back, path);
      case Write::integerArray: return explainIntegers(value, back, path);
      case Write::integerEach:
      case Write::textEach: return explainElements(row, value, back, path);
      case Write::nested: return explainNested(value, path, level);
      case Write::nestedEach:
      case Write::controlPoint: return explainNestedEach(row, value, path, level);
      case Write::tagGroup:
      case Write::regGroup: return explainGroup(row, value, path);
    }
  }

  void explainText(const Value& value, const Value& back, const std::string& path,
                   std::size_t most) {
    const std::string_view text = value.text();
    if (!value.isText()) return addWrongKind(value, back, path);
    if (text.empty()) return add(LossCode::textEmpty, path, "is empty and would not be written");
    if (!isAscii(text.substr(0, most))) {
      return add(LossCode::textNonAscii, path,
                 quoted(text) + " would be written as zeros: only ASCII is stored");
    }
    if (text.substr(0, most).find('\0') != std::string_view::npos) {
      return add(LossCode::textNul, path,
                 quoted(text.substr(0, text.find('\0'))) + " is followed by a NUL, which ends it");
    }
    if (text.size() > most) addTextLong(value, path, most);
  }

  void explainNumber(const Value& value, const Value& back, const std::string& path) {
    if (value.kind() == Value::Kind::float64 && back.kind() == Value::Kind::float32) {
      return add(LossCode::floatPrecision, path, "is a double and would come back as a float");
    }
    if (value.kind() != Value::Kind::integer || back.kind() != Value::Kind::integer)
      return addWrongKind(value, back, path);
    add(LossCode::intRange, path,
        std::to_string(value.int64Value()) + " would come back as " +
            std::to_string(back.int64Value()));
  }

  void explainData(const TagRow& row, const Value& value, const std::string& path) {
    if (value.kind() != Value::Kind::data) return addWrongKind(value, {}, path);
    const std::size_t size = value.data().size();
    if (size > longestRecord) return addTooLarge(path, size);
    if (row.write == Write::guid) return addGuidLength(path, size);
    addCutSize(path, size);
  }

  void explainFloats(const TagRow& row, const Value& value, const Value& back,
                     const std::string& path) {
    if (value.kind() != Value::Kind::array) return addWrongKind(value, back, path);
    const Array array = value.array();
    if (array.size() != row.count) {
      return add(LossCode::listCount, path,
                 "needs " + std::to_string(row.count) + " numbers and has " +
                     std::to_string(array.size()));
    }
    forEachChanged(array, back.array(), path,
                   [&](const Value& element, const Value& was, const std::string& at) {
                     explainNumber(element, was, at);
                   });
  }

  void explainIntegers(const Value& value, const Value& back, const std::string& path) {
    if (value.kind() != Value::Kind::array) return addWrongKind(value, back, path);
    const Array array = value.array();
    if (array.size() > longestRecord / 4) return addTooLarge(path, array.size() * 4);
    if (array.size() > 1) {
      return add(LossCode::intArray, path,
                 "has " + std::to_string(array.size()) +
                     " integers, which would all be written into the first");
    }
    forEachChanged(array, back.array(), path,
                   [&](const Value& element, const Value& was, const std::string& at) {
                     explainNumber(element, was, at);
                   });
  }

  // The lists that have a record for each element.
  void explainElements(const TagRow& row, const Value& value, const Value& back,
                       const std::string& path) {
    if (value.kind() != Value::Kind::array) return addWrongKind(value, back, path);
    const Array array = value.array();
    if (array.empty()) return addEmptyList(path);
    forEachChanged(array, back.array(), path,
                   [&](const Value& element, const Value& was, const std::string& at) {
                     row.write == Write::textEach ? explainElementText(element, was, at)
                                                  : explainNumber(element, was, at);
                   });
  }

  void explainElementText(const Value& element, const Value& back, const std::string& path) {
    const std::string_view text = element.text();
    const bool isPadded = element.isText() && text.size() < 256 && isAscii(text);
    // NULs inside it are kept, unlike those of other texts.
    const bool isCut = element.isText() && text.size() > 255 && isAscii(text.substr(0, 255));
    if (isCut) return addTextLong(element, path, 255);
    if (!isPadded) return explainText(element, back, path, 255);
    const std::size_t added = back.text().size() - text.size();
    add(LossCode::listPads, path,
        quoted(text) + " would gain " + (added == 1 ? "a NUL" : std::to_string(added) + " NULs") +
            " at its end");
  }

  void explainNested(const Value& value, const std::string& path, int level) {
    if (value.kind() != Value::Kind::dictionary) return addWrongKind(value, {}, path);
    const Dictionary nested = value.dictionary();
    explainStream(nested, path, level, 0);
    if (encoded(nested, layout_).empty()) addEmptyDictionary(path);
  }

  // A nested stream; `before` bytes stand before it in its record.
  void explainStream(const Dictionary& nested, const std::string& path, int level,
                     std::size_t before) {
    if (level + 1 >= maxNesting)
      return add(LossCode::tooDeep, path, "is nested deeper than 64 levels");
    const Stream stream = encoded(nested, layout_);
    if (stream.size() + before > longestRecord) return addTooLarge(path, stream.size());
    if (decoded(stream) != nested || nestsTooDeep(nested, level + 1))
      nested_.push_back({nested, path + "/", level + 1});
    addCutSize(path, stream.size());
  }

  void explainNestedEach(const TagRow& row, const Value& value, const std::string& path,
                         int level) {
    if (value.kind() != Value::Kind::array) return addWrongKind(value, {}, path);
    const Array array = value.array();
    if (array.empty()) return addEmptyList(path);
    const bool isControlPoint = row.write == Write::controlPoint;
    for (std::size_t i = 0; i < array.size(); ++i) {
      const Value element = array[i];
      const std::string at = path + '[' + std::to_string(i) + ']';
      if (element.kind() != Value::Kind::dictionary) {
        addWrongKind(element, {}, at);
        continue;
      }
      Dictionary nested = element.dictionary();
      if (isControlPoint) {
        explainPoint(nested, at);
        nested.remove(controlPointKey);
      }
      explainStream(nested, at, level, isControlPoint ? controlPointSize : 0);
      const bool isFollowed = isControlPoint && i + 1 < array.size();
      if (isFollowed && encoded(nested, layout_).size() % 4 != 0) addUnaligned(at);
    }
  }

  void explainPoint(const Dictionary& element, const std::string& path) {
    const Array given = element[controlPointKey].array();
    const Array back = roundTrip({{"CTLp", Array::of(element)}})["CTLp"].array();
    if (back.empty()) return;
    const Dictionary point = back[0].dictionary();
    if (point[controlPointKey] == element[controlPointKey]) return;
    add(LossCode::ctlpData, path + '/' + controlPointKey, "must be two integers of 32 bits");
  }

  void explainGroup(const TagRow& row, const Value& value, const std::string& path) {
    if (value.kind() != Value::Kind::dictionary) return addWrongKind(value, {}, path);
    const Dictionary group = value.dictionary();
    if (group.empty()) return addEmptyDictionary(path);
    const auto characters = charactersOf(row.tag);
    const std::string_view key(characters.data(), characters.size());
    for (const auto& [name, entry] : group) {
      const Dictionary back = roundTrip({{key, Dictionary{{name, entry}}}})[key].dictionary();
      if (back.size() == 1 && back[name] == entry) continue;
      explainGroupEntry(row, name, entry, back, path + '/' + std::string(name));
    }
  }

  void explainGroupEntry(const TagRow& row, std::string_view name, const Value& value,
                         const Dictionary& back, const std::string& path) {
    const bool isReg = row.write == Write::regGroup;
    if (isReg && value.isText() && !value.isDerivedText()) {
      return add(LossCode::regText, path,
                 quoted(value.text()) + " would be written as a name, and be lost");
    }
    const Value was = back.empty() ? Value() : (*back.begin()).value;
    const std::size_t before = explained();
    if (!back.contains(name)) explainName(isReg, name, path);
    if (!(was == value))
      value.isText() && was.isText() ? explainGroupText(value, was, path)
                                     : explainNumber(value, was, path);
    addUnless(explained() != before, path);
  }

  void explainName(bool isReg, std::string_view name, const std::string& path) {
    if (!isAscii(name.substr(0, 255))) {
      return add(LossCode::textNonAscii, path,
                 "has a name that would be written as zeros: only ASCII is stored");
    }
    if (name.size() > 255)
      return add(LossCode::textLong, path, "has a name of which 255 characters would be stored");
    if (isReg)
      return add(LossCode::nameGrows, path,
                 "would gain NULs at the end of its name, with every save");
    add(LossCode::textNul, path, "has a name that would lose the NULs at its end");
  }

  void explainGroupText(const Value& value, const Value& back, const std::string& path) {
    if (isAscii(value.text()) && value.text().ends_with('\0') && value.text().size() < 256) {
      return add(LossCode::textNul, path, "would lose the NULs at its end");
    }
    explainText(value, back, path, 255);
  }

  // Entries that are whole, or explained, but make a reader misread what follows them.
  void findCulprits(const Dictionary& tags, const std::string& prefix) {
    const std::vector<Dictionary::Entry> entries(tags.begin(), tags.end());
    for (std::size_t i = 0; i < entries.size(); ++i) {
      const auto& [key, value] = entries[i];
      const TagRow* row = findTagRow(key);
      if (row == nullptr || !canDamage(*row, value) || !damagesAnother(entries, i)) continue;
      const std::string path = prefix + std::string(key);
      const std::size_t size = encoded({{key, value}}, layout_).size();
      if (row->write == Write::guid) {
        addGuidLength(path, value.data().size());
      } else if (row->write == Write::integerArray) {
        addTooLarge(path, size - recordHeaderSize);
      } else if (size % 4 != 0) {
        addUnaligned(path);
      } else if (!known_.contains({LossCode::size24bit, path})) {
        addCutSize(path, size - recordHeaderSize);
      }
    }
  }

  static bool canDamage(const TagRow& row, const Value& value) {
    const Write rule = row.write;
    // Has its true size in both layouts, and that wraps.
    if (rule == Write::integerArray) return value.array().size() > longestRecord / 4;
    return rule == Write::data || rule == Write::guid || rule == Write::nested ||
           rule == Write::nestedEach || rule == Write::controlPoint;
  }

  // Whether another entry comes back differently beside the one at `culprit` than alone.
  bool damagesAnother(const std::vector<Dictionary::Entry>& entries, std::size_t culprit) const {
    // From the end, where those stand that are most likely written behind it.
    for (std::size_t i = entries.size(); i-- > 0;) {
      if (i == culprit) continue;
      const auto& [key, value] = entries[i];
      const Dictionary::Entry& first = entries[std::min(i, culprit)];
      const Dictionary::Entry& second = entries[std::max(i, culprit)];
      const Dictionary both = {{first.key, first.value}, {second.key, second.value}};
      const Value back = roundTrip(both)[key];
      if (back != roundTrip({{key, value}})[key] && !isLengthened(value, back)) return true;
    }
    return false;
  }

  // A GUID that is too short takes the bytes of whatever follows it for its own: its doing alone.
  static bool isLengthened(const Value& value, const Value& back) {
    const auto bytes = value.data();
    return back.data().size() > bytes.size() &&
           std::ranges::equal(back.data().first(bytes.size()), bytes);
  }

  // Whether a stream in this value, which comes back as it is when it stands alone, would stand
  // deeper than streams are read.
  static bool nestsTooDeep(std::string_view key, const Value& value, int level) {
    const TagRow* row = findTagRow(key);
    if (row == nullptr) return false;
    if (row->write == Write::nested)
      return level + 1 >= maxNesting || nestsTooDeep(value.dictionary(), level + 1);
    if (row->write != Write::nestedEach && row->write != Write::controlPoint) return false;
    const Array array = value.array();
    return std::any_of(array.begin(), array.end(), [&](const Value& element) {
      return level + 1 >= maxNesting || nestsTooDeep(element.dictionary(), level + 1);
    });
  }
  static bool nestsTooDeep(const Dictionary& tags, int level) {
    return std::any_of(tags.begin(), tags.end(), [&](const Dictionary::Entry& entry) {
      return nestsTooDeep(entry.key, entry.value, level);
    });
  }

  template <class Explain>
  static void forEachChanged(const Array& array, const Array& back, const std::string& path,
                             Explain explain) {
    for (std::size_t i = 0; i < array.size(); ++i) {
      const Value was = i < back.size() ? back[i] : Value();
      if (!(array[i] == was)) explain(array[i], was, path + '[' + std::to_string(i) + ']');
    }
  }

  void addTextLong(const Value& value, const std::string& path, std::size_t most) {
    add(LossCode::textLong, path,
        quoted(value.text()) + " has " + std::to_string(value.length()) + " characters, of which " +
            std::to_string(most) + " would be stored");
  }
  void addWrongKind(const Value& value, const Value& back, const std::string& path) {
    std::string message = "is " + std::string(nameOf(value.kind()));
    message += back.isNothing() ? ", which is not stored there"
                                : ", and would come back as " + std::string(nameOf(back.kind()));
    add(LossCode::wrongKind, path, std::move(message));
  }
  void addEmptyList(const std::string& path) {
    add(LossCode::listEmpty, path, "has no elements and would leave no record");
  }
  void addEmptyDictionary(const std::string& path) {
    add(LossCode::emptyNested, path, "has no entries to be stored and would leave no record");
  }
  void addTooLarge(const std::string& path, std::size_t size) {
    add(LossCode::size24bit, path,
        "takes " + std::to_string(size) + " bytes, more than a record holds");
  }
  void addUnaligned(const std::string& path) {
    add(LossCode::dataUnaligned, path,
        "is not a multiple of 4 bytes, so that what follows would be misread");
  }
  void addGuidLength(const std::string& path, std::size_t size) {
    add(LossCode::guidLength, path,
        "has " + std::to_string(size) + " bytes and would be stored as if it had 16");
  }
  void addCutSize(const std::string& path, std::size_t size) {
    if (layout_ != Layout::exact || size <= 0xFFFF) return;
    add(LossCode::size16bit, path,
        "takes " + std::to_string(size) + " bytes, of which the size would keep 16 bits");
  }

  // So that nothing is lost without a word, even in a way that nobody has thought of.
  void addUnless(bool isExplained, const std::string& path) {
    if (isExplained) return;
    add(LossCode::notReadBack, path, "would come back changed");  // Not reached: as far as is known
  }

  // Each loss once: what damages itself may be found again as damaging others.
  void add(LossCode code, std::string path, std::string message) {
    if (!known_.emplace(code, path).second) return;
    losses_.push_back({code, std::move(path), std::move(message), std::nullopt});
  }

  std::size_t explained() const { return losses_.size() + nested_.size(); }

  const Layout layout_;
  std::vector<Loss> losses_;
  // Nested streams that have to be explained in their turn: a stack frame for each would not do,
  // they may stand 64 deep.
  struct Nested {
    Dictionary tags;
    std::string prefix;
    int level;
  };
  std::vector<Nested> nested_;
  std::set<std::pair<LossCode, std::string>> known_;
};

}  // namespace

std::string_view codeOf(LossCode code) noexcept {
  return codes[static_cast<std::size_t>(code)].second;
}

std::optional<LossCode> lossCodeOf(std::string_view code) noexcept {
  const auto found =
      std::find_if(codes.begin(), codes.end(), [&](const auto& row) { return row.second == code; });
  return found == codes.end() ? std::nullopt : std::optional(found->first);
}

std::vector<Loss> findLosses(const Dictionary& tags, Layout layout) {
  std::vector<Loss> losses = LossFinder(layout).find(tags);
  if (losses.empty()) return losses;
  const Layout other = layout == Layout::exact ? Layout::readable : Layout::exact;
  std::set<std::pair<LossCode, std::string>> others;
  for (Loss& loss : LossFinder(other).find(tags)) others.emplace(loss.code, std::move(loss.path));
  for (Loss& loss : losses) {
    if (!others.contains({loss.code, loss.path})) loss.avoidedBy = other;
  }
  return losses;
}

}  // namespace oxmv
