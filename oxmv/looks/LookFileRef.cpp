#include "oxmv/looks/LookFileRef.h"

#include <algorithm>

#include "oxmv/host/Host.h"
#include "oxmv/looks/LookNames.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/platform/WholeFile.h"

namespace oxmv {

LookFileRef LookFileRef::initNone() {
  LookFileRef none;
  none._displayName = "None";
  return none;
}

std::optional<LookFileRef> LookFileRef::initFromPath(const std::filesystem::path& path) {
  std::error_code error;
  bool isOpened = false;
  const auto start = readFileStart(path, lookHeaderSize, error, &isOpened);
  if (!isOpened) return std::nullopt;
  LookFileRef look;
  if (!start) return look;

  look._version = lookFileVersion(*start);
  const std::string_view fileName = lastPathComponent(path.native());
  const auto crc = crcFromFileName(withoutExtension(fileName));
  if (!crc) return std::nullopt;
  look._fileCRC = *crc;

  // Files of version 1 have no name in them. Kept on purpose: they show their extension.
  if (look._version <= 1) {
    look._displayName = fileName;
  } else if (const auto name = lookFileName(*start)) {
    look._displayName = withoutExtension(lastPathComponent(*name));
  }
  return look;
}

LookFileRef LookFileRef::initFromRef(const LookFileRef& other) {
  LookFileRef look;
  look._fileCRC = other._fileCRC;
  look._version = other._version;
  // Kept on purpose: a suffix that made the other's name unique becomes a part of this one's.
  look._displayName = other.displayName();
  return look;
}

bool LookFileRef::generateLUTFile(std::int32_t crc, std::span<std::uint8_t> record,
                                  std::int32_t forSize, std::string_view displayName,
                                  std::error_code* error) {
  if (error != nullptr) error->clear();
  if (forSize < 1 || forSize > maxLookSize || record.size() < lookFileSize(forSize)) return false;

  const auto fileCRC = static_cast<std::uint32_t>(crc);
  const std::filesystem::path path = lookTableFolder() + '/' + lookFileNameOf(fileCRC);
  std::error_code failure;
  const auto start = readFileStart(path, lookHeaderSize, failure);
  // Kept on purpose: a look that is there leaves the reference as it is, so importing a description
  // for the second time gives the empty one.
  if (start && isCurrentLookFile(*start)) return false;

  _fileCRC = fileCRC;
  _version = static_cast<std::int32_t>(lookVersion);
  _displayName = cutDisplayName(withoutExtension(displayName));

  OXLOOK_HEADER header;
  header.lutSize = static_cast<std::uint32_t>(forSize);
  header.lutName = lookNameField(*_displayName);
  storeLookHeader(header, record);
  failure.clear();
  if (!writeWholeFile(path, record.first(lookFileSize(forSize)), failure) && error != nullptr) {
    *error = failure;
  }
  return true;
}

std::optional<std::string> LookFileRef::displayName() const {
  if (!_displayName || _displayNameModifier == 0) return _displayName;
  return *_displayName + '_' + std::to_string(_displayNameModifier);
}

std::weak_ordering LookFileRef::lookNameCompare(const LookFileRef& other) const {
  const auto mine = displayName();
  const auto others = other.displayName();
  if (!mine) return std::weak_ordering::equivalent;
  if (!others) return std::weak_ordering::greater;
  return compareLookNames(*mine, *others);
}

bool LookFileRef::isInArray(std::span<const LookFileRef> others) const {
  return std::any_of(others.begin(), others.end(), [this](const LookFileRef& other) {
    return lookNameCompare(other) == std::weak_ordering::equivalent;
  });
}

std::string lookTableFolder() { return host()->localizedString("OXMVLutsPath", "a path"); }

}  // namespace oxmv
