// Clips as `show` shows them.

#pragma once

#include <array>
#include <functional>
#include <vector>

#include "cli/ClipNames.h"
#include "cli/Verb.h"

namespace oxmv::cli {

// The flags that showClips() looks at.
constexpr auto showFlags =
    std::to_array({Flag::json, Flag::ndjson, Flag::csv, Flag::columns, Flag::strict});

// Reads and shows the clips one after the other, in the form that the call asks for: as tables,
// JSON or lines of CSV. What keeps one from being read, and what readers ignore, is said. Throws
// UsageError for flags that mean nothing before it asks for `names`.
void showClips(Call& call, const std::function<std::vector<ClipName>(Call&)>& names);

}  // namespace oxmv::cli
