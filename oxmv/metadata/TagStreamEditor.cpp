#include "oxmv/metadata/TagStreamEditor.h"

#include <algorithm>
#include <array>
#include <memory>
#include <new>
#include <utility>
#include <variant>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/LittleEndian.h"

namespace oxmv {
namespace {

using Bytes = std::vector<std::uint8_t>;
using BytesView = std::span<const std::uint8_t>;

constexpr auto refusals =
    std::to_array<std::string_view>({"bad-path", "absent", "not-stored", "would-not-read-back",
                                     "too-short", "marker-first", "damaged-stream", "too-deep"});
static_assert(refusals.size() == static_cast<std::size_t>(EditRefusal::tooDeep) + 1);

// Whether a stream stands for itself or within another one.
enum class Standing : std::uint8_t { outermost, nested };

// What a reader makes of a stream. One that stands for itself has no tags if it is too short.
Dictionary decoded(BytesView stream, Standing standing, StreamObserver* observer = nullptr) {
  if (standing == Standing::outermost && stream.size() < shortestData) return {};
  const auto length = static_cast<std::int32_t>(std::min<std::size_t>(stream.size(), 0x7FFFFFFF));
  return decodeStream(stream, length, nullptr, observer);
}

// A record of the stream itself, not of one nested in it.
struct Spot {
  Tag tag;
  std::size_t offset;
  std::size_t end;  // where the next record starts, or the stream ends
  std::uint32_t size;
  bool isStored = true;
  std::string name;      // of a group's records: of the entry
  bool isNamed = false;  // by the edit, which takes it out

  // How many bytes of its payload are there.
  std::size_t payload() const {
    return std::min<std::size_t>(size, end - offset - recordHeaderSize);
  }
};

// Gathers the records and the markers that a reader finds.
class SpotCollector final : public StreamObserver {
 public:
  explicit SpotCollector(std::size_t streamSize) : streamSize_(streamSize) {}

  std::vector<Spot> spots;
  std::vector<std::size_t> markers;  // where they are

  void onRecord(const Record& record) override {
    if (record.level != 0) return;
    const std::size_t length = std::max<std::size_t>(record.length, recordHeaderSize);
    spots.push_back({record.tag,
                     record.offset,
                     std::min(record.offset + length, streamSize_),
                     record.size,
                     true,
                     {},
                     false});
  }
  void onValue(const Record& record, const Value& value) override {
    if (record.level != 0) return;
    switch (record.row->read) {
      case Read::tagName: spots.back().name = tagName_ = value.text(); break;
      case Read::regName: spots.back().name = regName_ = value.text(); break;
      case Read::tagValue: spots.back().name = tagName_; break;
      case Read::regValue: spots.back().name = regName_; break;
      default: break;
    }
  }
  void onMarker(std::size_t offset, std::uint32_t, int level) override {
    if (level == 0) markers.push_back(offset);
  }
  void onSkip(const Record& record, SkipReason) override { dismiss(record); }
  void onStop(std::size_t, std::size_t, int, SkipReason reason, const Record* record) override {
    if (reason == SkipReason::incompleteRecord) dismiss(*record);
  }

 private:
  void dismiss(const Record& record) {
    if (record.level != 0) return;
    const auto spot = std::find_if(spots.rbegin(), spots.rend(), [&](const Spot& candidate) {
      return candidate.offset == record.offset;
    });
    if (spot != spots.rend()) spot->isStored = false;
  }

  const std::size_t streamSize_;
  std::string tagName_, regName_;
};

// Which of the tags that are written together this one is: the encoder's order.
int rankOf(Tag tag) {
  constexpr int inOrder = 3;
  constexpr auto leading = std::to_array({"PRCS"_tag, "UFRM"_tag, "TIMC"_tag});
  constexpr auto deferred = std::to_array(
      {"COL1"_tag, "COL2"_tag, "DTIN"_tag, "DTDR"_tag, "DTFI"_tag, "DTFO"_tag, "CTLp"_tag});
  static_assert(leading.size() == inOrder);
  const auto first = std::find(leading.begin(), leading.end(), tag);
  if (first != leading.end()) return static_cast<int>(first - leading.begin());
  const auto last = std::find(deferred.begin(), deferred.end(), tag);
  return last == deferred.end() ? inOrder : inOrder + 1 + static_cast<int>(last - deferred.begin());
}

bool isRepeated(const TagRow& row) {
  return row.write == Write::integerEach || row.write == Write::textEach ||
         row.write == Write::nestedEach || row.write == Write::controlPoint;
}

bool isGroup(const TagRow& row) {
  return row.write == Write::tagGroup || row.write == Write::regGroup;
}

// A path, taken apart.
struct Target {
  const TagRow* row;      // of the first tag
  std::string_view key;   // its four letters
  std::string_view rest;  // behind its '/': a tag nested in it, or a name in a group
  bool isInside;          // whether there is a rest; a name may be empty
};

std::optional<Target> parse(std::string_view path) {
  const std::string_view key = path.substr(0, 4);
  const TagRow* row = findTagRow(key);
  if (row == nullptr) return std::nullopt;
  if (path.size() == 4) return Target{row, key, {}, false};
  const bool canHold = row->write == Write::nested || isGroup(*row);
  if (path[4] != '/' || !canHold) return std::nullopt;
  return Target{row, key, path.substr(5), true};
}

enum class Operation : std::uint8_t { set, append, remove };

struct Edit {
  Operation operation;
  Value value;
  Fidelity fidelity;
  Layout layout;
};

// Thrown within this file, where an edit is found out to be impossible.
struct Refused {
  EditError error;
};

[[noreturn]] void refuse(EditRefusal refusal, std::string message, std::size_t offset = 0) {
  throw Refused{{refusal, std::move(message), offset}};
}

// New records, and what a reader makes of them.
struct Encoded {
  std::vector<Bytes> records;  // padded to 4
  Dictionary tags;
};

Bytes padded(BytesView bytes) {
  Bytes made(bytes.begin(), bytes.end());
  made.resize((made.size() + 3) & ~std::size_t{3});
  return made;
}

// The changes to be made to a stream, in the order of their offsets.
class Splice {
 public:
  // Puts `bytes` in place of those from `begin` to `end`.
  void replace(std::size_t begin, std::size_t end, Bytes bytes) {
    growth_ += offset(bytes.size()) - offset(end - begin);
    changes_.push_back({begin, end, std::move(bytes), growth_});
  }

  // Where what was there stands after all changes; nothing for what was taken out.
  std::optional<std::size_t> moved(std::size_t at) const {
    const auto behind = std::upper_bound(
        changes_.begin(), changes_.end(), at,
        [](std::size_t place, const Change& change) { return place < change.begin; });
    if (behind == changes_.begin()) return at;
    const Change& before = *std::prev(behind);
    if (at < before.end) return std::nullopt;
    return at + static_cast<std::size_t>(before.growth);
  }

  Bytes applyTo(BytesView stream) const {
    Bytes made;
    std::size_t at = 0;
    for (const Change& change : changes_) {
      made.insert(made.end(), stream.begin() + offset(at), stream.begin() + offset(change.begin));
      made.insert(made.end(), change.bytes.begin(), change.bytes.end());
      at = change.end;
    }
    made.insert(made.end(), stream.begin() + offset(at), stream.end());
    return made;
  }

 private:
  struct Change {
    std::size_t begin, end;
    Bytes bytes;
    std::ptrdiff_t growth;  // of the stream, by this change and those before
  };
  static std::ptrdiff_t offset(std::size_t at) { return static_cast<std::ptrdiff_t>(at); }

  std::vector<Change> changes_;
  std::ptrdiff_t growth_ = 0;
};

Bytes joined(const std::vector<Bytes>& records) {
  Bytes all;
  for (const Bytes& record : records) all.insert(all.end(), record.begin(), record.end());
  return all;
}

// One edit of one stream. Streams nested in it are edited by editors of their own.
class StreamEdit {
 public:
  // Level 0 is the outermost stream.
  StreamEdit(BytesView stream, int level, const Edit& edit)
      : stream_(stream),
        level_(level),
        standing_(level == 0 ? Standing::outermost : Standing::nested),
        edit_(edit) {
    SpotCollector collector(stream.size());
    tags_ = decoded(stream, standing_, &collector);
    spots_ = std::move(collector.spots);
    markers_ = std::move(collector.markers);
  }

  Bytes run(const Target& target) {
    if (!target.isInside) {
      editTag(target);
    } else if (isGroup(*target.row)) {
      editEntry(target);
    } else {
      editNested(target);
    }
    Bytes edited = splice_.applyTo(stream_);
    check(edited);
    return edited;
  }

 private:
  void check(const Bytes& edited) const {
    SpotCollector found(edited.size());
    const bool isTooShort = standing_ == Standing::outermost && edited.size() < shortestData;
    const bool isExpected = decoded(edited, standing_, &found) == expected_;
    if (isExpected && (isTooShort || hasTheRest(found))) return;
    if (isTooShort) {
      refuse(EditRefusal::tooShort, "fewer than 12 bytes would be left, which nobody reads", at_);
    }
    if (startsWithMarker(edited) && !startsWithMarker(stream_)) {
      refuse(EditRefusal::markerFirst, "a marker would come first, where it is none", at_);
    }
    refuse(EditRefusal::damagedStream,
           "readers would not find the change there, or would lose something else", at_);
  }

  // Whether readers still find every record and every marker that is not named, and each as what it
  // was. What begins with the bytes of a marker is a tag where it comes first, or behind a marker;
  // and a payload that is not all there takes what is put behind it. Of an unknown tag no value
  // would be missed.
  bool hasTheRest(const SpotCollector& found) const {
    const auto isFound = [&](const Spot& spot) {
      if (spot.isNamed) return true;
      const auto place = splice_.moved(spot.offset);
      const auto now =
          std::lower_bound(found.spots.begin(), found.spots.end(), place.value_or(0),
                           [](const Spot& other, std::size_t at) { return other.offset < at; });
      return place && now != found.spots.end() && now->offset == *place && now->tag == spot.tag &&
             now->payload() == spot.payload();
    };
    const auto isFoundMarker = [&](std::size_t marker) {
      const auto place = splice_.moved(marker);
      return place && std::binary_search(found.markers.begin(), found.markers.end(), *place);
    };
    return std::all_of(spots_.begin(), spots_.end(), isFound) &&
           std::all_of(markers_.begin(), markers_.end(), isFoundMarker);
  }

  static bool startsWithMarker(BytesView stream) {
    return stream.size() >= markerBytes.size() &&
           std::equal(markerBytes.begin(), markerBytes.end(), stream.begin());
  }

  // A writer that does not pad leaves the start of the next record where readers see padding. Who
  // takes out the record, or puts something behind it, would cut that one in two.
  void checkPadding(const Spot& spot) const {
    const std::size_t payloadEnd = spot.offset + recordHeaderSize + spot.size;
    const bool isClean = payloadEnd >= spot.end ||
                         std::all_of(stream_.begin() + static_cast<std::ptrdiff_t>(payloadEnd),
                                     stream_.begin() + static_cast<std::ptrdiff_t>(spot.end),
                                     [](std::uint8_t byte) { return byte == 0; });
    if (!isClean) {
      refuse(EditRefusal::damagedStream,
             "what stands in the padding of a record there would be lost", payloadEnd);
    }
  }

  void editTag(const Target& target) {
    expected_ = tags_;
    const std::vector<std::size_t> own = spotsOf(target);
    if (edit_.operation == Operation::remove) {
      if (own.empty()) refuse(EditRefusal::absent, "it is not there");
      expected_.remove(target.key);
      return replaceAll(own, {});
    }
    if (edit_.operation == Operation::append) return appendTo(target, own);
    const Encoded made = encode(target, edit_.value);
    expected_.set(target.key, made.tags[target.key]);
    if (own.empty()) return insert(target.row->tag, made.records);
    if (isRepeated(*target.row) || isGroup(*target.row)) return replaceAll(own, made.records);
    replaceAll({whatCounts(own)}, made.records);
  }

  void appendTo(const Target& target, const std::vector<std::size_t>& own) {
    if (!isRepeated(*target.row)) refuse(EditRefusal::badPath, "it is no list: set it instead");
    Encoded made = encode(target, Array::of(edit_.value));
    if (made.tags[target.key].array().size() != 1) refuseFragments();
    std::vector<Value> elements;
    for (const Value& element : tags_[target.key].array()) elements.push_back(element);
    for (const Value& element : made.tags[target.key].array()) elements.push_back(element);
    expected_.set(target.key, Array(std::move(elements)));
    if (own.empty()) return insert(target.row->tag, made.records);
    // The terminator of control points, if they have one, stays behind them.
    std::size_t last = own.size();
    while (last > 1 && spots_[own[last - 1]].tag != target.row->tag) --last;
    if (last < own.size()) made.records.resize(1);
    insertBehind(own[last - 1], made.records);
  }

  void editEntry(const Target& target) {
    expected_ = tags_;
    const bool isReg = target.row->write == Write::regGroup;
    if (edit_.operation == Operation::append)
      refuse(EditRefusal::badPath, "it is no list: set it instead");
    Dictionary group = tags_[target.key].dictionary();
    const std::string name = nameIn(group, target.rest, isReg);
    const std::vector<std::size_t> own = spotsOfEntry(isReg, name);
    if (edit_.operation == Operation::remove) {
      if (!group.contains(name)) refuse(EditRefusal::absent, "it is not there");
      group.remove(name);
      expectGroup(target, group);
      return replaceAll(own, {});
    }
    const bool isThere = group.contains(name);
    const Encoded made = encodeEntry(target, name, isThere);
    for (const auto& [madeName, value] : made.tags[target.key].dictionary()) {
      group.set(isThere ? std::string_view(name) : madeName, value);
    }
    expectGroup(target, group);
    if (!isThere) return insertIntoGroup(target, made.records);
    // The name stays; the record behind it is the last one of its value.
    replaceAll({own.back()}, {made.records.back()});
  }

  void expectGroup(const Target& target, const Dictionary& group) {
    if (group.empty()) {
      expected_.remove(target.key);
    } else {
      expected_.set(target.key, group);
    }
  }

  void editNested(const Target& target) {
    // Each level takes stack, and nothing below the last one would be read.
    if (level_ + 1 >= maxNesting) refuse(EditRefusal::tooDeep, "no stream is read so deep");
    expected_ = tags_;
    const auto inner = parse(target.rest);
    if (!inner) refuse(EditRefusal::badPath, "there is no such tag");
    const std::vector<std::size_t> own = spotsOf(target);
    const bool isThere = tags_.contains(target.key);
    if (!isThere && edit_.operation == Operation::remove)
      refuse(EditRefusal::absent, "it is not there");
    const std::size_t spot = isThere ? whatCounts(own) : 0;
    const std::size_t payload = isThere ? spots_[spot].offset + recordHeaderSize : 0;
    const BytesView nested = isThere ? stream_.subspan(payload, spots_[spot].size) : BytesView();
    const Bytes edited = editInner(nested, *inner, payload);
    expectNested(target, edited);
    if (!isThere) return insert(target.row->tag, {recordOf(target.row->tag, edited)});
    replaceAll({spot}, {recordOf(target.row->tag, edited)});
  }

  Bytes editInner(BytesView nested, const Target& inner, std::size_t offset) const {
    try {
      // On the heap: there may be one for each level at a time.
      return std::make_unique<StreamEdit>(nested, level_ + 1, edit_)->run(inner);
    } catch (Refused& refused) {
      refused.error.offset += offset;
      throw;
    }
  }

  void expectNested(const Target& target, const Bytes& nested) {
    // A nested stream of size 0 stores nothing.
    if (nested.empty()) {
      expected_.remove(target.key);
    } else {
      expected_.set(target.key, decoded(nested, Standing::nested));
    }
  }

  static Bytes recordOf(Tag tag, const Bytes& payload) {
    if (payload.size() > longestRecord)
      refuse(EditRefusal::notStored, "it takes more bytes than a record holds");
    Bytes record(recordHeaderSize);
    storeLe32(record.data(), static_cast<std::uint32_t>(tag));
    storeLe32(record.data() + 4,
              static_cast<std::uint32_t>(payload.size()));  // the type of nested streams is 0
    record.insert(record.end(), payload.begin(), payload.end());
    return padded(record);
  }

  // The records that the encoder makes of a value. Of a pair only the one that is asked for.
  Encoded encode(const Target& target, const Value& value) const {
    Encoded made = encodedRecords({{target.key, value}}, *target.row);
    if (made.records.empty() || !made.tags.contains(target.key)) {
      refuse(EditRefusal::notStored, "nothing would be stored");
    }
    if (edit_.fidelity == Fidelity::strict && made.tags[target.key] != value) {
      refuse(EditRefusal::wouldNotReadBack, "it would come back changed");
    }
    const bool isOne = !isRepeated(*target.row) && !isGroup(*target.row);
    if (isOne && made.records.size() != 1) refuseFragments();
    return made;
  }

  // Of a size whose low 16 bits are kept readers see the start of the bytes as the value; and in
  // the others, which may be anything, records.
  [[noreturn]] static void refuseFragments() {
    refuse(EditRefusal::wouldNotReadBack, "it would come back in pieces");
  }

  // The records of a group's entry. `isThere`: only its value counts, for the name in the stream
  // stays.
  Encoded encodeEntry(const Target& target, std::string_view name, bool isThere) const {
    Encoded made = encodedRecords({{target.key, Dictionary{{name, edit_.value}}}}, *target.row);
    const Dictionary group = made.tags[target.key].dictionary();
    if (group.empty()) refuse(EditRefusal::notStored, "nothing would be stored");
    const auto [madeName, value] = *group.begin();
    const bool isSame = value == edit_.value && (isThere || madeName == name);
    if (edit_.fidelity == Fidelity::strict && !isSame)
      refuse(EditRefusal::wouldNotReadBack, "it would come back changed");
    return made;
  }

  Encoded encodedRecords(const Dictionary& tags, const TagRow& row) const {
    const auto stream = encodeStream(tags, edit_.layout);
    if (!stream) throw std::bad_alloc();
    SpotCollector collector(stream->size());
    Encoded made;
    made.tags = decoded(*stream, Standing::nested, &collector);
    for (const std::size_t i : recordsOf(row, collector.spots, *stream)) {
      const Spot& spot = collector.spots[i];
      made.records.push_back(
          padded(BytesView(*stream).subspan(spot.offset, spot.end - spot.offset)));
    }
    return made;
  }

  // Eight zeros, with which the writer ends a list of control points.
  static bool isTerminator(const Spot& spot, BytesView stream) {
    return spot.tag == Tag{} && spot.size == 0 && stream[spot.offset + recordHeaderSize - 1] == 0;
  }

  // Whether a record of that tag is one of the row's: of its group, or the terminator of control
  // points.
  static bool belongsTo(const TagRow& row, Tag tag) {
    if (row.write == Write::tagGroup) return tag == "TAGN"_tag || tag == "TAGV"_tag;
    if (row.write == Write::regGroup) return tag == "REGN"_tag || tag == "REGV"_tag;
    return tag == row.tag || (row.write == Write::controlPoint && tag == Tag{});
  }

  // Indices of the records that a row's value, or a whole group, consists of.
  static std::vector<std::size_t> recordsOf(const TagRow& row, const std::vector<Spot>& spots,
                                            BytesView stream) {
    std::vector<std::size_t> own;
    for (std::size_t i = 0; i < spots.size(); ++i) {
      // Zeros are a terminator only directly behind a control point.
      const bool isBehindPoint =
          !own.empty() && own.back() + 1 == i && spots[own.back()].tag != Tag{};
      if (spots[i].tag == Tag{} && !(isBehindPoint && isTerminator(spots[i], stream))) continue;
      if (belongsTo(row, spots[i].tag)) own.push_back(i);
    }
    return own;
  }
  std::vector<std::size_t> spotsOf(const Target& target) const {
    return recordsOf(*target.row, spots_, stream_);
  }

  // Those of an entry: names and values that were stored under it.
  std::vector<std::size_t> spotsOfEntry(bool isReg, std::string_view name) const {
    const TagRow& row = *findTagRow(isReg ? "REG "_tag : "TAG "_tag);
    std::vector<std::size_t> own;
    for (std::size_t i = 0; i < spots_.size(); ++i) {
      if (belongsTo(row, spots_[i].tag) && spots_[i].isStored && spots_[i].name == name)
        own.push_back(i);
    }
    return own;
  }

  // Names in the group "REG " keep the NULs of their records; nobody types those.
  static std::string nameIn(const Dictionary& group, std::string_view typed, bool isReg) {
    if (!isReg || group.contains(typed)) return std::string(typed);
    for (const auto& [name, value] : group) {
      if (name.substr(0, name.find_last_not_of('\0') + 1) == typed) return std::string(name);
    }
    return std::string(typed);
  }

  // The record whose value the dictionary has: the last one that was read; where none was, the
  // last.
  std::size_t whatCounts(const std::vector<std::size_t>& own) const {
    const auto counts =
        std::find_if(own.rbegin(), own.rend(), [&](std::size_t i) { return spots_[i].isStored; });
    return counts == own.rend() ? own.back() : *counts;
  }

  // Takes those records out, and puts the new ones where the first stood.
  void replaceAll(const std::vector<std::size_t>& own, const std::vector<Bytes>& records) {
    at_ = spots_[own.front()].offset;
    for (std::size_t i = 0; i < own.size(); ++i) {
      Spot& spot = spots_[own[i]];
      checkPadding(spot);
      spot.isNamed = true;
      splice_.replace(spot.offset, spot.end, i == 0 ? joined(records) : Bytes());
    }
  }

  // Where the encoder would have put them.
  void insert(Tag tag, const std::vector<Bytes>& records) {
    const int rank = rankOf(tag);
    std::optional<std::size_t> before;
    for (std::size_t i = 0; i < spots_.size(); ++i) {
      const bool isKnown = findTagRow(spots_[i].tag) != nullptr;
      if (isKnown && rankOf(spots_[i].tag) <= rank) before = i;
    }
    if (before) return insertBehind(*before, records);
    insertAt(spots_.empty() ? 0 : spots_.front().offset, records);
  }

  void insertIntoGroup(const Target& target, const std::vector<Bytes>& records) {
    const std::vector<std::size_t> own = spotsOf(target);
    own.empty() ? insert(target.row->tag, records) : insertBehind(own.back(), records);
  }

  void insertBehind(std::size_t spot, const std::vector<Bytes>& records) {
    // The stream's last record may lack its padding, and gets it now.
    const Spot& before = spots_[spot];
    checkPadding(before);
    Bytes padding((4 - (before.end - before.offset) % 4) % 4);
    at_ = before.end;
    Bytes bytes = std::move(padding);
    const Bytes all = joined(records);
    bytes.insert(bytes.end(), all.begin(), all.end());
    splice_.replace(at_, at_, std::move(bytes));
  }

  void insertAt(std::size_t offset, const std::vector<Bytes>& records) {
    at_ = offset;
    splice_.replace(offset, offset, joined(records));
  }

  const BytesView stream_;
  const int level_;
  const Standing standing_;
  const Edit& edit_;
  Dictionary tags_;          // what the stream gives
  std::vector<Spot> spots_;  // its records
  std::vector<std::size_t> markers_;
  Splice splice_;        // what is to be changed in it
  Dictionary expected_;  // what it is to give then
  std::size_t at_ = 0;   // where the change begins
};

std::optional<EditError> edit(Bytes& stream, std::string_view path, const Edit& edit) {
  const auto target = parse(path);
  if (!target) return EditError{EditRefusal::badPath, "there is no such tag"};
  try {
    stream = StreamEdit(stream, 0, edit).run(*target);
  } catch (Refused& refused) {
    return std::move(refused.error);
  }
  return std::nullopt;
}

}  // namespace

std::string_view codeOf(EditRefusal refusal) noexcept {
  return refusals[static_cast<std::size_t>(refusal)];
}

std::optional<EditError> TagStreamEditor::set(std::string_view path, const Value& value,
                                              Fidelity fidelity) {
  return edit(stream_, path, {Operation::set, value, fidelity, layout_});
}

std::optional<EditError> TagStreamEditor::append(std::string_view path, const Value& element,
                                                 Fidelity fidelity) {
  return edit(stream_, path, {Operation::append, element, fidelity, layout_});
}

std::optional<EditError> TagStreamEditor::remove(std::string_view path) {
  return edit(stream_, path, {Operation::remove, {}, Fidelity::strict, layout_});
}

}  // namespace oxmv
