// Where --output puts a clip that is made anew.

#pragma once

#include <initializer_list>
#include <string>

#include "cli/Inputs.h"
#include "cli/Verb.h"

namespace oxmv::cli {

// The path that --output names, or "-" for standard output. Throws UsageError when the clip would
// take the place of an input.
std::string clipOutput(const Call& call, std::initializer_list<std::string> inputs);

// Binary is never written to a terminal; that is said then.
bool mayGetClip(Call& call, const std::string& output);

// Puts the stream there, whole or not at all, in place of a file that may be there; on a dry run
// only says so. What keeps it from being written is said.
void writeClip(Call& call, const std::string& output, const Bytes& stream);

}  // namespace oxmv::cli
