// Any bytes as the start of a look-table file and, behind the first 64, as the names of two looks.
// What must hold for all of them:
//
// - a version other than 0 needs a magic, and a current file is of version 2 if it is in our order;
// - a name is ASCII, has no zero and fits its field;
// - names are cut to no more than they had, at the end of a character, and compare the same from
//   both sides.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "fuzz/Require.h"
#include "oxmv/looks/LookNames.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Text.h"

namespace {

using namespace oxmv;
using fuzz::require;

void checkHeader(std::span<const std::uint8_t> start) {
  const std::int32_t version = lookFileVersion(start);
  const std::string_view magic(reinterpret_cast<const char*>(start.data()),
                               std::min<std::size_t>(start.size(), 4));
  const bool isOurs = start.size() >= 8 && magic == "OXLK";
  const bool isOther = start.size() >= 8 && magic == "KLXO";
  require(version == 0 || isOurs || isOther);
  if (isOurs) require(version == static_cast<std::int32_t>(loadLe32(&start[4])));
  if (isCurrentLookFile(start)) require(version == 2);

  const auto name = lookFileName(start);
  if (name) require(isAscii(*name) && name->size() <= 40 && name->find('\0') == std::string::npos);
  if (name && !name->empty()) require(name->size() + 24 <= start.size());
}

void checkName(std::string_view name) {
  const std::string_view stem = withoutExtension(lastPathComponent(name));
  require(stem.size() <= name.size());
  crcFromFileName(stem);
  const std::string_view cut = cutDisplayName(name);
  require(name.starts_with(cut) && (isUtf8(cut) || !isUtf8(name)));
  require(utf16Length(cut) <= 39);
  const auto field = lookNameField(name);
  require(field[38] == 0 && field[39] == 0);
  if (field[0] != 0) require(name.starts_with(std::string_view(field.data())));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::vector<std::uint8_t> start(data, data + std::min(size, lookHeaderSize));
  checkHeader(start);
  if (size <= lookHeaderSize) return 0;

  const std::string_view rest(reinterpret_cast<const char*>(data) + lookHeaderSize,
                              size - lookHeaderSize);
  const std::string one(rest.substr(0, rest.size() / 2));
  const std::string other(rest.substr(rest.size() / 2));
  checkName(one);
  checkName(other);
  require((compareLookNames(one, other) < 0) == (compareLookNames(other, one) > 0));
  require(compareLookNames(one, one) == 0);
  for (std::uint32_t crc : {std::uint32_t{0}, static_cast<std::uint32_t>(size * 0x9E3779B9u)}) {
    const std::string name = lookFileNameOf(crc);
    require(crcFromFileName(withoutExtension(name)) == crc);
  }
  return 0;
}
