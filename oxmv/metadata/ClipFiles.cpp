// What MetadataDictionary has to do with files.

#include <new>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/store/LastRecord.h"
#include "oxmv/store/Locations.h"

namespace oxmv {
namespace {

bool failed(const std::error_code& cause, std::error_code* error) {
  if (error != nullptr) *error = cause;
  return false;
}

bool writeFile(const std::filesystem::path& path, const std::vector<std::uint8_t>& content,
               std::error_code* error) {
  std::error_code cause;
  return writeWholeFile(path, content, cause) || failed(cause, error);
}

}  // namespace

void MetadataDictionary::setLoadError(std::error_code error) {
  const bool isMissing =
      error == std::errc::no_such_file_or_directory || error == std::errc::not_a_directory;
  loadError_ = isMissing ? LoadError::missing : LoadError::unreadable;
  loadErrorCode_ = error;
}

// Those who load are never told of a failure, so want of memory is one more reason for no tags.
template <class Read>
void MetadataDictionary::load(Read read) try {
  read();
} catch (const std::bad_alloc&) {
  _simpleTags.reset();
  setLoadError(make_error_code(std::errc::not_enough_memory));
}

template <class MakePath>
void MetadataDictionary::loadStream(MakePath makePath, bool mayBeEmpty) {
  load([&] {
    std::error_code error;
    const auto content = readWholeFile(makePath(), error);
    if (!content) return setLoadError(error);
    initWithData(*content);
    if (content->size() < shortestData && !(content->empty() && mayBeEmpty))
      loadError_ = LoadError::tooShort;
  });
}

MetadataDictionary MetadataDictionary::initFromOverride() {
  MetadataDictionary object;
  object.loadStream([&] { return overrideFilePath(object._appID); }, true);
  return object;
}

MetadataDictionary MetadataDictionary::initFromLast() {
  MetadataDictionary object;
  object.load([&] {
    std::error_code error;
    const LastRecord last = readLastRecord(lastFilePath(object._appID), error);
    object._guid = last.guid;
    if (error) {
      object.setLoadError(error);
    } else if (last.stream) {
      // maxFileSize is far below what the length can say.
      object.initWithBytes(*last.stream, static_cast<std::int32_t>(last.stream->size()));
    } else {
      object.loadError_ = LoadError::tooShort;
    }
  });
  return object;
}

myGUID MetadataDictionary::lastGUID() { return readLastGUID(lastFilePath(preferencesAppID)); }

MetadataDictionary MetadataDictionary::initFromGUID(const myGUID& guid) {
  return initFromGUIDForRightEye(guid, false);
}

MetadataDictionary MetadataDictionary::initFromGUIDForRightEye(const myGUID& guid, bool rightEye) {
  if (rightEye) return initFromGUIDForSingleEye(guid, 1);
  MetadataDictionary object;
  object._guid = guid;
  object.loadStream([&] { return object.fileURL(); }, true);
  object._guid = guid;  // a GUID record in the file does not change which clip this is
  return object;
}

MetadataDictionary MetadataDictionary::initFromGUIDForSingleEye(const myGUID& guid,
                                                                std::size_t eye) {
  MetadataDictionary object;
  object._guid = guid;
  object.loadStream([&] { return object.fileURLS(eye); }, false);
  object._isSingle = true;
  object._eye = eye;
  // Kept on purpose: here a GUID record in the file does change which clip this is.
  return object;
}

std::string MetadataDictionary::overridePath() { return overrideFilePath(preferencesAppID); }

std::filesystem::path MetadataDictionary::fileURL() const { return clipFilePath(_guid, _appID); }

std::filesystem::path MetadataDictionary::fileURLS(std::size_t eye) const {
  return eyeFilePath(_guid, eye, _appID);
}

bool MetadataDictionary::writeToGUIDFile(std::error_code* error) const {
  const auto content = metaDataData();
  if (!content) return false;
  if (!_isSingle) return writeFile(fileURL(), *content, error);
  if (!content->empty()) return writeFile(fileURLS(_eye), *content, error);
  std::error_code cause;
  return removeFile(fileURLS(_eye), cause) || failed(cause, error);
}

bool MetadataDictionary::writeToOverride(std::error_code* error) const {
  const std::string path = overrideFilePath(_appID);
  const auto content = metaDataData();
  return content && writeFile(path, *content, error);
}

}  // namespace oxmv
