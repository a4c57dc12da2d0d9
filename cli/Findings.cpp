#include "cli/Findings.h"

#include <algorithm>
#include <array>
#include <cstddef>

#include <fmt/format.h>

#include "cli/TagNames.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

std::string tagOf(const Finding& finding) {
  return finding.tag ? visibleTag(*finding.tag) : std::string();
}

std::string describeSkip(const Finding& finding) {
  const std::string tag = tagOf(finding);
  const TagRow* row = findTagRow(*finding.tag);
  if (finding.reason == SkipReason::wrongSize && row != nullptr)
    return fmt::format("{} size {}: ignored, needs {}", tag, finding.size, row->count * 4);
  if (finding.reason == SkipReason::unknownTag && row != nullptr)
    return fmt::format("{}: ignored, this tag is never read", tag);
  if (finding.reason == SkipReason::tooDeep)
    return fmt::format("{}: ignored, more than {} streams within one another", tag, maxNesting);
  return fmt::format("{}: ignored, {}", tag, describe(finding.reason));
}

std::string describeStop(const Finding& finding) {
  const std::uint32_t payload =
      finding.count - std::min<std::uint32_t>(finding.count, recordHeaderSize);
  const std::string tag = tagOf(finding);
  switch (finding.reason) {
    case SkipReason::incompleteRecord:
    case SkipReason::truncatedRecord:
      return fmt::format("record {} claims {} bytes, {} are left", tag, finding.size, payload);
    case SkipReason::cutHeader:
      return fmt::format("{} bytes are left, a record needs {}", finding.count, recordHeaderSize);
    case SkipReason::cutMarker:
      return fmt::format("{} bytes are left, a marker needs {}", finding.count, markerSize);
    case SkipReason::lengthZero:
      return fmt::format("record {} of size {} leads back to itself", tag, finding.size);
    case SkipReason::overlappingRecord:
      return fmt::format("record {} of size {} claims bytes that were read before", tag,
                         finding.size);
    case SkipReason::unknownTag:
    case SkipReason::wrongSize:
    case SkipReason::shortPayload:
    case SkipReason::emptyNested:
    case SkipReason::valueWithoutName:
    case SkipReason::nameWithoutValue:
    case SkipReason::tooDeep: break;  // none of them ends a walk
  }
  return fmt::format("record {}: {}", tag, describe(finding.reason));
}

bool isText(const Record& record) {
  switch (record.row->read) {
    case Read::text:
    case Read::texts:
    case Read::tagName:
    case Read::regName: return true;
    case Read::tagValue: return record.type == recordType::text;
    case Read::regValue: return record.type != recordType::integerL;
    case Read::none:
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
    case Read::controlPoint: return false;
  }
  return false;
}

// These tags' texts fill their payloads to the end when they are a multiple of 4 long.
bool mayEndWithoutNul(const TagRow& row) {
  return row.write == Write::timecode || row.write == Write::fourCC;
}

bool isSingleValued(const TagRow& row) {
  return row.read != Read::texts && row.read != Read::ints && row.read != Read::nestedList &&
         row.read != Read::controlPoint;
}

// How many bytes of payload the rule of a record's tag takes, whatever its size says; its size,
// where it takes all.
std::uint32_t bytesTaken(const Record& record) {
  constexpr std::uint32_t number = 4;
  constexpr std::uint32_t guid = 16;
  switch (record.row->read) {
    case Read::int32:
    case Read::uint8:
    case Read::uint16:
    case Read::float32:
    case Read::ints: return number;
    case Read::integers: return record.size / number * number;
    case Read::guid: return guid;
    case Read::controlPoint: return std::max(record.size, controlPointSize);
    case Read::tagValue:
    case Read::regValue: return isText(record) ? record.size : number;
    case Read::none:
    case Read::text:
    case Read::floats:
    case Read::data:
    case Read::nested:
    case Read::texts:
    case Read::nestedList:
    case Read::tagName:
    case Read::regName: break;
  }
  return record.size;
}

bool isZeros(const Record& record) {
  return record.tag == Tag{} && record.size == 0 && record.type == 0;
}

std::uint32_t narrow(std::size_t number) { return static_cast<std::uint32_t>(number); }

}  // namespace

std::string_view codeOf(const Finding& finding) noexcept {
  switch (finding.oddity) {
    case Oddity::skipped:
    case Oddity::stopped: return oxmv::codeOf(finding.reason);
    case Oddity::cutPayload: return oxmv::codeOf(SkipReason::incompleteRecord);
    case Oddity::zeros: return oxmv::codeOf(SkipReason::unknownTag);
    case Oddity::terminator: return "terminator";
    case Oddity::replaced: return "replaced-value";
    case Oddity::oddSize: return "odd-size";
    case Oddity::notUtf8: return "text-not-utf8";
    case Oddity::withoutNul: return "text-without-nul";
    case Oddity::paddingMissing: return "padding-missing";
    case Oddity::paddingNotZero: return "padding-not-zero";
    case Oddity::tooShort: return "too-short";
  }
  return {};
}

std::string describe(const Finding& finding) {
  const std::string tag = tagOf(finding);
  switch (finding.oddity) {
    case Oddity::skipped: return describeSkip(finding);
    case Oddity::stopped: return describeStop(finding);
    case Oddity::cutPayload:
      return fmt::format("{} claims {} bytes, {} are there", tag, finding.size, finding.count);
    case Oddity::zeros: return fmt::format("{} bytes of zeros: ignored", finding.count);
    case Oddity::terminator: return "end of the control points";
    case Oddity::replaced:
      return fmt::format("{}: its value is replaced at byte {}", tag, finding.other);
    case Oddity::oddSize:
      return fmt::format("{} size {}: read as if it were {}", tag, finding.size, finding.count);
    case Oddity::notUtf8: return fmt::format("{}: not UTF-8, read as ISO-8859-1", tag);
    case Oddity::withoutNul: return fmt::format("{}: its text has no NUL at its end", tag);
    case Oddity::paddingMissing:
      return fmt::format("{}: {} bytes of padding are missing behind it", tag, finding.count);
    case Oddity::paddingNotZero: return fmt::format("{}: its padding is not zero", tag);
    case Oddity::tooShort:
      return fmt::format("{} bytes are too few: a clip with tags has {} or more", finding.count,
                         shortestData);
  }
  return {};
}

std::string locate(const Finding& finding) {
  const bool isStop = finding.oddity == Oddity::stopped;
  return fmt::format("{}byte {}: {}", isStop ? "stopped at " : "", finding.offset,
                     describe(finding));
}

void writeFinding(JsonWriter& json, const Finding& finding) {
  json.beginObject();
  json.member("code", codeOf(finding));
  json.member("offset", std::size_t{finding.offset});
  json.member("tag", finding.tag ? std::optional(tagInJson(*finding.tag)) : std::nullopt);
  json.member("message", describe(finding));
  json.endObject();
}

bool isLoss(const Finding& finding) noexcept {
  switch (finding.oddity) {
    case Oddity::skipped:
    case Oddity::stopped:
    case Oddity::cutPayload:
    case Oddity::oddSize:
    case Oddity::zeros: return true;
    case Oddity::tooShort: return finding.count != 0;
    case Oddity::terminator:
    case Oddity::replaced:
    case Oddity::notUtf8:
    case Oddity::withoutNul:
    case Oddity::paddingMissing:
    case Oddity::paddingNotZero: return false;
  }
  return false;
}

FindingCollector::FindingCollector(std::span<const std::uint8_t> bytes) : bytes_(bytes) {
  begin(0, bytes.size());
}

std::vector<Finding> FindingCollector::finish() {
  takeNestedValue();
  if (bytes_.size() < shortestData)
    findings_.push_back(
        {.oddity = Oddity::tooShort, .order = 2 * records_, .count = narrow(bytes_.size())});
  // Some are known only long after their record has gone by.
  std::stable_sort(findings_.begin(), findings_.end(),
                   [](const Finding& a, const Finding& b) { return a.order < b.order; });
  return std::move(findings_);
}

// A walk begins, over a stream that ends at `end`.
void FindingCollector::begin(int level, std::size_t end) {
  const auto index = static_cast<std::size_t>(level);
  if (walks_.size() <= index) walks_.resize(index + 1);
  walks_[index] = Walk();
  walks_[index].end = end;
}

void FindingCollector::onRecord(const Record& record) {
  takeNestedValue();
  // What comes on the next level, if anything does, belongs to this record's stream.
  if (record.row != nullptr &&
      (record.row->read == Read::nested || record.row->read == Read::nestedList ||
       record.row->read == Read::controlPoint)) {
    begin(record.level + 1, record.offset + recordHeaderSize + record.payload.size());
  }
  Walk& here = walk(record.level);
  here.before = here.current;
  here.current = record.tag;
  here.index = records_++;
  if (record.payload.size() < record.size) {
    add(record, {.oddity = Oddity::cutPayload, .count = narrow(record.payload.size())});
  } else {
    checkPadding(record);
  }
  if (record.row != nullptr && record.row->read == Read::controlPoint) checkSize(record);
  if (record.row != nullptr && record.row->read == Read::nested) nested_ = record;
}

void FindingCollector::onValue(const Record& record, const Value& value) {
  checkSize(record);
  checkText(record);
  takeValue(record, &value);
}

void FindingCollector::onSkip(const Record& record, SkipReason reason) {
  if (nested_ && nested_->offset == record.offset) nested_.reset();
  if (isZeros(record)) return takeZeros(record);
  add(record, {.oddity = Oddity::skipped, .reason = reason});
  if (reason != SkipReason::nameWithoutValue) return;
  const bool isReg = record.row->read == Read::regName;
  findings_.back().order = recordOrder(walk(record.level).nameIndex[isReg]);
}

void FindingCollector::onStop(std::size_t offset, std::size_t end, int level, SkipReason reason,
                              const Record* record) {
  if (reason == SkipReason::cutHeader && offset == end) return;  // a marker promised more; no loss
  Finding finding{.oddity = Oddity::stopped,
                  .reason = reason,
                  .level = static_cast<std::uint8_t>(level),
                  .order = 2 * records_,
                  .offset = narrow(offset),
                  .count = narrow(end - offset)};
  if (record != nullptr) {
    finding.tag = record->tag;
    finding.size = record->size;
  }
  if (reason == SkipReason::incompleteRecord) {
    // Announced as a record, and found to be cut; that it could not be read says both.
    if (nested_ && nested_->offset == record->offset) nested_.reset();
    findings_.pop_back();
    finding.order = recordOrder(walk(level).index);
  }
  findings_.push_back(finding);
}

// Adds a finding about a record that has just come.
void FindingCollector::add(const Record& record, Finding finding) {
  finding.level = static_cast<std::uint8_t>(record.level);
  finding.order = recordOrder(walk(record.level).index);
  finding.offset = narrow(record.offset);
  finding.tag = record.tag;
  finding.size = record.size;
  findings_.push_back(finding);
}

// A number is read from its own bytes, also from behind a payload that is too short for it; of a
// longer one the rest is read by nobody.
void FindingCollector::checkSize(const Record& record) {
  if (record.payload.size() < record.size) return;  // said already
  const std::uint32_t taken = bytesTaken(record);
  if (taken != record.size) add(record, {.oddity = Oddity::oddSize, .count = taken});
}

void FindingCollector::checkPadding(const Record& record) {
  if (record.length < recordHeaderSize + record.size) return;  // the length has wrapped
  const std::size_t start = record.offset + recordHeaderSize + record.size;
  const std::size_t end = record.offset + record.length;
  const std::size_t there = std::min(end, walk(record.level).end);
  const auto padding = bytes_.subspan(start, there - start);
  if (std::any_of(padding.begin(), padding.end(), [](std::uint8_t byte) { return byte != 0; }))
    add(record, {.oddity = Oddity::paddingNotZero});
  if (there < end) add(record, {.oddity = Oddity::paddingMissing, .count = narrow(end - there)});
}

void FindingCollector::checkText(const Record& record) {
  if (!isText(record)) return;
  auto text = record.payload;
  if (record.row->read == Read::text) {
    const auto nul = std::find(text.begin(), text.end(), std::uint8_t{0});
    if (nul == text.end() && !text.empty() && !mayEndWithoutNul(*record.row) &&
        !isPaddedWithNul(record))
      add(record, {.oddity = Oddity::withoutNul});
    text = text.first(static_cast<std::size_t>(nul - text.begin()));
  }
  if (!isUtf8({reinterpret_cast<const char*>(text.data()), text.size()}))
    add(record, {.oddity = Oddity::notUtf8});
}

// Readers that go on to the next NUL find it in the padding.
bool FindingCollector::isPaddedWithNul(const Record& record) const {
  const std::size_t behind = record.offset + recordHeaderSize + record.size;
  return record.size % 4 != 0 && behind < bytes_.size() && bytes_[behind] == 0;
}

// Null: a nested stream, whose value nobody announces.
void FindingCollector::takeValue(const Record& record, const Value* value) {
  Walk& here = walk(record.level);
  const Read rule = record.row->read;
  const bool isReg = rule == Read::regName || rule == Read::regValue;
  if (rule == Read::tagName || rule == Read::regName) {
    here.names[isReg] = value->text();
    here.nameIndex[isReg] = here.index;
  } else if (rule == Read::tagValue || rule == Read::regValue) {
    replace(here.entries, std::pair(isReg, here.names[isReg]), record);
  } else if (isSingleValued(*record.row)) {
    replace(here.values, record.tag, record);
  }
}

// A nested stream is a value unless the very next thing we hear is that it is not.
void FindingCollector::takeNestedValue() {
  if (!nested_) return;
  const Record record = *nested_;
  nested_.reset();
  takeValue(record, nullptr);
}

template <class Map, class Key>
void FindingCollector::replace(Map& seen, const Key& key, const Record& record) {
  const Seen now{walk(record.level).index, narrow(record.offset)};
  const auto [place, isNew] = seen.try_emplace(key, now);
  if (isNew) return;
  const Seen old = std::exchange(place->second, now);
  add(record, {.oddity = Oddity::replaced, .other = now.offset});
  findings_.back().order = recordOrder(old.index);
  findings_.back().offset = old.offset;
}

// Zeros to the end of a file are one finding, not one for every eight of them.
void FindingCollector::takeZeros(const Record& record) {
  const Walk& here = walk(record.level);
  if (!findings_.empty()) {
    Finding& last = findings_.back();
    const bool isZerosToo = last.oddity == Oddity::zeros || last.oddity == Oddity::terminator;
    if (isZerosToo && last.level == record.level && last.offset + last.count == record.offset) {
      last.oddity = Oddity::zeros;
      last.count += narrow(recordHeaderSize);
      return;
    }
  }
  // The encoder puts them behind control points, which come last; also where there are none.
  const bool isTerminator =
      here.before == "CTLp"_tag || record.offset + recordHeaderSize == here.end;
  add(record, {.oddity = isTerminator ? Oddity::terminator : Oddity::zeros,
               .count = narrow(recordHeaderSize)});
}

}  // namespace oxmv::cli
