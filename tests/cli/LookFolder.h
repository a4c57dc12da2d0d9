// Look descriptions and a look-table folder for a test.

#pragma once

#include <string>
#include <vector>

#include "tests/cli/CommandRunner.h"
#include "tests/support/TempDir.h"

namespace oxmv::cli::test {

const std::string lookData = OXMV_TEST_DATA "/looks/";

// Descriptions in a folder of their own, and a look-table folder in it, empty at first.
class LookFolder {
 public:
  LookFolder() { std::filesystem::create_directory(looks()); }

  std::filesystem::path looks() const { return folder_ / "looks"; }
  std::string operator/(const std::string& name) const { return (folder_ / name).string(); }

  // A file in the look-table folder.
  std::string look(const std::string& name) const { return (looks() / name).string(); }

  // Writes a description, and answers its path.
  std::string description(const std::string& name, std::string_view content) const {
    writeFile(folder_ / name, content);
    return *this / name;
  }

  // "look ..." with this look-table folder.
  Outcome run(std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), "look");
    arguments.insert(arguments.end(), {"--looks", looks().string()});
    return test::run(arguments);
  }

 private:
  oxmv::test::TempDir folder_;
};

// "<look><LUT>", what is in it, "</LUT></look>"
inline std::string lut(const std::string& content) {
  return "<look><LUT>" + content + "</LUT></look>";
}

}  // namespace oxmv::cli::test
