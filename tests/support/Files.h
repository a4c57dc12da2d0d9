// Files as tests make and look at them.

#pragma once

#include <filesystem>
#include <set>
#include <string>

#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

void putFile(const std::filesystem::path& path, const Bytes& content);

// No bytes when there is no such file.
Bytes getFile(const std::filesystem::path& path);

// What is in a folder.
std::set<std::string> namesIn(const std::filesystem::path& folder);

}  // namespace oxmv::test
