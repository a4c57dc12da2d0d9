// What importing a look costs. The description is one table of 64 points: 786,432 values in 6.3 MB of
// text, in one line or in lines of twelve values.
//
//   lookImport        -- the whole import: read, parse, convert, check, write the table and the copy
//   lookImportLines   -- the same, the text in lines
//   lookImportCrlf    -- the same, each line ends in carriage return and line feed
//   lookFloor         -- the floor: the file read, 3 MB copied, that and the file written, no more
//   lookParse         -- the description's nodes, long texts left out of the parsing
//   lookParseCrlf     -- the same for the text in lines that end in carriage return and line feed
//   lookParsePlain    -- the same, everything through the XML parser
//   lookRuns          -- the search for long texts
//   lookHex           -- the text into values; Portable: without vector instructions
//   lookHexLines      -- the same in lines, and with a blank behind each value (Blanks)
//   lookCrc           -- the CRC-32 of 3 MB of values
//
// Files go to /dev/shm where there is one, because a disk's fsync takes longer than all the rest. The
// floor writes through the same function as the import, so what fsync takes there is in both.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "oxmv/host/Host.h"
#include "oxmv/looks/Crc32.h"
#include "oxmv/looks/HexTable.h"
#include "oxmv/looks/LongRuns.h"
#include "oxmv/looks/LookDescription.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/platform/WholeFile.h"

namespace {

using namespace oxmv;
namespace fs = std::filesystem;
using Bytes = std::vector<std::uint8_t>;

constexpr std::size_t valueCount = lookValueCount(maxLookSize);

// Hexadecimal digits of random values, `separator` behind every `each`.
std::string tableText(std::size_t each, std::string_view separator) {
  std::mt19937 random(64);
  std::string text;
  for (std::size_t i = 0; i < valueCount; ++i) {
    std::uint32_t value = static_cast<std::uint32_t>(random());
    for (int k = 0; k < 8; ++k, value >>= 4) text += "0123456789ABCDEF"[value & 0xF];
    if ((i + 1) % each == 0) text += separator;
  }
  return text;
}

const std::string oneLine = '"' + tableText(valueCount, "") + '"';
const std::string lines = tableText(12, "\n");
const std::string crlfLines = tableText(12, "\r\n");
const std::string blanks = tableText(1, " ");

Bytes descriptionOf(const std::string& text) {
  const std::string file =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?><look><LUT><size>64</size><data>" + text +
      "</data></LUT></look>";
  return {file.begin(), file.end()};
}

// A look-table folder, and a host that names it.
class Folder {
 public:
  Folder() {
    const fs::path memory = "/dev/shm";
    std::string pattern =
        (fs::is_directory(memory) ? memory : fs::temp_directory_path()) / "oxmv-bench-XXXXXX";
    if (::mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no folder");
    path_ = pattern;
    fs::create_directory(looks());
    before_ = installHost(std::make_shared<FolderHost>(looks()));
  }
  Folder(const Folder&) = delete;
  Folder& operator=(const Folder&) = delete;
  ~Folder() {
    installHost(before_);
    std::error_code ignored;
    fs::remove_all(path_, ignored);
  }

  fs::path description() const { return path_ / "Look.xml"; }
  fs::path looks() const { return path_ / "looks"; }

  void empty() const {
    for (const auto& entry : fs::directory_iterator(looks())) fs::remove(entry.path());
  }

 private:
  class FolderHost final : public Host {
   public:
    explicit FolderHost(std::string folder) : folder_(std::move(folder)) {}
    Value copyPreference(std::string_view, std::string_view) override { return {}; }
    void setPreference(std::string_view, const Value&, std::string_view) override {}
    bool synchronizePreferences(std::string_view, std::error_code*) override { return true; }
    std::string localizedString(std::string_view, std::string_view) override { return folder_; }
    void alert(std::string_view) override {}
    void log(std::string_view) override {}

   private:
    std::string folder_;
  };

  fs::path path_;
  std::shared_ptr<Host> before_;
};

void put(const fs::path& path, std::span<const std::uint8_t> content) {
  std::error_code error;
  if (!writeWholeFile(path, content, error)) throw std::system_error(error);
}

void import(benchmark::State& state, const std::string& text) {
  const Folder folder;
  put(folder.description(), descriptionOf(text));
  for (auto _ : state) {
    const auto look = LookFileRef::initFromLookFile(folder.description());
    if (!look || look->version() != 2) state.SkipWithError("not imported");
    state.PauseTiming();
    folder.empty();
    state.ResumeTiming();
  }
}

void lookImport(benchmark::State& state) { import(state, oneLine); }
BENCHMARK(lookImport)->Unit(benchmark::kMicrosecond);

void lookImportLines(benchmark::State& state) { import(state, lines); }
BENCHMARK(lookImportLines)->Unit(benchmark::kMicrosecond);

void lookImportCrlf(benchmark::State& state) { import(state, crlfLines); }
BENCHMARK(lookImportCrlf)->Unit(benchmark::kMicrosecond);

void lookFloor(benchmark::State& state) {
  const Folder folder;
  put(folder.description(), descriptionOf(oneLine));
  const Bytes table(lookFileSize(maxLookSize), 0x5A);
  for (auto _ : state) {
    std::error_code error;
    const auto file = readWholeFile(folder.description(), error);
    if (!file) state.SkipWithError("not read");
    const auto copy = std::make_unique_for_overwrite<std::uint8_t[]>(table.size());
    std::memcpy(copy.get(), table.data(), table.size());
    put(folder.looks() / "1.oxlook", {copy.get(), table.size()});
    put(folder.looks() / "Look.xml", *file);
    state.PauseTiming();
    folder.empty();
    state.ResumeTiming();
  }
}
BENCHMARK(lookFloor)->Unit(benchmark::kMicrosecond);

void parse(benchmark::State& state, const std::string& text, LookParsing parsing) {
  const Bytes file = descriptionOf(text);
  for (auto _ : state) {
    benchmark::DoNotOptimize(LookDescription::parse(file, nullptr, parsing)->nodeCount());
  }
}

void lookParse(benchmark::State& state) { parse(state, oneLine, LookParsing::quick); }
BENCHMARK(lookParse)->Unit(benchmark::kMicrosecond);

void lookParseCrlf(benchmark::State& state) { parse(state, crlfLines, LookParsing::quick); }
BENCHMARK(lookParseCrlf)->Unit(benchmark::kMicrosecond);

void lookParsePlain(benchmark::State& state) { parse(state, oneLine, LookParsing::plain); }
BENCHMARK(lookParsePlain)->Unit(benchmark::kMicrosecond);

void runs(benchmark::State& state, Instructions instructions) {
  const Bytes file = descriptionOf(oneLine);
  const std::string_view text(reinterpret_cast<const char*>(file.data()), file.size());
  for (auto _ : state) benchmark::DoNotOptimize(withoutLongRuns(text, instructions).runs.size());
}

void lookRuns(benchmark::State& state) { runs(state, Instructions::vector); }
BENCHMARK(lookRuns)->Unit(benchmark::kMicrosecond);

void lookRunsPortable(benchmark::State& state) { runs(state, Instructions::portable); }
BENCHMARK(lookRunsPortable)->Unit(benchmark::kMicrosecond);

void hex(benchmark::State& state, const std::string& text, Instructions instructions) {
  Bytes values(valueCount * 4);
  for (auto _ : state) {
    if (readHexTable(text, values, instructions).stored != valueCount) state.SkipWithError("lost");
  }
}

void lookHex(benchmark::State& state) { hex(state, oneLine, Instructions::vector); }
BENCHMARK(lookHex)->Unit(benchmark::kMicrosecond);

void lookHexPortable(benchmark::State& state) { hex(state, oneLine, Instructions::portable); }
BENCHMARK(lookHexPortable)->Unit(benchmark::kMicrosecond);

void lookHexLines(benchmark::State& state) { hex(state, lines, Instructions::vector); }
BENCHMARK(lookHexLines)->Unit(benchmark::kMicrosecond);

void lookHexBlanks(benchmark::State& state) { hex(state, blanks, Instructions::vector); }
BENCHMARK(lookHexBlanks)->Unit(benchmark::kMicrosecond);

void crc(benchmark::State& state, Instructions instructions) {
  const Bytes values(valueCount * 4, 0x5A);
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        update_crc(0, values.data(), static_cast<std::ptrdiff_t>(values.size()), instructions));
  }
}

void lookCrc(benchmark::State& state) { crc(state, Instructions::vector); }
BENCHMARK(lookCrc)->Unit(benchmark::kMicrosecond);

void lookCrcPortable(benchmark::State& state) { crc(state, Instructions::portable); }
BENCHMARK(lookCrcPortable)->Unit(benchmark::kMicrosecond);

}  // namespace
