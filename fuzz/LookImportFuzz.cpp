// Any bytes as a look description that is imported, and imported again. What must hold for all of
// them:
//
// - each new table is in a look-table file of its size that is named for the CRC of its values, and
//   reads back as that look; nothing else is written but one copy of the description, and not more
//   than the limits allow;
// - the second time nothing is new, and no file changes, unless a limit had left something over;
// - the import answers nothing exactly when the user was told why.

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "fuzz/Require.h"
#include "oxmv/looks/Crc32.h"
#include "oxmv/looks/LookImport.h"
#include "oxmv/looks/LookTableFile.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Files.h"
#include "tests/support/TempDir.h"

namespace {

using namespace oxmv;
using fuzz::require;

namespace fs = std::filesystem;

constexpr std::uint64_t mostBytes = 1 << 18;
constexpr std::size_t mostFiles = 4;

// A description, and the folder of the looks, which is made anew for each.
struct Place {
  test::TempDir folder;
  test::InstalledFakeHost host;
  const fs::path description = folder / "look.xml";
  const fs::path looks = folder / "looks";

  Place() { host->strings["OXMVLutsPath"] = looks.string(); }

  void empty() const {
    host->alerts.clear();
    host->questions.clear();
    fs::remove_all(looks);
    fs::create_directory(looks);
  }
};

struct Table {
  std::int32_t size;
  std::size_t stored;
  std::uint32_t crc;
  bool isNew;
};

class Witness final : public LookImportObserver {
 public:
  std::vector<Table> tables;
  std::optional<LookImportStop> reason;

  void onTable(const LookTableReport& report) override {
    require(!report.writeError && !report.copyError && !reason);
    tables.push_back({report.size, report.values.stored, report.crc, report.isNew});
  }
  void onStop(const LookImportEnd& end) override {
    require(!reason);
    reason = end.reason;
  }
};

using Files = std::map<std::string, test::Bytes>;

Files filesIn(const fs::path& folder) {
  Files files;
  for (const auto& entry : fs::directory_iterator(folder))
    files[entry.path().filename().string()] = test::getFile(entry.path());
  return files;
}

void checkFile(const Table& table, const fs::path& looks, const test::Bytes& file) {
  require(file.size() == lookFileSize(table.size) && isCurrentLookFile(file));
  require(calccrc(file.data() + lookHeaderSize, static_cast<std::ptrdiff_t>(table.stored * 4)) ==
          table.crc);
  const auto look = LookFileRef::initFromPath(looks / lookFileNameOf(table.crc));
  require(look && look->CRC() == table.crc && look->displayName() == "look");
}

Witness imported(const Place& place, std::optional<LookFileRef>& look) {
  const std::size_t alerts = place.host->alerts.size();
  Witness witness;
  look = importLook(place.description, &witness, mostBytes, mostFiles);
  const bool isTold =
      witness.reason == LookImportStop::noSize || witness.reason == LookImportStop::tooLarge;
  require(look.has_value() != isTold);
  require(place.host->alerts.size() == alerts + (isTold ? 1 : 0));
  return witness;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const Place place;
  place.empty();
  test::putFile(place.description, {data, data + size});

  std::optional<LookFileRef> look;
  const Witness first = imported(place, look);
  const Files files = filesIn(place.looks);
  std::size_t fresh = 0;
  std::uint64_t written = 0;
  for (const Table& table : first.tables) {
    const auto file = files.find(lookFileNameOf(table.crc));
    require(file != files.end());
    if (!table.isNew) continue;
    checkFile(table, place.looks, file->second);
    ++fresh;
    written += file->second.size();
    if (look) require(look->version() == 2);
  }
  require(fresh <= mostFiles && written <= mostBytes);
  require(files.size() == fresh + (fresh > 0 ? 1 : 0));
  if (fresh > 0) require(files.at("look.xml") == test::Bytes(data, data + size));

  const Witness second = imported(place, look);
  if (first.reason == LookImportStop::tooMuch) return 0;  // it goes on where that one ended
  for (const Table& table : second.tables) require(!table.isNew);
  require(!look || (look->CRC() == 0 && look->version() == 0));
  require(filesIn(place.looks) == files);
  return 0;
}
