#include "oxmv/Version.h"

#include <fmt/format.h>

#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

void run(Call& call) { call.output.write(fmt::format("oxmv {}\n", version)); }

}  // namespace

const Verb versionVerb = {
    .name = "version",
    .words = "",
    .summary = "show the version",
    .examples = "oxmv version\n",
    .details = "",
    .flags = {},
    .fewestWords = 0,
    .mostWords = 0,
    .run = run,
};

}  // namespace oxmv::cli
