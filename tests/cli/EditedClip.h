// A clip to be edited, and what an edit must leave alone.

#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {

// A copy of an example in a folder of its own.
class EditedClip {
 public:
  explicit EditedClip(const std::string& example = "typical-clip.colr");

  std::string path() const { return (folder_ / "clip.colr").string(); }
  std::filesystem::path folder() const { return folder_.path(); }
  const std::string& original() const { return original_; }
  std::string content() const { return readFile(path()); }
  bool isUntouched() const { return content() == original_ && files() == 1; }
  std::ptrdiff_t files() const;

 private:
  oxmv::test::TempDir folder_;
  std::string original_;
};

// The records of a stream in which every size is what it says, but those of the tags in `without`:
// all their bytes.
std::vector<std::string> recordsOf(const std::string& stream,
                                   const std::vector<std::string>& without);

}  // namespace oxmv::cli::test
