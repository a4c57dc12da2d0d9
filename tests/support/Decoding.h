// Decoding as the tests do it: strictly within the bytes that are there, and watched.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/myGUID.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

using Names = std::vector<std::string>;

// The keys of a dictionary in its own order.
Names keys(const Dictionary& dictionary);

// Remembers what the decoder tells.
class Witness : public StreamObserver {
 public:
  struct Visit {
    std::size_t offset;
    std::string tag;
    std::uint32_t size;
    std::uint8_t type;
    int level;
    bool operator==(const Visit&) const = default;
  };
  struct Skip {
    std::size_t offset;
    std::string tag;
    SkipReason reason;
    bool operator==(const Skip&) const = default;
  };
  struct Marker {
    std::size_t offset;
    std::uint32_t bytes;
    int level;
    bool operator==(const Marker&) const = default;
  };
  struct Stop {
    std::size_t offset;
    std::size_t end;
    int level;
    SkipReason reason;
    std::string tag;  // empty: there was no record to name
    bool operator==(const Stop&) const = default;
  };

  std::vector<Visit> visits;
  std::vector<std::pair<std::string, Value>> values;
  std::vector<Skip> skips;
  std::vector<Marker> markers;
  std::vector<Stop> stops;

  void onRecord(const Record& record) override;
  void onValue(const Record& record, const Value& value) override;
  void onSkip(const Record& record, SkipReason reason) override;
  void onMarker(std::size_t offset, std::uint32_t bytes, int level) override;
  void onStop(std::size_t offset, std::size_t end, int level, SkipReason reason,
              const Record* record) override;
};

void PrintTo(const Witness::Visit& visit, std::ostream* out);
void PrintTo(const Witness::Skip& skip, std::ostream* out);
void PrintTo(const Witness::Marker& marker, std::ostream* out);
void PrintTo(const Witness::Stop& stop, std::ostream* out);

// What a stream decodes to. `length` is the stream's own unless given.
//
// The stream is decoded from a copy of exactly its size, where the address sanitizer sees every
// read beyond it, and the copy is gone before the result is looked at. It is decoded twice, heard
// and unheard; the test fails if that makes a difference.
Dictionary decoded(const Bytes& stream, std::optional<std::int32_t> length = std::nullopt,
                   myGUID* guid = nullptr);

// What a witness of decoding the stream has to tell.
Witness witnessOf(const Bytes& stream, std::optional<std::int32_t> length = std::nullopt);

}  // namespace oxmv::test
