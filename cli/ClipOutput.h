// Where --output puts a clip that is made anew.

#pragma once

#include <initializer_list>
#include <optional>
#include <string>

#include "cli/ClipNames.h"
#include "cli/Inputs.h"
#include "cli/Verb.h"

namespace oxmv::cli {

// The clip that --output names. Throws UsageError when it may not be written or would take the
// place of an input.
ClipName clipOutput(const Call& call, std::initializer_list<std::string> inputs);

// Binary is never written to a terminal; that is said then.
bool mayGetClip(Call& call, const ClipName& output);

// Puts the stream there, as writeClip() does, or on standard output; on a dry run only says so.
// What keeps it from being written is said, and answered.
std::optional<FileProblem> putClip(Call& call, const ClipName& output, const Bytes& stream);

}  // namespace oxmv::cli
