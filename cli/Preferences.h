// The library's preferences, in the files in which they are kept.

#pragma once

#include <filesystem>
#include <string_view>
#include <vector>

#include "cli/Verb.h"
#include "oxmv/host/PreferencesFile.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

// The files in which preferences are looked for, in that order.
std::vector<PreferencesFile> preferencesFiles();

// What is kept under a key, and where; nothing if nothing is.
struct StoredPreference {
  Value value;
  std::filesystem::path file;
};
StoredPreference storedPreference(std::string_view key);

// Whether the file is there and says nothing to us; and why, in a message.
bool isBad(const PreferencesFile& file);
std::string describeProblem(const PreferencesFile& file);

// Says which files are there and cannot be read.
void sayBadPreferencesFiles(Call& call);

}  // namespace oxmv::cli
