#include "tests/support/Decoding.h"

#include <algorithm>
#include <array>
#include <memory>
#include <span>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

std::string textOf(Tag tag) {
  const std::array<char, 4> characters = charactersOf(tag);
  return {characters.begin(), characters.end()};
}

// Every key, those within values included, in the order in which one comes to it.
void addKeys(const Value& value, Names& names) {
  for (const Value& element : value.array()) addKeys(element, names);
  for (const auto& [key, inner] : value.dictionary()) {
    names.emplace_back(key);
    addKeys(inner, names);
  }
}

Names allKeys(const Dictionary& dictionary) {
  Names names;
  addKeys(dictionary, names);
  return names;
}

Dictionary decodeAlone(const Bytes& stream, std::optional<std::int32_t> length, myGUID* guid,
                       StreamObserver* observer) {
  // A vector may have room to spare, which would hide a read beyond the end.
  const std::unique_ptr<std::uint8_t[]> copy(new std::uint8_t[stream.size()]);
  std::copy(stream.begin(), stream.end(), copy.get());
  const std::span<const std::uint8_t> bytes(copy.get(), stream.size());
  return decodeStream(bytes, length.value_or(static_cast<std::int32_t>(stream.size())), guid,
                      observer);
}

}  // namespace

Names keys(const Dictionary& dictionary) {
  Names names;
  for (const auto& [key, value] : dictionary) names.emplace_back(key);
  return names;
}

void Witness::onRecord(const Record& record) {
  visits.push_back({record.offset, textOf(record.tag), record.size, record.type, record.level});
}

void Witness::onValue(const Record& record, const Value& value) {
  values.emplace_back(textOf(record.tag), value);
}

void Witness::onSkip(const Record& record, SkipReason reason) {
  skips.push_back({record.offset, textOf(record.tag), reason});
}

void Witness::onMarker(std::size_t offset, std::uint32_t bytes, int level) {
  markers.push_back({offset, bytes, level});
}

void Witness::onStop(std::size_t offset, std::size_t end, int level, SkipReason reason,
                     const Record* record) {
  stops.push_back({offset, end, level, reason, record == nullptr ? "" : textOf(record->tag)});
}

void PrintTo(const Witness::Visit& visit, std::ostream* out) {
  *out << '{' << visit.offset << ", \"" << visit.tag << "\", size " << visit.size << ", type "
       << int{visit.type} << ", level " << visit.level << '}';
}

void PrintTo(const Witness::Skip& skip, std::ostream* out) {
  *out << '{' << skip.offset << ", \"" << skip.tag << "\", " << codeOf(skip.reason) << '}';
}

void PrintTo(const Witness::Marker& marker, std::ostream* out) {
  *out << '{' << marker.offset << ", bytes " << marker.bytes << ", level " << marker.level << '}';
}

void PrintTo(const Witness::Stop& stop, std::ostream* out) {
  *out << '{' << stop.offset << " of " << stop.end << ", level " << stop.level << ", "
       << codeOf(stop.reason) << ", \"" << stop.tag << "\"}";
}

Dictionary decoded(const Bytes& stream, std::optional<std::int32_t> length, myGUID* guid) {
  myGUID guidHeard;
  if (guid != nullptr) guidHeard = *guid;
  Witness witness;
  const Dictionary heard = decodeAlone(stream, length, &guidHeard, &witness);
  const Dictionary tags = decodeAlone(stream, length, guid, nullptr);

  EXPECT_EQ(tags, heard) << "who listens changes the result";
  EXPECT_EQ(allKeys(tags), allKeys(heard)) << "who listens changes the order";
  if (guid != nullptr) {
    EXPECT_EQ(*guid, guidHeard) << "who listens changes the GUID";
  }
  return tags;
}

Witness witnessOf(const Bytes& stream, std::optional<std::int32_t> length) {
  Witness witness;
  decodeAlone(stream, length, nullptr, &witness);
  return witness;
}

}  // namespace oxmv::test
