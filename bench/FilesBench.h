// What bench/FilesBench.cpp measures, and what else looks at its growth.

#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "Report.h"
#include "SideBySide.h"
#include "oxmv/host/Host.h"

namespace bench {

// Each measures, and answers lines of the table.
std::vector<Line> measureLooks();
std::vector<Line> measureScan();

// A look table of `points` per axis: its values as they stand in memory, and as hexadecimal text
// with `separator` behind every `each` of them.
std::vector<float> lookValues(int points);
std::string lookText(const std::vector<float>& values, std::size_t each,
                     std::string_view separator);

// A look description, with a "LUT" element around each text.
std::string lookDescription(int points, const std::vector<std::string>& texts);

// Has a look-table folder of its own in use, next to a description in it.
class LookFolder {
 public:
  LookFolder();
  LookFolder(const LookFolder&) = delete;
  LookFolder& operator=(const LookFolder&) = delete;
  ~LookFolder();

  std::string description() const { return folder_.path() + "/Look.xml"; }
  std::string looks() const { return folder_.path() + "/looks"; }

  // Puts the description there.
  void put(std::string_view description) const;
  // Takes away what was imported.
  void empty() const;
  // Imports the description; throws when that is not a new look.
  void import() const;

 private:
  OwnFolder folder_{true};
  std::shared_ptr<oxmv::Host> before_;
};

// Writes a database of so many clips of 2 KB into a folder, in an order that is not that of their
// names.
void writeClips(const std::string& folder, std::size_t count);

// The command, with its standard output in /dev/null. Throws when it fails.
void runCommand(std::vector<const char*> arguments);

}  // namespace bench
