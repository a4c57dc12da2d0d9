// What a project that uses the library starts with: bytes in, a tag out; and a call that needs
// every library which ours leans on.

#include <cstdint>
#include <iostream>
#include <optional>

#include "oxmv/Version.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/metadata/MetadataDictionary.h"

int main() {
  const std::uint8_t stream[] = {'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1', ':', '0', 0};

  oxmv::MetadataDictionary clip;
  clip.initWithData(stream);

  const auto timecode = clip.metadata()["TIMC"].text();
  std::cout << "oxmv " << oxmv::version << ": TIMC " << timecode << '\n';

  // From the parts of the library that lean on others: these are found, too.
  if (oxmv::MetadataDictionary::metadataFromJPEGFile(std::nullopt, "A001")) return 1;
  const auto look = oxmv::LookFileRef::initFromLookFile("no such look.xml");
  const auto none = oxmv::LookFileRef::initNone();
  const bool isAnyName = look && look->lookNameCompare(none) == 0;
  return timecode == "1:0" && isAnyName ? 0 : 1;
}
