// The "last" file: the GUID of the clip last worked on, and that clip's tag stream.
//
//   last := guid  stream
//   guid := the myGUID structure as this build lays it out in memory, little-endian
//
// So the two builds, with a long of 64 or of 32 bits, have files of their own that the other cannot
// read: the stream begins at byte 24 or 16. The library only reads this file.

#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <system_error>
#include <vector>

#include "oxmv/values/myGUID.h"

namespace oxmv {

struct LastRecord {
  myGUID guid;                        // zero in every byte that is not there
  std::vector<std::uint8_t> content;  // of the whole file

  // Points into `content`. None when the file is too short for the GUID.
  std::optional<std::span<const std::uint8_t>> stream() const;
};

// Reads the "last" file. A file that is missing or cannot be read gives a zero GUID and no content,
// with the cause in `error`; one that does not fit into memory keeps its GUID. Only ASCII paths can
// be opened; any other counts as missing.
LastRecord readLastRecord(const std::string& path, std::error_code& error);

// Its GUID alone; zero in every byte that is not there.
myGUID readLastGUID(const std::string& path);

}  // namespace oxmv
