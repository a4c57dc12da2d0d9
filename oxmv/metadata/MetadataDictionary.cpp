#include "oxmv/metadata/MetadataDictionary.h"

#include "oxmv/metadata/TagStreamDecoder.h"

namespace oxmv {

// The shortest record that holds a value: a header and a word.
constexpr std::size_t shortestData = 12;

MetadataDictionary& MetadataDictionary::init() {
  _simpleTags.reset();
  _isSingle = false;
  _eye = 0;
  _appID = preferencesAppID;
  return *this;
}

MetadataDictionary& MetadataDictionary::initWithBytes(std::span<const std::uint8_t> bytes,
                                                      std::int32_t length,
                                                      StreamObserver* observer) {
  _simpleTags = processBytes(bytes, length, observer);
  return *this;
}

MetadataDictionary& MetadataDictionary::initWithData(std::span<const std::uint8_t> data,
                                                     StreamObserver* observer) {
  if (data.size() < shortestData) return *this;
  return initWithBytes(data, static_cast<std::int32_t>(static_cast<std::uint32_t>(data.size())),
                       observer);
}

Dictionary MetadataDictionary::processBytes(std::span<const std::uint8_t> bytes,
                                            std::int32_t length, StreamObserver* observer) {
  myGUID guid = _guid;
  Dictionary tags = decodeStream(bytes, length, &guid, observer);
  _guid = guid;
  return tags;
}

void MetadataDictionary::setMetadata(const std::optional<Dictionary>& tags) {
  _simpleTags = tags.value_or(Dictionary());
}

void MetadataDictionary::removeObject(std::string_view key) {
  if (_simpleTags) _simpleTags->remove(key);
}

std::optional<std::vector<std::uint8_t>> MetadataDictionary::parseMetadata(
    const std::optional<Dictionary>& tags, std::optional<Layout> layout) const {
  return encodeStream(tags.value_or(Dictionary()), layout.value_or(layout_));
}

std::optional<std::vector<std::uint8_t>> MetadataDictionary::metaDataData(
    std::optional<Layout> layout) const {
  return parseMetadata(_simpleTags, layout);
}

std::string MetadataDictionary::metadataString() const {
  std::string digits;
  const auto stream = metaDataData();
  if (!stream) return digits;
  digits.reserve(stream->size() * 2);
  for (const std::uint8_t byte : *stream) {
    digits += "0123456789abcdef"[byte >> 4];
    digits += "0123456789abcdef"[byte & 0xF];
  }
  return digits;
}

}  // namespace oxmv
