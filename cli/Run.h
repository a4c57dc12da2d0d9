// The command, from its arguments to its exit code.

#pragma once

#include <span>

namespace oxmv::cli {

// `argv` are main's own arguments.
int run(std::span<const char* const> argv);

}  // namespace oxmv::cli
