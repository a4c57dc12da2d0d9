// JSON text with RapidJSON: a tree in a pool of each document's own, its texts copied there. Read
// in place it would be faster, but then the document would lean on a text that it has changed.

#include <rapidjson/document.h>
#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

#include "Codec.h"
#include "CodecOurs.h"
#include "JsonText.h"

namespace bench {
namespace {

std::string_view textOf(const rapidjson::Value& value) {
  return {value.GetString(), value.GetStringLength()};
}

void readValue(const rapidjson::Value& value, Checksum& checksum) {
  switch (value.GetType()) {
    case rapidjson::kNumberType:
      return value.IsDouble() ? checksum.number(value.GetDouble())
                              : checksum.integer(value.GetInt64());
    case rapidjson::kStringType: return checksum.text(textOf(value));
    case rapidjson::kArrayType:
      for (const auto& element : value.GetArray()) readValue(element, checksum);
      return;
    case rapidjson::kObjectType:
      for (const auto& member : value.GetObject()) {
        checksum.key(textOf(member.name));
        readValue(member.value, checksum);
      }
      return;
    default: return;  // in no clip
  }
}

struct RapidJson {
  static constexpr std::string_view name = "RapidJSON";
  static constexpr bool comparable = true;
  using Stream = std::string;
  using Document = rapidjson::Document;

  static Stream streamOf(const oxmv::Dictionary& content) { return jsonTextOf(content); }

  static Document decode(const Stream& stream) {
    Document document;
    document.Parse(stream.data(), stream.size());
    return document;
  }

  static void read(const Document& document, Checksum& checksum) { readValue(document, checksum); }

  static rapidjson::Value::StringRefType nameOf(std::string_view tag) {
    return {tag.data(), static_cast<rapidjson::SizeType>(tag.size())};
  }

  static std::size_t lookUp(const Document& document) {
    std::size_t found = 0;
    for (const std::string_view tag : lookedUp)
      found += document.HasMember(rapidjson::Value(nameOf(tag))) ? 1u : 0u;
    return found;
  }

  // A string's face for the buffer that RapidJSON writes to.
  struct Buffer : rapidjson::StringBuffer {
    const char* data() const { return GetString(); }
    std::size_t size() const { return GetSize(); }
  };

  static Buffer encode(const Document& document) {
    Buffer buffer;
    rapidjson::Writer<rapidjson::StringBuffer> writer(buffer);
    document.Accept(writer);
    return buffer;
  }

  static void replaceBalance(Document& document) {
    rapidjson::Value& balance = document["WBAL"];
    balance.SetArray();
    for (const float number : newBalance) balance.PushBack(number, document.GetAllocator());
  }
};

}  // namespace

void addRapidJson() { addCodec<RapidJson, CodecOurs>(); }

}  // namespace bench
