// JSON text with simdjson's DOM: a tape and a buffer of texts, owned by each document; the parser
// is made once and reused. The tape cannot be changed, so this is no peer of an editable
// dictionary: it is shown for what reading alone can reach.

#include <simdjson.h>

#include "Codec.h"
#include "CodecOurs.h"
#include "JsonText.h"

namespace bench {
namespace {

void readElement(const simdjson::dom::element& element, Checksum& checksum) {
  switch (element.type()) {
    case simdjson::dom::element_type::INT64:
    case simdjson::dom::element_type::UINT64: return checksum.integer(std::int64_t(element));
    case simdjson::dom::element_type::DOUBLE: return checksum.number(double(element));
    case simdjson::dom::element_type::STRING: return checksum.text(std::string_view(element));
    case simdjson::dom::element_type::ARRAY:
      for (const auto& inner : simdjson::dom::array(element)) readElement(inner, checksum);
      return;
    case simdjson::dom::element_type::OBJECT:
      for (const auto& [key, value] : simdjson::dom::object(element)) {
        checksum.key(key);
        readElement(value, checksum);
      }
      return;
    default: return;  // in no clip
  }
}

struct Simdjson {
  static constexpr std::string_view name = "simdjson DOM";
  static constexpr bool comparable = false;
  using Stream = simdjson::padded_string;
  using Document = simdjson::dom::document;

  static Stream streamOf(const oxmv::Dictionary& content) {
    return simdjson::padded_string(jsonTextOf(content));
  }

  static Document decode(const Stream& stream) {
    static simdjson::dom::parser parser;
    Document document;
    if (parser.parse_into_document(document, stream).error())
      throw std::logic_error("simdjson does not read what it should");
    return document;
  }

  static void read(const Document& document, Checksum& checksum) {
    readElement(document.root(), checksum);
  }

  static std::size_t lookUp(const Document& document) {
    const simdjson::dom::element root = document.root();
    std::size_t found = 0;
    for (const std::string_view tag : lookedUp)
      found += root.at_key(tag).error() == simdjson::SUCCESS ? 1u : 0u;
    return found;
  }
};

}  // namespace

void addSimdjson() { addCodec<Simdjson, CodecOurs>(); }

}  // namespace bench
