// Any bytes as the "last" file. What must hold for all of them:
//
// - it is a GUID, as far as there are bytes, and a stream if there are bytes for the whole GUID;
// - the clip loaded from it has the tags of that stream, and its GUID unless the stream has one;
// - nothing is missing without a reason, and only a file that is too short has one.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <system_error>

#include "fuzz/Require.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/store/LastRecord.h"
#include "oxmv/store/Locations.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Files.h"
#include "tests/support/TempDir.h"

namespace {

using namespace oxmv;
using fuzz::require;

// A folder, and a host that names it as the one where the "last" file is.
struct Place {
  test::TempDir folder;
  test::InstalledFakeHost host;
  std::string path = lastFilePathIn(folder.path().string());

  Place() {
    host->preferences[std::string(preferencesAppID)] = {
        {std::string(overrideFolderSetting.preference), folder.path().string()}};
  }
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const Place place;
  place.host->questions.clear();
  const std::span file(data, size);
  test::putFile(place.path, {data, data + size});

  myGUID guid;
  const std::size_t guidSize = std::min(size, sizeof(myGUID));
  copyOverImage(guid, file.first(guidSize));
  const bool isWhole = size >= sizeof(myGUID);
  const auto stream = file.subspan(guidSize);

  std::error_code error;
  const LastRecord last = readLastRecord(place.path, error);
  require(!error && last.guid == guid && last.guidSize == guidSize);
  require(last.stream.has_value() == isWhole);
  if (isWhole) require(std::ranges::equal(*last.stream, stream));
  require(readLastGUID(place.path) == guid && MetadataDictionary::lastGUID() == guid);

  const MetadataDictionary clip = MetadataDictionary::initFromLast();
  require(clip.loadError() == (isWhole ? LoadError::none : LoadError::tooShort));
  const Dictionary tags = decodeStream(stream, static_cast<std::int32_t>(stream.size()), &guid);
  require(clip.metadata() == tags && clip.GUID() == guid && !clip.isSingle());
  return 0;
}
