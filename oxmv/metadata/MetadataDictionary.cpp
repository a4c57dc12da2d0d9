#include "oxmv/metadata/MetadataDictionary.h"

#include <utility>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"

namespace oxmv {
namespace {

bool accepts(const TagRow& row, const Value& value) {
  switch (row.accept) {
    case Accept::any: return !value.isNothing();
    case Accept::number: return value.isNumber();
    case Accept::array:
      // Kept on purpose: a dictionary counts its entries, and may pass.
      return value.array().size() == row.count || value.dictionary().size() == row.count;
    // Kept on purpose: the data tags refuse data, too.
    case Accept::never:
    case Accept::unknown: return false;
  }
  return false;  // Not reached: every case is above.
}

}  // namespace

MetadataDictionary& MetadataDictionary::init() & {
  _simpleTags.reset();
  _isSingle = false;
  _eye = 0;
  _appID = preferencesAppID;
  loadError_ = LoadError::none;
  loadErrorCode_.clear();
  resetTagLabels();
  return *this;
}

MetadataDictionary& MetadataDictionary::initWithBytes(std::span<const std::uint8_t> bytes,
                                                      std::int32_t length,
                                                      StreamObserver* observer) & {
  _simpleTags = processBytes(bytes, length, observer);
  loadError_ = LoadError::none;
  loadErrorCode_.clear();
  return *this;
}

MetadataDictionary& MetadataDictionary::initWithData(std::span<const std::uint8_t> data,
                                                     StreamObserver* observer) & {
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

bool MetadataDictionary::addObject(Value value, std::string_view key) {
  const TagRow* row = findTagRow(key);
  if (row == nullptr || !accepts(*row, value)) return false;
  if (!_simpleTags) _simpleTags.emplace();
  return _simpleTags->set(key, std::move(value));
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
