#include <array>

#include "cli/ClipNames.h"
#include "cli/ShownClips.h"
#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

void run(Call& call) { showClips(call, namedClips); }

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::csv, Flag::columns,
                                      Flag::filesFrom, Flag::null, Flag::strict});

}  // namespace

const Verb showVerb = {
    .name = "show",
    .words = "CLIP...",
    .summary = "show the tags of clips, with their labels",
    .examples =
        "oxmv show clip.colr\n"
        "oxmv show --json clip.colr\n"
        "oxmv show --csv --columns REEL,TIMC,\"White balance\" *.colr > clips.csv\n"
        "oxmv show 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F @override\n"
        "find . -name '*.colr' -print0 | oxmv show --ndjson --files-from - -0\n",
    .details =
        "CLIP is a file; - for standard input; a GUID for a clip of the database, GUID/left,\n"
        "GUID/right or GUID/N for the file of one of its eyes; @override; or @last. A path that\n"
        "looks like one of these is written ./NAME. What a clip holds and readers ignore is\n"
        "said as a warning; @last counts its bytes from behind the GUID. Long values are cut in\n"
        "the table, and whole with -v and in JSON.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
