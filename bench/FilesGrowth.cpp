// Growth of what reads many bytes from files.
//
//   import            a look description of one table, from 6 points per axis to 64
//   import tables     descriptions of 2, 4 ... 2,048 tables of 4 points
//   db list           databases of 10, 20 ... 10,240 clips of 2 KB

#include <cmath>
#include <cstdint>
#include <filesystem>
#include <memory>
#include <utility>

#include "FilesBench.h"
#include "Growth.h"

namespace bench {
namespace {

// A description of `tables` tables that all differ.
std::string descriptionOf(int points, std::size_t tables) {
  std::vector<std::string> texts;
  std::vector<float> values = lookValues(points);
  for (std::size_t i = 0; i < tables; ++i) {
    values.front() = static_cast<float>(i);
    texts.push_back(lookText(values, values.size(), ""));
  }
  return lookDescription(points, texts);
}

GrowingPath importPath(std::string name, const LookFolder& folder,
                       const std::vector<std::string>& descriptions) {
  GrowingPath path{std::move(name),
                   {},
                   [&](std::size_t) { folder.import(); },
                   [&](std::size_t i) {
                     folder.empty();
                     folder.put(descriptions[i]);
                   }};
  for (std::size_t i = 0; i < growthSizes; ++i)
    path.bytes[i] = static_cast<double>(descriptions[i].size());
  return path;
}

double bytesIn(const std::string& folder) {
  std::uintmax_t bytes = 0;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) bytes += entry.file_size();
  return static_cast<double>(bytes);
}

}  // namespace

void printGrowthOfFiles() {
  const LookFolder folder;
  std::vector<std::string> one, many;
  for (std::size_t i = 0; i < growthSizes; ++i) {
    one.push_back(descriptionOf(
        static_cast<int>(std::lround(64 / std::exp2((10.0 - static_cast<double>(i)) / 3))), 1));
    many.push_back(descriptionOf(4, std::size_t{2} << i));
  }
  std::vector<GrowingPath> paths = {importPath("import", folder, one),
                                    importPath("import tables", folder, many)};
  std::vector<std::unique_ptr<OwnFolder>> databases;
  GrowingPath list{"db list", {}, [&](std::size_t i) {
                     runCommand({"db", "list", "--db", databases[i]->path().c_str()});
                   }};
  for (std::size_t i = 0; i < growthSizes; ++i) {
    databases.push_back(std::make_unique<OwnFolder>(false));
    writeClips(databases.back()->path(), std::size_t{10} << i);
    list.bytes[i] = bytesIn(databases.back()->path());
  }
  paths.push_back(std::move(list));
  printGrowth(paths);
}

}  // namespace bench
