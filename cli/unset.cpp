#include <array>
#include <string>
#include <vector>

#include <fmt/format.h>

#include "cli/ClipEdit.h"
#include "cli/TagPaths.h"
#include "cli/Verb.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

// Whether the edit may go on.
bool remove(Call& call, ClipEdit& edit, const TagPath& path) {
  const std::string text = path.text();
  const auto error = edit.editor().remove(text);
  if (!error) return true;
  if (error->refusal != EditRefusal::absent) {
    edit.sayRefused(text, *error);
    return false;
  }
  call.messages.error(edit.name(), fmt::format("{} is not there", visible(text)), "absent",
                      Outcome::no);
  return true;
}

void run(Call& call) {
  std::vector<TagPath> paths;
  for (const std::string& word : call.words.subspan(1)) paths.push_back(tagPathFrom(word));
  auto edit = ClipEdit::begin(call);
  if (!edit) return;
  bool isPossible = true;
  for (const TagPath& path : paths) isPossible = remove(call, *edit, path) && isPossible;
  if (isPossible) edit->finish();
}

constexpr auto flags = std::to_array({Flag::dryRun, Flag::backup});

}  // namespace

const Verb unsetVerb = {
    .name = "unset",
    .words = "CLIP TAG...",
    .summary = "remove tags, and no other byte of the clip",
    .examples =
        "oxmv unset clip.colr LOGC \"Reel name ALT\"\n"
        "oxmv unset --dry-run clip.colr COL1/SATU TAG/ISO\n"
        "oxmv unset @override LOOK LCRC\n"
        "oxmv unset - GUID < clip.colr > copy.colr\n",
    .details =
        "CLIP is what it is in oxmv help show, but for @last. The file of an eye goes with its\n"
        "last tag; any other clip is left empty. A TAG is its four letters or its label; one\n"
        "that stands in another is COL1/TAG, and an entry of a group TAG/NAME or REG/NAME. Exit\n"
        "code 1 when a tag is not there; the others are removed. The file is replaced whole or\n"
        "not at all. CLIP - reads standard input and writes standard output. --dry-run shows\n"
        "what would go.\n",
    .flags = flags,
    .fewestWords = 2,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
