// CBOR and MessagePack with nlohmann-json: a tree in which every text, array and map is an
// allocation of its own; maps are std::map.

#include <nlohmann/json.hpp>

#include "Codec.h"
#include "CodecOurs.h"
#include "oxmv/values/Array.h"

namespace bench {
namespace {

using nlohmann::json;
using oxmv::Dictionary;
using oxmv::Value;

json jsonOf(const Dictionary& content);

json jsonOf(const Value& value) {
  switch (value.kind()) {
    case Value::Kind::float32: return value.floatValue();
    case Value::Kind::text: return value.text();
    case Value::Kind::dictionary: return jsonOf(value.dictionary());
    case Value::Kind::array: {
      json array = json::array();
      for (const Value& element : value.elements()) array.push_back(jsonOf(element));
      return array;
    }
    default: return value.int64Value();
  }
}

json jsonOf(const Dictionary& content) {
  json object = json::object();
  for (const auto& [key, value] : content) object[std::string(key)] = jsonOf(value);
  return object;
}

void readJson(const json& value, Checksum& checksum) {
  switch (value.type()) {
    case json::value_t::number_integer:
    case json::value_t::number_unsigned: return checksum.integer(value.get<std::int64_t>());
    case json::value_t::number_float: return checksum.number(value.get<double>());
    case json::value_t::string: return checksum.text(value.get_ref<const std::string&>());
    case json::value_t::array:
      for (const json& element : value) readJson(element, checksum);
      return;
    case json::value_t::object:
      for (auto entry = value.begin(); entry != value.end(); ++entry) {
        checksum.key(entry.key());
        readJson(entry.value(), checksum);
      }
      return;
    default: return;  // in no clip
  }
}

// The tree, whatever it is read from.
struct Tree {
  static constexpr bool comparable = true;
  using Stream = Bytes;
  using Document = json;

  static void read(const Document& document, Checksum& checksum) { readJson(document, checksum); }

  static std::size_t lookUp(const Document& document) {
    std::size_t found = 0;
    for (const std::string_view tag : lookedUp)
      found += document.find(tag) != document.end() ? 1u : 0u;
    return found;
  }

  static void replaceBalance(Document& document) { document["WBAL"] = newBalance; }
};

struct Cbor : Tree {
  static constexpr std::string_view name = "nlohmann CBOR";
  static Stream streamOf(const Dictionary& content) { return json::to_cbor(jsonOf(content)); }
  static Document decode(const Stream& stream) { return json::from_cbor(stream); }
  static Bytes encode(const Document& document) { return json::to_cbor(document); }
};

struct MessagePack : Tree {
  static constexpr std::string_view name = "nlohmann MessagePack";
  static Stream streamOf(const Dictionary& content) { return json::to_msgpack(jsonOf(content)); }
  static Document decode(const Stream& stream) { return json::from_msgpack(stream); }
  static Bytes encode(const Document& document) { return json::to_msgpack(document); }
};

}  // namespace

void addNlohmann() {
  addCodec<Cbor, CodecOurs>();
  addCodec<MessagePack, CodecOurs>();
}

}  // namespace bench
