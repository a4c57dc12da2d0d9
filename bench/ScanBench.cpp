// What listing a database costs, beside what the system takes to hand over its files.
//
//   floor      -- the names in the folder, and each file opened, read into one buffer and closed
//   twoFloors  -- the same on two threads, each with half of the files
//   list       -- `oxmv db list`: the table of all clips
//   listJson   -- `oxmv db list --ndjson`
//   check      -- `oxmv db check`
//
// 20,000 clips of one combined file, all in the system's memory. The output goes to /dev/null. What
// counts is the ratio to `floor`, which every other line has as `floors`.

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

#include <benchmark/benchmark.h>
#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include "cli/Run.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/store/ClipFileName.h"
#include "oxmv/values/Array.h"

namespace {

using namespace oxmv;
using Seconds = std::chrono::duration<double>;

constexpr std::uint32_t clipCount = 20000;

std::vector<std::uint8_t> clip(std::uint32_t number) {
  const std::string text = std::to_string(number);
  Dictionary tags = {{"TIMC", "01:00:00:00"},
                     {"REEL", "A001_C" + text},
                     {"DATE", "2026-03-14"},
                     {"TIME", "15:09:26"},
                     {"LOGC", "second take, clouds"},
                     {"SCEN", static_cast<std::int32_t>(number % 90)},
                     {"SHOT", 4},
                     {"TAKE", 2},
                     {"LOOK", "Warm.oxlook"},
                     {"WBAL", Array::of(1.0f, 1.2f, 1.05f, 1.5f)},
                     {"SATU", 1.1f},
                     {"CMDL", "QX Alpha"}};
  for (const char* tag : {"GAIN", "SHUT", "PROJ", "ECRV", "DCRV", "PCRV", "PIXR", "CAMR"})
    tags.set(tag, static_cast<std::int32_t>(number % 7));
  return encodeStream(tags).value();
}

// A database in a folder of its own, for as long as the program runs.
class Clips {
 public:
  Clips() {
    std::string pattern = std::filesystem::temp_directory_path() / "oxmv-bench-XXXXXX";
    path_ = ::mkdtemp(pattern.data());
    for (std::uint32_t i = 0; i < clipCount; ++i) {
      const ClipFileName name{{i * 2654435761u, 1, 2, {3, 4, 5, 6, 7, 8, 9, 10}}, std::nullopt};
      const std::vector<std::uint8_t> stream = clip(i);
      std::ofstream(path_ + '/' + name.text(), std::ios::binary)
          .write(reinterpret_cast<const char*>(stream.data()),
                 static_cast<std::streamsize>(stream.size()));
    }
  }
  Clips(const Clips&) = delete;
  Clips& operator=(const Clips&) = delete;
  ~Clips() { std::filesystem::remove_all(path_); }

  const std::string& path() const { return path_; }

 private:
  std::string path_;
};

const std::string& folder() {
  static const Clips clips;
  return clips.path();
}

std::vector<std::string> names(int directory) {
  std::vector<std::string> found;
  DIR* const entries = ::fdopendir(::openat(directory, ".", O_RDONLY | O_DIRECTORY));
  while (const dirent* entry = ::readdir(entries)) {
    if (entry->d_name[0] != '.') found.emplace_back(entry->d_name);
  }
  ::closedir(entries);
  return found;
}

std::size_t readAll(int directory, const std::vector<std::string>& files, std::size_t first,
                    std::size_t step) {
  std::vector<std::uint8_t> buffer(65536);
  std::size_t bytes = 0;
  for (std::size_t i = first; i < files.size(); i += step) {
    const int file = ::openat(directory, files[i].c_str(), O_RDONLY);
    bytes += static_cast<std::size_t>(::read(file, buffer.data(), buffer.size()));
    ::close(file);
  }
  return bytes;
}

void scan(std::size_t threads) {
  const int directory = ::open(folder().c_str(), O_RDONLY | O_DIRECTORY);
  const std::vector<std::string> files = names(directory);
  std::atomic<std::size_t> bytes = 0;
  std::vector<std::thread> others;
  for (std::size_t i = 1; i < threads; ++i)
    others.emplace_back([&, i] { bytes += readAll(directory, files, i, threads); });
  bytes += readAll(directory, files, 0, threads);
  for (std::thread& other : others) other.join();
  ::close(directory);
  benchmark::DoNotOptimize(bytes.load());
}

template <class Body>
double secondsFor(Body body) {
  const auto start = std::chrono::steady_clock::now();
  body();
  return Seconds(std::chrono::steady_clock::now() - start).count();
}

// Each run beside one of the floor, so that both meet the same machine.
template <class Body>
void besideFloor(benchmark::State& state, Body body) {
  folder();
  scan(1);
  double floor = 0;
  double all = 0;
  for (auto _ : state) {
    floor += secondsFor([] { scan(1); });
    const double seconds = secondsFor(body);
    all += seconds;
    state.SetIterationTime(seconds);
  }
  state.counters["floors"] = all / floor;
  state.SetItemsProcessed(state.iterations() * clipCount);
}

// The command, with its standard output in /dev/null.
void command(std::vector<const char*> arguments) {
  arguments.insert(arguments.begin(), "oxmv");
  arguments.insert(arguments.end(), {"--db", folder().c_str()});
  const int before = ::dup(STDOUT_FILENO);
  const int nothing = ::open("/dev/null", O_WRONLY);
  ::dup2(nothing, STDOUT_FILENO);
  if (cli::run(arguments) != 0) std::abort();
  ::dup2(before, STDOUT_FILENO);
  ::close(nothing);
  ::close(before);
}

void floor(benchmark::State& state) {
  besideFloor(state, [] { scan(1); });
}
BENCHMARK(floor)->UseManualTime()->Unit(benchmark::kMillisecond);

void twoFloors(benchmark::State& state) {
  besideFloor(state, [] { scan(2); });
}
BENCHMARK(twoFloors)->UseManualTime()->Unit(benchmark::kMillisecond);

void list(benchmark::State& state) {
  besideFloor(state, [] { command({"db", "list"}); });
}
BENCHMARK(list)->UseManualTime()->Unit(benchmark::kMillisecond);

void listJson(benchmark::State& state) {
  besideFloor(state, [] { command({"db", "list", "--ndjson"}); });
}
BENCHMARK(listJson)->UseManualTime()->Unit(benchmark::kMillisecond);

void check(benchmark::State& state) {
  besideFloor(state, [] { command({"db", "check"}); });
}
BENCHMARK(check)->UseManualTime()->Unit(benchmark::kMillisecond);

}  // namespace
