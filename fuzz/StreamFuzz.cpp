// Any bytes as a tag stream: decoded, encoded, decoded again. What must hold for all of them:
//
// - a listening observer, for whom the decoder takes the long way, changes nothing: neither values
//   nor their order nor the identity; and hears of no more records than there are bytes;
// - a dictionary encodes the same whether it is a view of its stream or was built entry by entry;
// - the readable layout is walked to its end: no record in it is cut, too large or left over;
// - in it come back what fits its record as it was read: numbers, lists of numbers, data;
// - what comes back from a stream unchanged is encoded in the same bytes from then on;
// - picked out of the stream one by one the values are those of the dictionary.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

#include "fuzz/Require.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagPicker.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagTable.h"

namespace {

using namespace oxmv;
using fuzz::require;

class Counter final : public StreamObserver {
 public:
  std::size_t records = 0;
  std::size_t stops = 0;

  void onRecord(const Record&) override { ++records; }
  void onStop(std::size_t, std::size_t, int, SkipReason, const Record*) override { ++stops; }
};

Dictionary decode(std::span<const std::uint8_t> bytes, StreamObserver* observer,
                  myGUID* guid = nullptr) {
  return decodeStream(bytes, static_cast<std::int32_t>(bytes.size()), guid, observer);
}

bool haveSameOrder(const Dictionary& a, const Dictionary& b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const auto& x, const auto& y) {
    return x.key == y.key && haveSameOrder(x.value.dictionary(), y.value.dictionary());
  });
}

Dictionary rebuilt(const Dictionary& tags) {
  Dictionary copy;
  for (const auto& [key, value] : tags) copy.set(key, value);
  return copy;
}

// Whether whatever was read under the tag comes back.
bool alwaysComesBack(const TagRow& row) {
  switch (row.read) {
    case Read::int32:
    case Read::uint8:
    case Read::uint16:
    case Read::float32:
    case Read::floats:
    case Read::ints:
    case Read::data:
    case Read::guid: return row.write != Write::none;
    case Read::none:
    case Read::text:
    case Read::integers:
    case Read::nested:
    case Read::texts:
    case Read::nestedList:
    case Read::controlPoint:
    case Read::tagName:
    case Read::tagValue:
    case Read::regName:
    case Read::regValue: break;
  }
  return false;
}

void compareBack(const Dictionary& tags, const Dictionary& back) {
  for (const auto& [key, value] : tags) {
    const TagRow* row = findTagRow(key);
    require(row != nullptr);
    if (alwaysComesBack(*row)) require(back[key] == value);
  }
}

// Those of every tag, and of one that has no row.
void comparePicked(std::span<const std::uint8_t> bytes, const Dictionary& tags) {
  static const std::vector<Tag> wanted = [] {
    std::vector<Tag> all = {"????"_tag};
    for (const TagRow& row : tagRows()) all.push_back(row.tag);
    return all;
  }();
  static std::vector<Value> picked;  // keeps its memory, and must not keep more
  pickTags(bytes, wanted, picked);
  require(picked.size() == wanted.size());
  for (std::size_t i = 0; i < wanted.size(); ++i) {
    const auto key = charactersOf(wanted[i]);
    require(picked[i] == tags[std::string_view(key.data(), key.size())]);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::span bytes(data, size);
  Counter counter;
  myGUID guid, guidHeard;
  const Dictionary tags = decode(bytes, nullptr, &guid);
  const Dictionary heard = decode(bytes, &counter, &guidHeard);
  require(heard == tags && haveSameOrder(heard, tags) && guidHeard == guid);
  require(counter.records <= size);

  const Dictionary copy = rebuilt(tags);
  require(copy == tags);
  for (const Layout layout : {Layout::exact, Layout::readable}) {
    require(encodeStream(copy, layout) == encodeStream(tags, layout));
  }

  const auto readable = encodeStream(tags, Layout::readable);
  require(readable && readable->size() % 4 == 0);
  Counter again;
  const Dictionary back = decode(*readable, &again);
  require(again.stops == 0);
  compareBack(tags, back);
  if (back == tags) require(encodeStream(back, Layout::readable) == readable);
  comparePicked(bytes, tags);
  return 0;
}
