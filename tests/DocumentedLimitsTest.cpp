// SECURITY.md says what the limits are; the constants decide.

#include <cstdint>
#include <fstream>
#include <map>
#include <regex>
#include <string>

#include <gtest/gtest.h>

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

// The rows of the table: "| of what | 256 MiB | `constant` | because |".
Limits documented() {
  std::ifstream document(OXMV_SOURCE_DIR "/SECURITY.md");
  EXPECT_TRUE(document);
  const std::regex row(R"(\| [^|]+ \| (\d+)( bytes| KiB| MiB)? \| `(\w+)` \| [^|]+ \|)");
  const std::map<std::string, int> bits = {{"", 0}, {" bytes", 0}, {" KiB", 10}, {" MiB", 20}};
  Limits limits;
  std::smatch parts;
  for (std::string line; std::getline(document, line);) {
    if (!std::regex_match(line, parts, row)) continue;
    limits[parts[3]] = std::stoull(parts[1]) << bits.at(parts[2]);
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
      {"maxXmlDepth", maxXmlDepth},
      {"maxXmlNestedEntities", maxXmlNestedEntities},
      {"maxXmlDeclaredAttributes", maxXmlDeclaredAttributes},
      {"maxPreferencesFileSize", maxPreferencesFileSize},
      {"maxTomlNesting", maxTomlNesting},
      {"maxCameraTablesSize", maxCameraTablesSize},
      {"widestConversion", widestConversion},
  };
  EXPECT_EQ(documented(), constants);
}

}  // namespace
}  // namespace oxmv::test
