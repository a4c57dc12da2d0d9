#include "tests/cli/EditedClip.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <iterator>

namespace oxmv::cli::test {

EditedClip::EditedClip(const std::string& example)
    : original_(readFile(OXMV_SOURCE_DIR "/examples/" + example)) {
  writeFile(path(), original_);
}

std::ptrdiff_t EditedClip::files() const {
  return std::distance(std::filesystem::directory_iterator(folder_.path()), {});
}

std::vector<std::string> recordsOf(const std::string& stream,
                                   const std::vector<std::string>& without) {
  std::vector<std::string> records;
  for (std::size_t at = 0; at + 8 <= stream.size();) {
    const auto byte = [&](std::size_t i) {
      return std::size_t{static_cast<std::uint8_t>(stream[at + i])};
    };
    const std::size_t size = byte(4) | byte(5) << 8 | byte(6) << 16;
    const std::size_t length = (8 + size + 3) / 4 * 4;
    const std::string record = stream.substr(at, length);
    if (std::find(without.begin(), without.end(), record.substr(0, 4)) == without.end())
      records.push_back(record);
    at += length;
  }
  return records;
}

}  // namespace oxmv::cli::test
