#include <algorithm>
#include <array>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/DemoClips.h"
#include "cli/Inputs.h"
#include "cli/TagJson.h"
#include "cli/Verb.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

struct DemoFile {
  std::string name;
  Bytes content;
  std::string_view says;
};

constexpr std::string_view damagedName = "damaged.colr";
constexpr std::string_view stillName = "still.jpg";
constexpr std::string_view lookName = "warm.xml";

// Of the tags of a clip.
std::string sourceName(std::string_view clip) {
  return std::filesystem::path(clip).replace_extension(".json").string();
}

Bytes bytesOf(std::string_view text) { return {text.begin(), text.end()}; }

Bytes streamOf(const Dictionary& tags) { return encodeStream(tags).value(); }

// Three floats where readers take two, and a description that ends in its middle.
Bytes damagedStream() {
  Bytes stream = streamOf({{"TIMC", "01:02:03:04"},
                           {"REEL", "A001_C004"},
                           {"DASF", Array::of(1.0f, 2.0f, 3.0f)},
                           {"DSCR", "This description was cut when the card was pulled out."}});
  stream.resize(stream.size() - 40);
  return stream;
}

std::vector<DemoFile> demoFiles() {
  std::vector<DemoFile> files;
  for (const DemoClip& clip : demoClips()) {
    const auto tags = readTagJson(clip.json);
    files.push_back({std::string(clip.name), streamOf(std::get<Dictionary>(tags)), "a clip"});
    files.push_back({sourceName(clip.name), bytesOf(clip.json), "its tags, to encode"});
  }
  for (const DemoLook& look : demoLooks())
    files.push_back({std::string(look.name), bytesOf(look.xml), "a look, to import"});
  files.push_back({std::string(damagedName), damagedStream(), "a clip that was damaged"});
  const auto still = demoStill();
  files.push_back({std::string(stillName), {still.begin(), still.end()}, "a still from a camera"});
  return files;
}

// Whether all files can be made: demonstrations overwrite nothing.
bool areFree(Call& call, const std::filesystem::path& folder, const std::vector<DemoFile>& files) {
  for (const DemoFile& file : files) {
    std::error_code ignored;  // what cannot be looked at cannot be written either, and is said then
    const std::filesystem::path path = folder / file.name;
    if (!std::filesystem::exists(std::filesystem::symlink_status(path, ignored))) continue;
    call.messages.refused(path.string(), "is there already", "file-exists", "nothing written");
    return false;
  }
  return true;
}

// The name as a shell takes it.
std::string inShell(const std::string& name) {
  constexpr std::string_view plain =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-./";
  if (!name.empty() && name.find_first_not_of(plain) == std::string::npos) return visible(name);
  std::string quoted = "'";
  for (const char c : name) quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return visible(quoted + "'");
}

void sayWhatNext(Call& call, const std::filesystem::path& folder) {
  const auto path = [&](std::string_view name) { return inShell((folder / name).string()); };
  const std::string_view shown = demoClips().back().name;
  call.output.write(
      fmt::format("\nNow try\n"
                  "  oxmv show {}\n"
                  "  oxmv dump {}\n"
                  "  oxmv still {}\n"
                  "  oxmv look init --looks {}\n"
                  "  oxmv look import --looks {} {}\n"
                  "  oxmv encode -v {} -o {}\n",
                  path(shown), path(damagedName), path(stillName), path("looks"), path("looks"),
                  path(lookName), path(sourceName(shown)), path("new.colr")));
}

void run(Call& call) {
  const std::filesystem::path folder = call.words.front();
  const bool isDryRun = call.arguments.has(Flag::dryRun);
  const std::vector<DemoFile> files = demoFiles();
  if (!areFree(call, folder, files)) return;
  std::error_code error;
  if (!isDryRun) std::filesystem::create_directories(folder, error);
  if (error) return call.messages.error(folder.string(), error.message(), "write-failed");
  std::size_t width = 0;
  for (const DemoFile& file : files)
    width = std::max(width, visible((folder / file.name).string()).size());
  for (const DemoFile& file : files) {
    const std::filesystem::path path = folder / file.name;
    if (!isDryRun && !writeWholeFile(path, file.content, error))
      return call.messages.error(path.string(), error.message(), "write-failed");
    call.output.write(
        fmt::format("{:<{}}  {}\n", visible(path.string()), width, call.style.faint(file.says)));
  }
  if (!isDryRun) sayWhatNext(call, folder);
}

constexpr auto flags = std::to_array({Flag::dryRun});

}  // namespace

const Verb demoVerb = {
    .name = "demo",
    .words = "DIR",
    .summary = "write a few clips, looks and a still to try things on",
    .examples =
        "oxmv demo try\n"
        "oxmv demo --dry-run try\n",
    .details = "DIR is made if it is not there. Files that are there are not overwritten.\n",
    .flags = flags,
    .fewestWords = 1,
    .mostWords = 1,
    .run = run,
};

}  // namespace oxmv::cli
