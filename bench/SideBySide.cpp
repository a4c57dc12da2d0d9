#include "SideBySide.h"

#include <cstddef>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <stdexcept>
#include <system_error>
#include <vector>

#include "Report.h"

namespace bench {
namespace {

namespace fs = std::filesystem;

double nanoseconds(clockid_t clock) {
  timespec time{};
  ::clock_gettime(clock, &time);
  return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
}

}  // namespace

void measureSideBySide(std::span<Measured> all, int rounds) {
  std::vector<std::vector<double>> cpu(all.size()), wall(all.size());
  for (int round = -1; round < rounds; ++round) {
    for (std::size_t i = 0; i < all.size(); ++i) {
      if (all[i].prepare != nullptr) all[i].prepare();
      const double cpuStart = nanoseconds(CLOCK_PROCESS_CPUTIME_ID);
      const double wallStart = nanoseconds(CLOCK_MONOTONIC);
      all[i].run();
      const double wallEnd = nanoseconds(CLOCK_MONOTONIC);
      const double cpuEnd = nanoseconds(CLOCK_PROCESS_CPUTIME_ID);
      if (round < 0) continue;
      cpu[i].push_back(cpuEnd - cpuStart);
      wall[i].push_back(wallEnd - wallStart);
    }
  }
  for (std::size_t i = 0; i < all.size(); ++i) {
    all[i].cpu = medianOf(cpu[i]);
    all[i].wall = medianOf(wall[i]);
  }
}

OwnFolder::OwnFolder(bool inMemory) {
  const fs::path memory = "/dev/shm";
  path_ = (inMemory && fs::is_directory(memory) ? memory : fs::temp_directory_path()) /
          "oxmv-bench-XXXXXX";
  if (::mkdtemp(path_.data()) == nullptr) throw std::runtime_error("no folder for measuring");
}

OwnFolder::~OwnFolder() {
  std::error_code ignored;
  fs::remove_all(path_, ignored);
}

}  // namespace bench
