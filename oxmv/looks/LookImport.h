// The import of look descriptions, and what it tells a witness.

#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <optional>
#include <string_view>
#include <system_error>

#include "oxmv/looks/HexTable.h"
#include "oxmv/looks/LookDescription.h"
#include "oxmv/looks/LookFileRef.h"

namespace oxmv {

// The most that one import writes to look-table files: as much as 341 tables of the largest size.
// A description of the largest size a file may have could ask for a thousand times as much.
constexpr std::uint64_t maxImportedBytes = std::uint64_t{1} << 30;

// The most look-table files that one import writes. Nobody has so many looks in one description,
// and each file costs more than its bytes: it waits for the disk, and takes an entry of the folder.
constexpr std::size_t maxImportedFiles = 4096;

// One table of a description. How its text was read and what was surprising is in `values`: groups
// met, stored, malformed, characters before the first digit.
struct LookTableReport {
  // What became of the copy of the description.
  enum class Copy {
    notTried,      // the look was there already, and so it is not asked for
    alreadyThere,  // a file of that name is in the folder
    copied,
    failed,
  };

  LookNode node;          // valid during the call
  std::int32_t size = 0;  // N
  HexTable values;
  std::uint32_t crc = 0;       // of the values stored
  bool isNew = false;          // no current file of that CRC was there
  std::error_code writeError;  // why the new file could not be written; none if it was. Tried once:
                               // tables with the same CRC have the same answer
  Copy copy = Copy::notTried;
  std::error_code copyError;  // why the copy failed

  // Values that the size asks for and the description does not have: they are 0.
  std::size_t missing() const;
  // Values that the description has beyond those: they are dropped.
  std::size_t surplus() const { return values.groups - values.stored; }
};

// Why an import ended before the end of its description.
enum class LookImportStop : std::uint8_t {
  unreadable,     // the file cannot be read
  notWellFormed,  // it is no XML, or passes a limit
  noSize,         // a table before any size, or after one below 1; the user was told
  tooLarge,       // a size above 64; the user was told
  tooMuch,        // the next table might have passed maxImportedBytes or maxImportedFiles
};

// What stopped an import. Which of the fields says where and why depends on the reason.
struct LookImportEnd {
  LookImportStop reason;
  std::error_code error;   // unreadable
  std::size_t offset = 0;  // the rest: where in the file, in bytes; see XmlPositions
  std::string_view what;   // notWellFormed: in a few words; valid during the call
  std::int32_t size = 0;   // noSize, tooLarge, tooMuch: the size in force
};

// Derive from this and give it to the import. Every call is optional. What it does never changes
// the result; an exception it throws ends the import and reaches the caller.
class LookImportObserver {
 public:
  virtual ~LookImportObserver() = default;

  // A table was imported, or found to be there.
  virtual void onTable(const LookTableReport&) {}
  // The import ended early. Comes last, if at all.
  virtual void onStop(const LookImportEnd&) {}

 protected:
  LookImportObserver() = default;
  LookImportObserver(const LookImportObserver&) = default;
  LookImportObserver& operator=(const LookImportObserver&) = default;
};

// LookFileRef::initFromLookFile(), with limits of one's own. A file that could not be written
// counts.
std::optional<LookFileRef> importLook(const std::filesystem::path& path,
                                      LookImportObserver* observer = nullptr,
                                      std::uint64_t mostBytes = maxImportedBytes,
                                      std::size_t mostFiles = maxImportedFiles);

}  // namespace oxmv
