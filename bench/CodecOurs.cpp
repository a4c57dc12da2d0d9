#include "CodecOurs.h"

#include "Codec.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Array.h"

namespace bench {
namespace {

using namespace oxmv;

// Of a dictionary or of the entries of a value.
template <class Content>
void readContent(const Content& content, Checksum& checksum);

void readElements(const Value& array, Checksum& checksum);

void readValue(const Value& value, Checksum& checksum) {
  switch (value.kind()) {
    case Value::Kind::integer: return checksum.integer(value.int64Value());
    case Value::Kind::float32: return checksum.number(value.floatValue());
    case Value::Kind::float64: return checksum.number(value.doubleValue());
    case Value::Kind::text: return checksum.text(value.text());
    case Value::Kind::array: return readElements(value, checksum);
    case Value::Kind::dictionary: return readContent(value.entries(), checksum);
    case Value::Kind::nothing:
    case Value::Kind::data: return;  // in no clip of the corpora
  }
}

void readElements(const Value& array, Checksum& checksum) {
  for (const Value& element : array.elements()) readValue(element, checksum);
}

template <class Content>
void readContent(const Content& content, Checksum& checksum) {
  for (const auto& [key, value] : content) {
    checksum.key(key);
    readValue(value, checksum);
  }
}

}  // namespace

Bytes CodecOurs::streamOf(const Dictionary& content) { return encodeStream(content).value(); }

Dictionary CodecOurs::decode(const Bytes& stream) {
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

void CodecOurs::read(const Dictionary& document, Checksum& checksum) {
  readContent(document, checksum);
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
