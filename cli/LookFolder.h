// The look-table folder as the command uses it.

#pragma once

#include <optional>
#include <string>

#include "cli/Inputs.h"

namespace oxmv::cli {

// Why nothing can be done in the folder: it is not there. Nothing when it is.
std::optional<FileProblem> problemOfLookFolder(const std::string& folder);

}  // namespace oxmv::cli
