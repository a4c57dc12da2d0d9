// Folders with many files: what is in them, and the files read one after the other.

#pragma once

#include <cstdint>
#include <filesystem>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "oxmv/platform/Descriptor.h"

namespace oxmv {

// What a folder says of an entry. A symbolic link is `unknown` until it is followed, and so is
// everything where the file system tells no kinds.
enum class EntryKind : std::uint8_t { regular, folder, other, unknown };

// An open folder. Different threads may read its files at the same time, each into a buffer of its
// own.
class Folder {
 public:
  // Nothing, with the cause in `error`, when there is none or it cannot be read.
  static std::optional<Folder> open(const std::filesystem::path& path, std::error_code& error);

  // Calls `each` with every entry but "." and "..", in no particular order; the name holds during
  // the call. Answers false, with the cause in `error`, when the folder cannot be read to its end.
  bool forEachEntry(const std::function<void(std::string_view name, EntryKind kind)>& each,
                    std::error_code& error) const;

  // The content of a file of this folder; what readWholeFile() refuses is refused here. `kind` is
  // what the folder has said: of a regular file the system is not asked again, which saves a good
  // part of the time that a small file takes. The bytes are in `buffer`, which only grows; they
  // hold until it is used again.
  std::optional<std::span<const std::uint8_t>> read(const std::string& name, EntryKind kind,
                                                    std::vector<std::uint8_t>& buffer,
                                                    std::error_code& error) const;

 private:
  explicit Folder(Descriptor folder) : folder_(std::move(folder)) {}

  Descriptor folder_;
};

}  // namespace oxmv
