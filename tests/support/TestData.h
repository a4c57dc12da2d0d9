// The files below tests/data/.

#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

// `name` is a path below tests/data/. Throws when there is no such file.
Bytes testData(const std::filesystem::path& name);

// The names, without folder and ending, of the files in a folder below tests/data/ that end so.
std::vector<std::string> testDataNames(const std::filesystem::path& folder,
                                       std::string_view ending);

}  // namespace oxmv::test
