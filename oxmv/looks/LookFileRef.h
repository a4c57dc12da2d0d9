// One look: a 3-D colour table that is kept as a look-table file.

#pragma once

#include <compare>
#include <cstdint>
#include <filesystem>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>

namespace oxmv {

class LookImportObserver;

// The reference to a look: the CRC of its values, which names its file, the version of that file,
// and a name to show. A clip names its look by the tags "LOOK" (file name) and "LCRC" (CRC).
//
//   std::vector<LookFileRef> menu = {LookFileRef::initNone()};
//   if (auto look = LookFileRef::initFromPath("looks/43B0C2CA.oxlook")) {
//     for (int n = 1; look->isInArray(menu); ++n) look->makeNameUnique(n);
//     menu.push_back(*look);
//   }
//
// A small value: copies are independent of each other.
class LookFileRef {
 public:
  // The empty reference, `init`: CRC 0, version 0, no name.
  LookFileRef() = default;

  // The reference that stands for no look: CRC 0, version 0, named "None".
  static LookFileRef initNone();

  // The reference to a look-table file. The CRC is the hexadecimal number at the start of the
  // file's name. The name to show is the one in the file, for versions of 2 and above (none if that
  // is not ASCII), and else the name of the file, extension and all. A file of another kind has
  // version 0.
  //
  // Nothing, when the file cannot be opened (also when it is no regular file) or its name does not
  // begin with a hexadecimal number. A file that can be opened but not read gives the empty
  // reference.
  static std::optional<LookFileRef> initFromPath(const std::filesystem::path& path);

  // A copy that takes the other's displayName(), modifier included, as its own base name.
  static LookFileRef initFromRef(const LookFileRef& other);

  // Imports a look description (see LookDescription.h): writes each of its tables to a look-table
  // file in the look-table folder, and a copy of the description beside them, unless a file of that
  // name is there. Answers the reference to the last look that was new, whether its file could be
  // written or not; the empty reference when none was: the file cannot be read, is not well-formed,
  // has no table, or every look is there already, and such a file is never written anew. What one
  // import may write is limited (see LookImport.h).
  //
  // Nothing, after an alert of the host, when a table comes before its size or a size is above 64.
  // What was written before stays.
  //
  // The observer, unless null, hears of all that.
  static std::optional<LookFileRef> initFromLookFile(const std::filesystem::path& path,
                                                     LookImportObserver* observer = nullptr);

  // Writes a look-table file of N points per axis to the look-table folder. `record` holds
  // lookFileSize(N) bytes or more, the table from byte 64 on; its header is filled here. `crc` is
  // that of the values and names the file.
  //
  // Answers false, and changes nothing, when there is a file for that CRC that is current (of
  // version 2, in either byte order), and when N is not 1 to 64 or the record is too short. Else
  // this becomes the reference to that look, named `displayName` without its extension (of 40
  // characters and more the first 39; the file has room for 38), and the answer is true, also when
  // the file could not be written: `error`, unless null, then has the cause.
  bool generateLUTFile(std::int32_t crc, std::span<std::uint8_t> record, std::int32_t forSize,
                       std::string_view displayName, std::error_code* error = nullptr);

  std::int32_t version() const { return _version; }
  std::uint32_t CRC() const { return _fileCRC; }

  // The base name, followed by "_" and the modifier unless that is 0. Nothing without a base name.
  std::optional<std::string> displayName() const;

  // Sets the modifier; 0 takes the suffix away.
  void makeNameUnique(std::int32_t modifier) { _displayNameModifier = modifier; }

  // The order of the two displayName()s without regard to case: less if this one comes first.
  // Without a name this one is equal to every other; with one it comes after an other without.
  std::weak_ordering lookNameCompare(const LookFileRef& other) const;

  // Whether lookNameCompare() finds one of the others equal to this one.
  bool isInArray(std::span<const LookFileRef> others) const;

  // Always 0. For hosts that want to ask everything in a list for its length.
  std::int64_t length() const { return 0; }

 private:
  std::uint32_t _fileCRC = 0;
  std::int32_t _version = 0;
  std::int32_t _displayNameModifier = 0;
  std::optional<std::string> _displayName;
};

// The look-table folder: what the host has under "OXMVLutsPath", else "a path", a folder relative
// to the current one. Asked afresh each time.
std::string lookTableFolder();

}  // namespace oxmv
