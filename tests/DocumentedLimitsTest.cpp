// SECURITY.md says what the limits are; the constants decide.

#include <cstdint>
#include <fstream>
#include <map>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "cli/LookFindings.h"
#include "oxmv/host/PreferencesFile.h"
#include "oxmv/import/CameraTables.h"
#include "oxmv/looks/LookImport.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/platform/TomlOutline.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/platform/Xml.h"
#include "oxmv/store/PathTemplate.h"

namespace oxmv::test {
namespace {

using Limits = std::map<std::string, std::uint64_t>;

// The rows of the table: "| of what | 256 MiB | `constant` | because |". Others have no number.
Limits documented() {
  std::ifstream document(OXMV_SOURCE_DIR "/SECURITY.md");
  EXPECT_TRUE(document);
  const std::map<std::string, int> bits = {{"", 0}, {"bytes", 0}, {"KiB", 10}, {"MiB", 20}};
  Limits limits;
  for (std::string line; std::getline(document, line);) {
    std::istringstream cells(line);
    std::string before, what, limit, constant;
    std::getline(cells, before, '|');
    std::getline(cells, what, '|');
    std::getline(cells, limit, '|');
    std::getline(cells, constant, '|');
    std::uint64_t number = 0;
    std::string unit;
    std::istringstream words(limit);
    if (!(words >> number)) continue;
    words >> unit;
    const std::size_t start = constant.find('`') + 1;
    limits[constant.substr(start, constant.rfind('`') - start)] = number << bits.at(unit);
  }
  return limits;
}

TEST(DocumentedLimits, AreThoseOfTheCode) {
  const Limits constants = {
      {"maxFileSize", maxFileSize},
      {"maxNesting", maxNesting},
      {"maxRecordSize", maxRecordSize},
      {"maxLookSize", maxLookSize},
      {"maxImportedBytes", maxImportedBytes},
      {"maxImportedFiles", maxImportedFiles},
      {"mostLookTables", cli::mostLookTables},
      {"maxXmlDepth", maxXmlDepth},
      {"maxXmlNestedEntities", maxXmlNestedEntities},
      {"maxXmlDeclaredAttributes", maxXmlDeclaredAttributes},
      {"maxXmlMemory", maxXmlMemory(0)},
      {"maxPreferencesFileSize", maxPreferencesFileSize},
      {"maxTomlNesting", maxTomlNesting},
      {"maxCameraTablesSize", maxCameraTablesSize},
      {"widestConversion", widestConversion},
  };
  EXPECT_EQ(documented(), constants);
}

}  // namespace
}  // namespace oxmv::test
