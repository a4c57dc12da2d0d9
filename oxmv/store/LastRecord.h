// The "last" file: the GUID of the clip last worked on, and that clip's tag stream.
//
//   last := guid  stream
//   guid := the myGUID structure as this build lays it out in memory, little-endian
//
// So the two builds, with a long of 64 or of 32 bits, have files of their own that the other cannot
// read: the stream begins at byte 24 or 16. The library only reads this file.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <system_error>
#include <vector>

#include "oxmv/values/myGUID.h"

namespace oxmv {

struct LastRecord {
  myGUID guid;               // zero in every byte that is not there
  std::size_t guidSize = 0;  // how many bytes of it are there
  // None when the file is too short for the GUID, or what follows it could not be read.
  std::optional<std::vector<std::uint8_t>> stream;
};

// Reads the "last" file: the GUID first, which stays whatever becomes of the rest. The cause of a
// failure is in `error`, also that there is no memory. Only ASCII paths can be opened; any other
// counts as missing.
LastRecord readLastRecord(const std::string& path, std::error_code& error);

// Its GUID alone; zero in every byte that is not there.
myGUID readLastGUID(const std::string& path);

}  // namespace oxmv
