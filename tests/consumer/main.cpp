// What a project that uses the library starts with: bytes in, a tag out.

#include <cstdint>
#include <iostream>
#include <optional>

#include "oxmv/Version.h"
#include "oxmv/metadata/MetadataDictionary.h"

int main() {
  const std::uint8_t stream[] = {'T', 'I', 'M', 'C', 4, 0, 0, 'c', '1', ':', '0', 0};

  oxmv::MetadataDictionary clip;
  clip.initWithData(stream);

  const auto timecode = clip.metadata()["TIMC"].text();
  std::cout << "oxmv " << oxmv::version << ": TIMC " << timecode << '\n';

  // From the part of the library that leans on others: they are found, too.
  if (oxmv::MetadataDictionary::metadataFromJPEGFile(std::nullopt, "A001")) return 1;
  return timecode == "1:0" ? 0 : 1;
}
