// What names a clip on the command line.
//
//   clip.colr, ./a/b           a file
//   -                          standard input, or output
//   GUID                       the combined file of a clip of the database (8-4-4-4-12
//                              hexadecimal digits of either case)
//   GUID/left, GUID/right      the file of one eye; GUID/N by its index: 0 left, 1 right
//   @override                  the override file
//   @last                      the "last" file, for reading
//
// A path that looks like one of the last four is written ./NAME.

#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "cli/Verb.h"
#include "oxmv/values/myGUID.h"

namespace oxmv::cli {

struct ClipName {
  enum class Kind : std::uint8_t { file, standardStream, combined, eye, overrideFile, last };

  Kind kind;
  std::string word;     // as the user typed it: messages and results call the clip that
  std::string path;     // of its file; of a standard stream "-"
  myGUID guid = {};     // of a clip of the database
  std::size_t eye = 0;  // of Kind::eye

  bool isInDatabase() const { return kind == Kind::combined || kind == Kind::eye; }
};

// Asks the host in use where things are. Throws UsageError when what stands behind GUID/ is no eye.
ClipName clipNameFrom(const std::string& word);

// The same for a clip that is to be written. Throws UsageError for @last, too.
ClipName writableClipNameFrom(const std::string& word);

// The clips that the call works on; see namedInputs().
std::vector<ClipName> namedClips(Call& call);

// The names of the database's own files.
ClipName combinedClipName(const myGUID& guid);
ClipName eyeClipName(const myGUID& guid, std::size_t eye);

// "left", "right", or the index.
std::string eyeText(std::size_t eye);
// The index of an eye that is named like that. Throws UsageError for any other text; `what` is what
// the user gave an eye to.
std::size_t eyeFrom(std::string_view text, std::string_view what);

// What the folder of such a file is made with, when there is none: a way out for a message that
// says so. Empty for files that are nobody's but the user's.
std::string wayToFolder(const ClipName& name);

}  // namespace oxmv::cli
