// Lines for whoever looks at standard error.

#pragma once

#include <string_view>

namespace oxmv {

// Writes one line, with its end; lines of several threads do not mix. Control characters and the
// like, which may come from the name of somebody else's file, are shown by their numbers. Where
// nobody listens any more (closed, a pipe without a reader) the line is lost quietly, without a
// signal.
void writeToStandardError(std::string_view line);

}  // namespace oxmv
