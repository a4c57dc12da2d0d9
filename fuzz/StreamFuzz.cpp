// Any bytes as a tag stream: decoded, encoded, decoded again. What must hold for all of them:
//
// - a listening observer, for whom the decoder takes the long way, changes nothing: neither values nor
//   their order nor the identity; and hears of no more records than there are bytes;
// - a dictionary encodes the same whether it is a view of its stream or was built entry by entry;
// - the readable layout is walked to its end: no record in it is cut, too large or left over.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <span>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamDecoder.h"

namespace {

using namespace oxmv;

class Counter final : public StreamObserver {
 public:
  std::size_t records = 0;
  std::size_t stops = 0;

  void onRecord(const Record&) override { ++records; }
  void onStop(std::size_t, std::size_t, int, SkipReason, const Record*) override { ++stops; }
};

void require(bool holds) {
  if (!holds) std::abort();
}

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
  decode(*readable, &again);
  require(again.stops == 0);
  return 0;
}
