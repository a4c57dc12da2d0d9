// Where the library's files are.

#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "oxmv/host/Host.h"
#include "oxmv/values/myGUID.h"

namespace oxmv {

// Where a setting came from.
enum class SettingSource {
  preference,
  localizedString,  // of the host's own
  builtIn,
};

// A text that decides where files are.
struct Setting {
  std::string value;
  SettingSource source;
};

// A setting is looked up as a preference, then as a localised string, then as what is built in, as
// far as it has names for these.
struct SettingRow {
  std::string_view preference;  // key; empty: no preference decides
  std::string_view string;      // key; empty: no localised string decides
  std::string_view builtIn;
};

// The folder that holds the override file and the "last" file.
constexpr SettingRow overrideFolderSetting = {"OverridePath", "",
                                              "/Library/Application Support/Ombrix"};
// The root folder of the looks; the folder of the clip database lies in it.
constexpr SettingRow lutsFolderSetting = {"LUTsPath", "OXMVLutsPath",
                                          "/Library/Application Support/Ombrix/LUTs"};
// The folder of the clip database, within the one above, also when it begins with a slash.
constexpr SettingRow databaseFolderSetting = {"CurrentDBPath", "", "db"};
// Templates (see PathTemplate.h) of the paths of clip files. The arguments, always in this order:
// the two folders above, then Data1, Data2, Data3 and the eight bytes of Data4; for an eye's file
// also the index of the eye plus one.
constexpr SettingRow clipTemplateSetting = {
    "", "OXMVGUIDPathTemplate", "%@/%@/%08X-%04X-%04X-%02X%02X-%02X%02X%02X%02X%02X%02X.colr"};
constexpr SettingRow eyeTemplateSetting = {
    "", "OXMVGUIDPathTemplateR", "%@/%@/%08X-%04X-%04X-%02X%02X-%02X%02X%02X%02X%02X%02X.col%d"};

// A preference that is no text counts as none; an empty one is a text and is used as it is. Changes
// nothing.
Setting lookUp(const SettingRow& row, Host& host, std::string_view appID);

// The paths below are made afresh on each call from the settings of the host in use: a change of a
// preference takes effect on the next call. Nothing is checked or trimmed, nothing on the disk
// looked at or made.

// The override file. A call stores the default of the folder as a preference, and
// synchronises, if there is no such preference or it is no text.
std::string overrideFilePath(std::string_view appID);

// The "last" file. Stores the default of the folder likewise.
std::string lastFilePath(std::string_view appID);

// The same two within a folder that is known already.
std::string overrideFilePathIn(std::string_view folder);
std::string lastFilePathIn(std::string_view folder);

// The folder of the clip database, in which the clips below are unless a template says otherwise.
std::string databaseFolderPath(std::string_view appID);

// A clip's combined file.
std::string clipFilePath(const myGUID& guid, std::string_view appID);

// The file of one eye of a clip: 0 left, 1 right. The index plus one is written by its low 32 bits,
// as a signed number.
std::string eyeFilePath(const myGUID& guid, std::size_t eye, std::string_view appID);

}  // namespace oxmv
