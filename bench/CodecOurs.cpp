#include "CodecOurs.h"

#include <utility>

#include "Codec.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Array.h"

namespace bench {
namespace {

using namespace oxmv;

void readValue(const Value& value, Checksum& checksum) {
  switch (value.kind()) {
    case Value::Kind::integer: return checksum.integer(value.int64Value());
    case Value::Kind::float32: return checksum.number(value.floatValue());
    case Value::Kind::float64: return checksum.number(value.doubleValue());
    case Value::Kind::text: return checksum.text(value.text());
    case Value::Kind::array: {
      const Array array = value.array();
      for (const Value& element : array) readValue(element, checksum);
      return;
    }
    case Value::Kind::dictionary: return CodecOurs::read(value.dictionary(), checksum);
    case Value::Kind::nothing:
    case Value::Kind::data: return;  // in no clip of the corpora
  }
}

}  // namespace

Bytes CodecOurs::streamOf(const Dictionary& content) { return encodeStream(content).value(); }

Dictionary CodecOurs::decode(const Bytes& stream) {
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

void CodecOurs::read(const Dictionary& document, Checksum& checksum) {
  for (const auto& [key, value] : document) {
    checksum.key(key);
    readValue(value, checksum);
  }
}

std::size_t CodecOurs::lookUp(const Dictionary& document) {
  std::size_t found = 0;
  for (const std::string_view tag : lookedUp) found += document[tag].isNothing() ? 0u : 1u;
  return found;
}

Bytes CodecOurs::encode(const Dictionary& document) { return *encodeStream(document); }

void CodecOurs::replaceBalance(Dictionary& document) {
  document.set("WBAL", Array::of(newBalance[0], newBalance[1], newBalance[2], newBalance[3]));
}

void addOurs() { addCodec<CodecOurs, CodecOurs>(); }

}  // namespace bench
