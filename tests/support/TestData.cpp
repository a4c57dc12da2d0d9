#include "tests/support/TestData.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace oxmv::test {
namespace {

const std::filesystem::path root = OXMV_TEST_DATA;

}  // namespace

Bytes testData(const std::filesystem::path& name) {
  std::ifstream file(root / name, std::ios::binary);
  if (!file) throw std::runtime_error("no test data " + name.string());
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

std::vector<std::string> testDataNames(const std::filesystem::path& folder,
                                       std::string_view ending) {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(root / folder)) {
    const std::string name = entry.path().filename().string();
    if (name.ends_with(ending)) names.push_back(name.substr(0, name.size() - ending.size()));
  }
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace oxmv::test
