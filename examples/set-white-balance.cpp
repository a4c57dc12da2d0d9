// Opens a clip of the database by its GUID, changes its white balance and saves it.
#include <iostream>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/values/Array.h"

int main() {
  const oxmv::myGUID guid = {0x00112233, 0x4455, 0x6677, {0x88, 0x99, 0xAA, 0xBB, 0xCC}};
  auto clip = oxmv::MetadataDictionary::initFromGUID(guid);
  if (clip.loadError() != oxmv::LoadError::none) {  // saving would lose what could not be read
    std::cerr << clip.fileURL().string() << ": not loaded\n";
    return 1;
  }
  if (!clip.addObject(oxmv::Array::of(1.0f, 1.25f, 1.0f, 1.5f), "WBAL")) return 1;
  std::error_code error;
  if (!clip.writeToGUIDFile(&error)) {
    std::cerr << clip.fileURL().string() << ": not saved: " << error.message() << '\n';
    return 1;
  }
}
