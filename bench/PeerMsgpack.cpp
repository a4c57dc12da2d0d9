// MessagePack with msgpack-cxx: a tree of objects in a zone of each document's own. Its texts are
// copied into the zone, so the stream may go; maps are arrays of pairs that can be changed in
// place.

#include <msgpack.hpp>

#include "Codec.h"
#include "CodecOurs.h"
#include "oxmv/values/Array.h"

namespace bench {
namespace {

using oxmv::Dictionary;
using oxmv::Value;
using Packer = msgpack::packer<msgpack::sbuffer>;

std::uint32_t count(std::size_t size) { return static_cast<std::uint32_t>(size); }

void packText(Packer& packer, std::string_view text) {
  packer.pack_str(count(text.size()));
  packer.pack_str_body(text.data(), count(text.size()));
}

void pack(Packer& packer, const Dictionary& content);

void pack(Packer& packer, const Value& value) {
  switch (value.kind()) {
    case Value::Kind::float32: packer.pack_float(value.floatValue()); return;
    case Value::Kind::text: return packText(packer, value.text());
    case Value::Kind::dictionary: return pack(packer, value.dictionary());
    case Value::Kind::array: {
      const oxmv::Array array = value.array();
      packer.pack_array(count(array.size()));
      for (const Value& element : array) pack(packer, element);
      return;
    }
    default: packer.pack_int64(value.int64Value()); return;
  }
}

void pack(Packer& packer, const Dictionary& content) {
  packer.pack_map(count(content.size()));
  for (const auto& [key, value] : content) {
    packText(packer, key);
    pack(packer, value);
  }
}

std::string_view textOf(const msgpack::object& object) {
  return {object.via.str.ptr, object.via.str.size};
}

void readObject(const msgpack::object& object, Checksum& checksum) {
  switch (object.type) {
    case msgpack::type::POSITIVE_INTEGER:
    case msgpack::type::NEGATIVE_INTEGER: return checksum.integer(object.via.i64);
    case msgpack::type::FLOAT32: return checksum.number(object.via.f64);
    case msgpack::type::STR: return checksum.text(textOf(object));
    case msgpack::type::ARRAY:
      for (const auto& element : object.via.array) readObject(element, checksum);
      return;
    case msgpack::type::MAP:
      for (const auto& entry : object.via.map) {
        checksum.key(textOf(entry.key));
        readObject(entry.val, checksum);
      }
      return;
    default: return;  // in no clip
  }
}

struct Msgpack {
  static constexpr std::string_view name = "msgpack-cxx";
  static constexpr bool comparable = true;
  using Stream = std::vector<char>;
  using Document = msgpack::object_handle;

  static Stream streamOf(const Dictionary& content) {
    msgpack::sbuffer buffer;
    Packer packer(buffer);
    pack(packer, content);
    return {buffer.data(), buffer.data() + buffer.size()};
  }

  static Document decode(const Stream& stream) {
    return msgpack::unpack(stream.data(), stream.size());
  }

  static void read(const Document& document, Checksum& checksum) {
    readObject(document.get(), checksum);
  }

  static msgpack::object_kv* find(const Document& document, std::string_view key) {
    const msgpack::object_map& map = document.get().via.map;
    for (msgpack::object_kv* entry = map.ptr; entry != map.ptr + map.size; ++entry) {
      if (textOf(entry->key) == key) return entry;
    }
    return nullptr;
  }

  static std::size_t lookUp(const Document& document) {
    std::size_t found = 0;
    for (const std::string_view tag : lookedUp) found += find(document, tag) != nullptr ? 1u : 0u;
    return found;
  }

  static msgpack::sbuffer encode(const Document& document) {
    msgpack::sbuffer buffer;
    msgpack::pack(buffer, document.get());
    return buffer;
  }

  static void replaceBalance(Document& document) {
    find(document, "WBAL")->val = msgpack::object(newBalance, *document.zone());
  }
};

}  // namespace

void addMsgpack() { addCodec<Msgpack, CodecOurs>(); }

}  // namespace bench
