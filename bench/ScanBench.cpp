// What listing a database costs, beside what the system takes to hand over its files.
//
//   db list           `oxmv db list`: the table of all clips; the same as CSV and as NDJSON
//   db check          `oxmv db check`
//
// 20,000 clips of 2 KB, all in the system's memory. The output goes to /dev/null. The floor reads
// the names in the folder, and opens, reads into one buffer and closes each file. On one processor
// time is what the processor took; on two, where the floor has a thread for each half of the files,
// it is that of the clock on the wall.

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <future>
#include <stdexcept>
#include <thread>

#include <benchmark/benchmark.h>
#include <dirent.h>
#include <fcntl.h>
#include <sched.h>
#include <unistd.h>

#include "Corpus.h"
#include "FilesBench.h"
#include "cli/Run.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/store/ClipFileName.h"

namespace bench {
namespace {

using namespace oxmv;

constexpr std::size_t clipCount = 20000;
constexpr int rounds = 15;
constexpr double floorAim = 0.75;

std::vector<std::string> names(int directory) {
  std::vector<std::string> found;
  DIR* const entries = ::fdopendir(::openat(directory, ".", O_RDONLY | O_DIRECTORY));
  while (const dirent* entry = ::readdir(entries)) {
    if (entry->d_name[0] != '.') found.emplace_back(entry->d_name);
  }
  ::closedir(entries);
  return found;
}

std::size_t readAll(int directory, std::span<const std::string> files) {
  std::vector<std::uint8_t> buffer(65536);
  std::size_t bytes = 0;
  for (const std::string& name : files) {
    const int file = ::openat(directory, name.c_str(), O_RDONLY);
    bytes += static_cast<std::size_t>(::read(file, buffer.data(), buffer.size()));
    ::close(file);
  }
  return bytes;
}

void readFolder(const std::string& folder, bool onTwoThreads) {
  const int directory = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY);
  const std::vector<std::string> files = names(directory);
  const std::span all(files);
  const std::size_t middle = onTwoThreads ? all.size() / 2 : all.size();
  std::future<std::size_t> other;
  if (onTwoThreads) {
    other = std::async(std::launch::async, [&] { return readAll(directory, all.subspan(middle)); });
  }
  std::size_t bytes = readAll(directory, all.first(middle));
  if (onTwoThreads) bytes += other.get();
  ::close(directory);
  benchmark::DoNotOptimize(bytes);
}

// Keeps the process on one processor, of which the command then has one thread.
class OneProcessor {
 public:
  OneProcessor() {
    ::sched_getaffinity(0, sizeof before_, &before_);
    cpu_set_t one;
    CPU_ZERO(&one);
    for (std::size_t i = 0; i < CPU_SETSIZE && CPU_COUNT(&one) == 0; ++i) {
      if (CPU_ISSET(i, &before_)) CPU_SET(i, &one);
    }
    ::sched_setaffinity(0, sizeof one, &one);
  }
  OneProcessor(const OneProcessor&) = delete;
  OneProcessor& operator=(const OneProcessor&) = delete;
  ~OneProcessor() { ::sched_setaffinity(0, sizeof before_, &before_); }

 private:
  cpu_set_t before_;
};

}  // namespace

void writeClips(const std::string& folder, std::size_t count) {
  static const Corpus corpus = makeCorpus("typical", 2048);
  for (std::size_t i = 0; i < count; ++i) {
    const auto number = static_cast<std::uint32_t>(i);
    Dictionary tags = corpus.clips[i % corpus.clips.size()];
    tags.set("REEL", "A001_C" + std::to_string(number));
    tags.set("TIMC", "01:00:00:00");
    tags.set("DATE", "2026-03-14");
    tags.set("SCEN", static_cast<std::int32_t>(number % 90));
    tags.set("SHOT", 4);
    tags.set("TAKE", 2);
    tags.set("LOOK", "Warm.oxlook");
    const Bytes stream = encodeStream(tags).value();
    const ClipFileName name{{number * 2654435761u, 1, 2, {3, 4, 5, 6, 7, 8, 9, 10}}, std::nullopt};
    std::ofstream file(folder + '/' + name.text(), std::ios::binary);
    file.write(reinterpret_cast<const char*>(stream.data()),
               static_cast<std::streamsize>(stream.size()));
    if (!file.flush()) throw std::runtime_error("clips cannot be written");
  }
}

void runCommand(std::vector<const char*> arguments) {
  arguments.insert(arguments.begin(), "oxmv");
  const int before = ::dup(STDOUT_FILENO);
  const int nothing = ::open("/dev/null", O_WRONLY);
  ::dup2(nothing, STDOUT_FILENO);
  const int exitCode = cli::run(arguments);
  ::dup2(before, STDOUT_FILENO);
  ::close(nothing);
  ::close(before);
  if (exitCode != 0) throw std::runtime_error("the command failed");
}

std::vector<Line> measureScan() {
  const OwnFolder folder(false);
  writeClips(folder.path(), clipCount);
  const auto command = [&](std::vector<const char*> arguments) {
    arguments.insert(arguments.end(), {"--db", folder.path().c_str()});
    return [arguments] { runCommand(arguments); };
  };
  std::vector<Measured> all = {{"db list", command({"db", "list"})},
                               {"db list CSV", command({"db", "list", "--csv"})},
                               {"db list NDJSON", command({"db", "list", "--ndjson"})},
                               {"db check", command({"db", "check"})},
                               {"floor", [&] { readFolder(folder.path(), false); }}};
  std::vector<Line> lines;
  const auto addLines = [&](double Measured::*time, const char* suffix) {
    for (const Measured& one : std::span(all).first(all.size() - 1)) {
      lines.push_back({.name = one.name + suffix,
                       .ours = one.*time,
                       .floor = all.back().*time,
                       .floorAim = floorAim});
    }
  };
  {
    const OneProcessor alone;
    measureSideBySide(all, rounds);
  }
  addLines(&Measured::cpu, "");
  if (std::thread::hardware_concurrency() > 1) {
    all.back().run = [&] { readFolder(folder.path(), true); };
    measureSideBySide(all, rounds);
    addLines(&Measured::wall, ", two");
  }
  return lines;
}

}  // namespace bench
