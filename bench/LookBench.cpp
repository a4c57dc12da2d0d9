// What importing a look costs. The description is one table of 64 points: 786,432 values in 6.3 MB
// of text.
//
//   import            the whole import: read, parse, convert, check, write the table and the copy
//   to memory         the same up to the values in memory, which is as far as the others go
//   import lines      the same, the text in lines of twelve values; import CRLF: those of another system
//   import blanks     the same, with a blank behind each value
//   hexadecimal       the text into values, and the same in lines and with blanks
//   CRC-32            of 3 MB of values
//
// Beside them: OpenColorIO making a processor of the same table as .cube and as .clf, without its
// caches; libdeflate's CRC-32; and digits taken one by one from a table of 256 entries. The floor
// of an import reads the file, copies 3 MB, and writes that and the file through the same
// functions, so what fsync takes is in both.

#include <array>
#include <bit>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <random>
#include <stdexcept>
#include <utility>

#include <OpenColorIO/OpenColorIO.h>
#include <benchmark/benchmark.h>
#include <libdeflate.h>

#include "FilesBench.h"
#include "oxmv/looks/Crc32.h"
#include "oxmv/looks/HexTable.h"
#include "oxmv/looks/LookDescription.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/platform/WholeFile.h"

namespace bench {
namespace {

using namespace oxmv;
namespace fs = std::filesystem;
namespace ocio = OCIO_NAMESPACE;
using Bytes = std::vector<std::uint8_t>;

constexpr int points = 64;
constexpr std::size_t valueCount = lookValueCount(points);
constexpr int rounds = 21;

// What a host answers that has nothing but the look-table folder.
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

std::span<const std::uint8_t> bytesOf(std::string_view text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

void putFile(const std::string& path, std::span<const std::uint8_t> content) {
  std::error_code error;
  if (!writeWholeFile(path, content, error)) throw std::system_error(error, path);
}

// The table as others have it.

std::string triplesOf(const std::vector<float>& values) {
  std::string text;
  char line[64];
  for (std::size_t i = 0; i < values.size(); i += 3) {
    std::snprintf(line, sizeof line, "%.6f %.6f %.6f\n", static_cast<double>(values[i]),
                  static_cast<double>(values[i + 1]), static_cast<double>(values[i + 2]));
    text += line;
  }
  return text;
}

std::string cubeOf(const std::vector<float>& values) {
  return "LUT_3D_SIZE 64\n" + triplesOf(values);
}

std::string clfOf(const std::vector<float>& values) {
  return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
         "<ProcessList compCLFversion=\"3\" id=\"look\">\n"
         "<LUT3D id=\"table\" inBitDepth=\"32f\" outBitDepth=\"32f\" "
         "interpolation=\"tetrahedral\">\n"
         "<Array dim=\"64 64 64 3\">\n" +
         triplesOf(values) + "</Array>\n</LUT3D>\n</ProcessList>\n";
}

void makeProcessor(const std::string& path) {
  const auto config = ocio::Config::CreateRaw()->createEditableCopy();
  config->setProcessorCacheFlags(ocio::PROCESSOR_CACHE_OFF);
  const auto transform = ocio::FileTransform::Create();
  transform->setSrc(path.c_str());
  transform->setInterpolation(ocio::INTERP_TETRAHEDRAL);
  const auto processor = config->getProcessor(transform);
  if (processor->isNoOp()) throw std::logic_error("no table in " + path);
}

// A digit at a time, as one writes it first: a table says what it is worth.
std::size_t hexByTable(std::string_view text, std::span<std::uint8_t> values) {
  static const std::array<std::uint8_t, 256> worth = [] {
    std::array<std::uint8_t, 256> table{};
    table.fill(0xFF);
    for (std::uint8_t i = 0; i < 16; ++i) {
      table[static_cast<std::uint8_t>("0123456789ABCDEF"[i])] = i;
      table[static_cast<std::uint8_t>("0123456789abcdef"[i])] = i;
    }
    return table;
  }();
  const auto worthOf = [&](std::size_t at) { return worth[static_cast<std::uint8_t>(text[at])]; };
  std::size_t stored = 0;
  for (std::size_t at = 0; at < text.size() && stored < values.size();) {
    if (worthOf(at) == 0xFF) {
      ++at;
      continue;
    }
    if (text.size() - at < 8) break;
    for (std::size_t i = 0; i < 8; i += 2)
      values[stored++] = static_cast<std::uint8_t>(worthOf(at + i) << 4 | worthOf(at + i + 1));
    at += 8;
  }
  return stored / 4;
}

// The floor, between the same folders.
void moveThroughMemory(const LookFolder& folder, const Bytes& table) {
  std::error_code error;
  const auto file = readWholeFile(folder.description(), error);
  if (!file) throw std::system_error(error, "the floor");
  const auto copy = std::make_unique_for_overwrite<std::uint8_t[]>(table.size());
  std::memcpy(copy.get(), table.data(), table.size());
  putFile(folder.looks() + "/1.oxlook", {copy.get(), table.size()});
  putFile(folder.looks() + "/Look.xml", *file);
}

// What an import does before it writes.
void readToMemory(const LookFolder& folder) {
  std::error_code error;
  const auto file = readWholeFile(folder.description(), error);
  if (!file) throw std::system_error(error, "the description");
  const auto description = LookDescription::parse(*file);
  OXLookFileRecord record;
  record.reset(points);
  std::size_t stored = 0;
  for (std::size_t i = 0; i < description->nodeCount(); ++i) {
    if (const LookNode node = description->node(i); node.kind == LookNode::Kind::table)
      stored += record.readTable(node.text).stored;
  }
  if (stored != valueCount) throw std::logic_error("values were lost");
  benchmark::DoNotOptimize(calccrc(record.table().data(), valueCount * 4));
}

std::vector<Line> measureImport(std::string_view name, const std::vector<float>& values,
                                const std::string& text, bool withPeers) {
  const LookFolder folder;
  folder.put(lookDescription(points, {text}));
  const Bytes table(lookFileSize(points), 0x5A);
  const auto prepare = [&] {
    folder.empty();
    ocio::ClearAllCaches();
  };
  std::vector<Measured> all = {{"oxmv", [&] { folder.import(); }, prepare},
                               {"floor", [&] { moveThroughMemory(folder, table); }, prepare}};
  const OwnFolder peers(true);
  const std::string cube = peers.path() + "/Look.cube", clf = peers.path() + "/Look.clf";
  if (withPeers) {
    putFile(cube, bytesOf(cubeOf(values)));
    putFile(clf, bytesOf(clfOf(values)));
    all.push_back({"OpenColorIO .cube", [&] { makeProcessor(cube); }, prepare});
    all.push_back({"OpenColorIO .clf", [&] { makeProcessor(clf); }, prepare});
    all.push_back({"to memory", [&] { readToMemory(folder); }, prepare});
  }
  measureSideBySide(all, rounds);

  Line line{.name = std::string(name),
            .ours = all[0].cpu,
            .floor = all[1].cpu,
            .floorAim = name == "import" ? 0.7 : 0.5};
  if (!withPeers) return {line};
  std::vector<Line> lines;
  for (const Measured& peer : {all[2], all[3]}) {
    line.aim = peer.name.ends_with(".cube") ? 60 : 25;
    line.bestPeer = peer.cpu;
    line.peerName = peer.name;
    lines.push_back(line);
    lines.push_back(
        {.name = "to memory", .ours = all[4].cpu, .bestPeer = peer.cpu, .peerName = peer.name});
  }
  return lines;
}

Line measureHex(std::string_view name, const std::string& text) {
  Bytes values(valueCount * 4), others(valueCount * 4);
  const auto check = [](std::size_t count) {
    if (count != valueCount) throw std::logic_error("values were lost");
  };
  std::vector<Measured> all = {{"oxmv", [&] { check(readHexTable(text, values).stored); }},
                               {"table of 256", [&] { check(hexByTable(text, others)); }}};
  measureSideBySide(all, rounds);
  if (values != others) throw std::logic_error("hexadecimal digits were read in two ways");
  return {.name = std::string(name),
          .ours = all[0].cpu,
          .bestPeer = all[1].cpu,
          .peerName = all[1].name,
          .aim = name == "hexadecimal" ? 4.0 : 0.0};
}

Line measureCrc(const std::vector<float>& values) {
  const auto* const bytes = reinterpret_cast<const std::uint8_t*>(values.data());
  const std::size_t size = values.size() * sizeof(float);
  std::uint32_t ours = 0, theirs = 0;
  std::vector<Measured> all = {
      {"oxmv", [&] { ours = calccrc(bytes, static_cast<std::ptrdiff_t>(size)); }},
      {"libdeflate", [&] { theirs = libdeflate_crc32(0, bytes, size); }}};
  measureSideBySide(all, 10 * rounds);
  if (ours != theirs) throw std::logic_error("two CRC-32 of the same bytes");
  return {.name = "CRC-32",
          .ours = all[0].cpu,
          .bestPeer = all[1].cpu,
          .peerName = all[1].name,
          .aim = 0.98};  // no slower, as far as two times of the same can be told apart
}

}  // namespace

std::vector<float> lookValues(int size) {
  std::mt19937 random(64);
  std::vector<float> values(lookValueCount(size));
  for (float& value : values) value = static_cast<float>(random() % 1000001) / 1000000.0f;
  return values;
}

std::string lookText(const std::vector<float>& values, std::size_t each,
                     std::string_view separator) {
  std::string text;
  for (std::size_t i = 0; i < values.size(); ++i) {
    const auto bits = std::bit_cast<std::uint32_t>(values[i]);
    for (int shift = 0; shift < 32; shift += 8) {
      text += "0123456789ABCDEF"[bits >> (shift + 4) & 0xF];
      text += "0123456789ABCDEF"[bits >> shift & 0xF];
    }
    if ((i + 1) % each == 0) text += separator;
  }
  return text;
}

std::string lookDescription(int size, const std::vector<std::string>& texts) {
  std::string file = "<?xml version=\"1.0\" encoding=\"UTF-8\"?><look>";
  for (const std::string& text : texts) {
    file += "<LUT><size>" + std::to_string(size) + "</size><data>\"" + text + "\"</data></LUT>";
  }
  return file + "</look>";
}

LookFolder::LookFolder() {
  fs::create_directory(looks());
  before_ = installHost(std::make_shared<FolderHost>(looks()));
}

LookFolder::~LookFolder() { installHost(before_); }

void LookFolder::put(std::string_view description) const {
  putFile(this->description(), bytesOf(description));
}

void LookFolder::empty() const {
  for (const auto& entry : fs::directory_iterator(looks())) fs::remove(entry.path());
}

void LookFolder::import() const {
  const auto look = LookFileRef::initFromLookFile(description());
  if (!look || look->version() != 2) throw std::logic_error("no look was imported");
}

std::vector<Line> measureLooks() {
  const std::vector<float> values = lookValues(points);
  const std::string dense = lookText(values, valueCount, "");
  const std::string lines = lookText(values, 12, "\n");
  const std::string blanks = lookText(values, 1, " ");
  std::vector<Line> measured = measureImport("import", values, dense, true);
  measured.push_back(measureImport("import lines", values, lines, false)[0]);
  measured.push_back(measureImport("import CRLF", values, lookText(values, 12, "\r\n"), false)[0]);
  measured.push_back(measureImport("import blanks", values, blanks, false)[0]);
  measured.push_back(measureHex("hexadecimal", dense));
  measured.push_back(measureHex("hex. lines", lines));
  measured.push_back(measureHex("hex. blanks", blanks));
  measured.push_back(measureCrc(values));
  return measured;
}

}  // namespace bench
