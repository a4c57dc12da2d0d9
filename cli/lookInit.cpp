#include <array>
#include <filesystem>
#include <string>
#include <system_error>

#include <fmt/format.h>

#include "cli/Verb.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

void run(Call& call) {
  const std::string folder = lookTableFolder();
  std::error_code error;
  if (std::filesystem::is_directory(folder, error))
    return call.messages.note(folder, "the look-table folder is there");
  if (!call.arguments.has(Flag::dryRun)) {
    std::filesystem::create_directories(folder, error);
    if (error) return call.messages.error(folder, error.message(), "write-failed");
  }
  call.output.write(
      fmt::format("{}  {}\n", visible(folder), call.style.faint("look-table folder")));
}

constexpr auto flags = std::to_array({Flag::dryRun});

}  // namespace

const Verb lookInitVerb = {
    .name = "look init",
    .words = "",
    .summary = "make the look-table folder",
    .examples =
        "oxmv look init\n"
        "oxmv look init --looks looks\n"
        "oxmv look init --dry-run\n",
    .details =
        "Hosts make no folders: without it no look can be imported. Makes the folder and those\n"
        "above it, and says so; says nothing when it is there, but with -v.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 0,
    .run = run,
};

}  // namespace oxmv::cli
