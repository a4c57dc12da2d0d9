// The clip database as the command sees it: what its folder holds, in the order in which it is
// shown.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <variant>
#include <vector>

#include "cli/Inputs.h"
#include "cli/Verb.h"
#include "oxmv/platform/Folder.h"
#include "oxmv/store/ClipFileName.h"

namespace oxmv::cli {

// A file with the name of a clip.
struct DatabaseFile {
  ClipFileName name;
  EntryKind kind;
};

// Another entry of the folder.
struct StrangeEntry {
  std::string name;
  EntryKind kind;
};

// What is in the folder is kept by name: some 50 bytes a file. What is in the files is not.
class Database {
 public:
  // Opens the folder and reads what is in it. Answers nothing when that fails, which is said then.
  static std::optional<Database> open(Call& call);

  const std::string& path() const { return path_; }
  // Where a file is.
  std::string pathOf(std::string_view name) const;

  // Ordered by GUID; of one clip the combined file comes first, then the eyes by their index.
  std::span<const DatabaseFile> files() const { return files_; }
  // Ordered by name.
  std::span<const StrangeEntry> strangeEntries() const { return strange_; }

  // The same by clip: the files of each.
  std::vector<std::span<const DatabaseFile>> clips() const;

  // A file's content, in `buffer`: it holds until that is used again. Different threads may read at
  // the same time, each into a buffer of its own.
  std::variant<std::span<const std::uint8_t>, FileProblem> read(
      const DatabaseFile& file, std::vector<std::uint8_t>& buffer) const;

 private:
  Database(std::string path, Folder folder) : path_(std::move(path)), folder_(std::move(folder)) {}

  std::string path_;
  Folder folder_;
  std::vector<DatabaseFile> files_;
  std::vector<StrangeEntry> strange_;
};

// "combined", "left", "right", or the index of the eye.
std::string eyeText(const ClipFileName& name);

}  // namespace oxmv::cli
