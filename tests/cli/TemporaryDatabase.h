// A clip database of one test's own.

#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {

// The GUIDs of clips by the dozen, in order; `number` has at most eight digits.
inline std::string nthGuid(int number) {
  const std::string digits = std::to_string(number);
  return std::string(8 - digits.size(), '0') + digits + "-0000-0000-0000-000000000000";
}

class TemporaryDatabase {
 public:
  TemporaryDatabase() { std::filesystem::create_directory(folder()); }

  std::filesystem::path folder() const { return root_ / "db"; }
  std::string path(const std::string& name) const { return (folder() / name).string(); }

  // Puts a file in the folder.
  template <class Content>
  void put(const std::string& name, const Content& content) const {
    writeFile(folder() / name, content);
  }

  // The command with this database.
  Outcome run(std::vector<std::string> arguments, std::string_view input = {}) const {
    arguments.insert(arguments.end(), {"--db", folder().string()});
    return test::run(arguments, input);
  }

 private:
  oxmv::test::TempDir root_;
};

}  // namespace oxmv::cli::test
