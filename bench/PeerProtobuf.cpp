// Protocol buffers: a map from text to a choice of values, with lists of one kind where a clip has
// lists. Each document has an arena of its own, so that dropping it is one step.

#include <memory>

#include "Clip.pb.h"
#include "Codec.h"
#include "CodecOurs.h"
#include "oxmv/values/Array.h"

namespace bench {
namespace {

using oxmv::Dictionary;
using oxmv::Value;

void fill(proto::Clip& clip, const Dictionary& content);

void fill(proto::Value& made, const Value& value) {
  switch (value.kind()) {
    case Value::Kind::float32: made.set_number(value.floatValue()); return;
    case Value::Kind::text: made.set_text(std::string(value.text())); return;
    case Value::Kind::dictionary: return fill(*made.mutable_clip(), value.dictionary());
    case Value::Kind::array:
      for (const Value& element : value.elements()) {
        switch (element.kind()) {
          case Value::Kind::float32:
            made.mutable_floats()->add_element(element.floatValue());
            break;
          case Value::Kind::text:
            made.mutable_texts()->add_element(std::string(element.text()));
            break;
          case Value::Kind::dictionary:
            fill(*made.mutable_clips()->add_element(), element.dictionary());
            break;
          default: made.mutable_integers()->add_element(element.intValue()); break;
        }
      }
      return;
    default: made.set_integer(value.intValue()); return;
  }
}

void fill(proto::Clip& clip, const Dictionary& content) {
  for (const auto& [key, value] : content) fill((*clip.mutable_tags())[std::string(key)], value);
}

void readClip(const proto::Clip& clip, Checksum& checksum) {
  for (const auto& [key, value] : clip.tags()) {
    checksum.key(key);
    switch (value.value_case()) {
      case proto::Value::kInteger: checksum.integer(value.integer()); break;
      case proto::Value::kNumber: checksum.number(value.number()); break;
      case proto::Value::kText: checksum.text(value.text()); break;
      case proto::Value::kFloats:
        for (const float number : value.floats().element()) checksum.number(number);
        break;
      case proto::Value::kIntegers:
        for (const std::int32_t number : value.integers().element()) checksum.integer(number);
        break;
      case proto::Value::kTexts:
        for (const std::string& text : value.texts().element()) checksum.text(text);
        break;
      case proto::Value::kClip: readClip(value.clip(), checksum); break;
      case proto::Value::kClips:
        for (const proto::Clip& inner : value.clips().element()) readClip(inner, checksum);
        break;
      case proto::Value::VALUE_NOT_SET: break;  // in no clip
    }
  }
}

struct Protobuf {
  static constexpr std::string_view name = "protobuf";
  static constexpr bool comparable = true;
  using Stream = std::string;

  struct Document {
    std::unique_ptr<google::protobuf::Arena> arena = std::make_unique<google::protobuf::Arena>();
    proto::Clip* clip = google::protobuf::Arena::CreateMessage<proto::Clip>(arena.get());
  };

  static Stream streamOf(const Dictionary& content) {
    proto::Clip clip;
    fill(clip, content);
    return clip.SerializeAsString();
  }

  static Document decode(const Stream& stream) {
    Document document;
    if (!document.clip->ParseFromString(stream))
      throw std::logic_error("protobuf does not read what it should");
    return document;
  }

  static void read(const Document& document, Checksum& checksum) {
    readClip(*document.clip, checksum);
  }

  static std::size_t lookUp(const Document& document) {
    std::size_t found = 0;
    for (const std::string_view tag : lookedUp)
      found += document.clip->tags().contains(tag) ? 1u : 0u;
    return found;
  }

  static std::string encode(const Document& document) { return document.clip->SerializeAsString(); }

  static void replaceBalance(Document& document) {
    auto& balance = *(*document.clip->mutable_tags())["WBAL"].mutable_floats();
    balance.clear_element();
    for (const float number : newBalance) balance.add_element(number);
  }
};

}  // namespace

void addProtobuf() { addCodec<Protobuf, CodecOurs>(); }

}  // namespace bench
