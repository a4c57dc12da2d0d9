// What a call may lose of what it writes.

#pragma once

#include <functional>
#include <string>
#include <vector>

#include "cli/Verb.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagStreamEncoder.h"

namespace oxmv::cli {

// What --layout says.
Layout layoutOf(const Arguments& arguments);

// What --allow lets through. Throws UsageError for a code that does not exist.
std::vector<LossCode> allowedLosses(const Arguments& arguments);

// "--layout readable avoids it", "--allow CODE lets it through".
std::string wayOut(const Loss& loss);

// Whether none of the losses is to be refused. Each is said: those that are allowed as warnings,
// all others as refusals, with the way out that `wayOutOf` knows; it may know none.
bool passes(Call& call, const std::string& file, const std::vector<Loss>& losses,
            const std::vector<LossCode>& allowed,
            const std::function<std::string(const Loss&)>& wayOutOf = wayOut);

// "nothing written; --allow CODE lets it through"
std::string nothingWritten(const std::string& wayOut);

}  // namespace oxmv::cli
