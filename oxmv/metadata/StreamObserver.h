// A witness of decoding: hears of every record, and of everything that leaves no trace in the
// result.

#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "oxmv/metadata/Tag.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Value.h"

namespace oxmv {

// One record as it stands in the stream. Its payload points into the bytes being decoded.
struct Record {
  std::size_t offset = 0;  // of its first byte, from the start of the outermost stream
  Tag tag{};
  std::uint32_t size = 0;                 // as its header has it
  std::uint8_t type = 0;                  // any byte
  std::uint32_t length = 0;               // from its start to the next record's
  int level = 0;                          // 0: in the outermost stream
  const TagRow* row = nullptr;            // null: unknown tag
  std::span<const std::uint8_t> payload;  // as much of it as is there
};

// Why something in a stream left no trace, or why a walk ended before the stream's bytes did.
enum class SkipReason : std::uint8_t {
  unknownTag,
  wrongSize,          // a list of floats whose size is not theirs
  shortPayload,       // too few bytes left for the number
  emptyNested,        // a nested stream of size 0, where that stores nothing
  valueWithoutName,   // a group's value that no name stands before
  nameWithoutValue,   // a group's name that another name or the end of the stream follows
  tooDeep,            // a nested stream below the last level that is read
  incompleteRecord,   // bytes that must all be there are not; ends the walk
  truncatedRecord,    // the next record would pass the end; ends the walk
  cutHeader,          // fewer than 8 bytes left; ends the walk
  cutMarker,          // fewer than 4 bytes left for a marker; ends the walk
  lengthZero,         // the record's length wraps to 0: it is read once; ends the walk
  overlappingRecord,  // overlapping payloads have used up what they may take; ends the walk
};

// The stable code of a reason, as messages and JSON carry it: "truncated-record"; and the reason in
// a few words.
std::string_view codeOf(SkipReason reason) noexcept;
std::string_view describe(SkipReason reason) noexcept;

// Derive from this and give it to the decoder. Every call is optional. What it does never changes
// the result; an exception it throws ends the decoding and reaches the caller.
class StreamObserver {
 public:
  virtual ~StreamObserver() = default;

  // The walk has come to a record. Records of a nested stream follow the record that holds it.
  virtual void onRecord(const Record&) {}
  // Its value was read. A group's name counts as the value of the record that brings it; a nested
  // stream's value is not announced.
  virtual void onValue(const Record&, const Value&) {}
  // The record, announced before, left no trace. Of a name this is known only later.
  virtual void onSkip(const Record&, SkipReason) {}
  // A marker: the stream goes on for `bytes` more than its given length, and these 4.
  virtual void onMarker(std::size_t /*offset*/, std::uint32_t /*bytes*/, int /*level*/) {}
  // A walk ended at `offset`, though its bytes go on to `end` or its length says so, and why.
  // `record` is the one that it would not read (lengthZero: that it read last); null when there are
  // too few bytes for a header.
  virtual void onStop(std::size_t /*offset*/, std::size_t /*end*/, int /*level*/, SkipReason,
                      const Record* /*record*/) {}

 protected:
  StreamObserver() = default;
  StreamObserver(const StreamObserver&) = default;
  StreamObserver& operator=(const StreamObserver&) = default;
};

}  // namespace oxmv
