// What is odd about a stream: everything in it that does not reach the dictionary, and everything
// that a good writer would have written otherwise.

#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cli/JsonWriter.h"
#include "oxmv/metadata/StreamObserver.h"

namespace oxmv::cli {

enum class Oddity : std::uint8_t {
  skipped,         // the record left no trace; `reason` says why
  stopped,         // the walk ended before its bytes did; `reason` says why
  cutPayload,      // some of the payload is not there
  zeros,           // `count` bytes of zeros, where records would stand
  terminator,      // the eight bytes of zeros behind control points: as it should be
  replaced,        // a later record, at `other`, gives the tag another value
  oddSize,         // read as if it had `count` bytes of payload, which is not its size
  notUtf8,         // text that is read as ISO-8859-1
  withoutNul,      // text that ends with its payload, where a writer puts a NUL
  paddingMissing,  // `count` bytes of padding that are not there
  paddingNotZero,  // something stands in the padding
  tooShort,        // `count` bytes are too few for a clip
};

// Kept small: hostile files have them by the million. The words come from describe().
struct Finding {
  Oddity oddity;
  SkipReason reason = {};
  std::uint8_t level = 0;
  std::uint32_t order = 0;   // see recordOrder()
  std::uint32_t offset = 0;  // of the record, or where the walk ended
  std::optional<Tag> tag = {};
  std::uint32_t size = 0;  // of the record, as its header has it
  // Bytes; of a payload those that are there, of a stop those that are left.
  std::uint32_t count = 0;
  std::uint32_t other = 0;  // offset of another record
};

// Where the record that came as number `index` has its findings; those in between, of no record,
// have the order between.
constexpr std::uint32_t recordOrder(std::uint32_t index) { return 2 * index + 1; }

std::string_view codeOf(const Finding& finding) noexcept;
// In words, for a line of text: "WBAL size 12: ignored, needs 16".
std::string describe(const Finding& finding);
// The same, and where: "byte 40: WBAL size 12: ignored, needs 16".
std::string locate(const Finding& finding);
// As an object of JSON: code, offset, tag, message.
void writeFinding(JsonWriter& json, const Finding& finding);
// Whether something of the stream did not reach the dictionary.
bool isLoss(const Finding& finding) noexcept;

// A witness of decoding that gathers findings.
class FindingCollector final : public StreamObserver {
 public:
  // `bytes` are those that are decoded.
  explicit FindingCollector(std::span<const std::uint8_t> bytes);

  // All findings in the order of the stream. To be called once, when decoding is done.
  std::vector<Finding> finish();

  // How deep streams were nested; 0 where none was.
  int deepest() const { return static_cast<int>(walks_.size()) - 1; }

  void onRecord(const Record& record) override;
  void onValue(const Record& record, const Value& value) override;
  void onSkip(const Record& record, SkipReason reason) override;
  void onStop(std::size_t offset, std::size_t end, int level, SkipReason reason,
              const Record* record) override;

 private:
  // A record that came before, to come back to.
  struct Seen {
    std::uint32_t index;
    std::uint32_t offset;
  };
  // A walk over one stream. There is one a level: a stream that begins takes its place.
  struct Walk {
    std::size_t end = 0;                 // of the stream, as an offset
    std::optional<Tag> before, current;  // the last two records
    std::uint32_t index = 0;             // of the current one
    std::string names[2];                // that wait for their values: of "TAG ", of "REG "
    std::uint32_t nameIndex[2] = {};
    std::map<Tag, Seen> values;  // the record that gave each tag its value
    std::map<std::pair<bool, std::string>, Seen> entries;  // and each name of a group; true: "REG "
  };

  Walk& walk(int level) { return walks_[static_cast<std::size_t>(level)]; }
  void begin(int level, std::size_t end);
  void add(const Record& record, Finding finding);
  void checkSize(const Record& record);
  void checkPadding(const Record& record);
  void checkText(const Record& record);
  bool isPaddedWithNul(const Record& record) const;
  void takeValue(const Record& record, const Value* value);
  void takeNestedValue();
  void takeZeros(const Record& record);
  template <class Map, class Key>
  void replace(Map& seen, const Key& key, const Record& record);

  std::span<const std::uint8_t> bytes_;
  std::vector<Walk> walks_;
  std::vector<Finding> findings_;
  std::uint32_t records_ = 0;
  std::optional<Record> nested_;  // a record whose stream may be its value: nobody announces that
};

}  // namespace oxmv::cli
