// Clips as the command reads them.

#pragma once

#include <cstddef>
#include <system_error>
#include <variant>
#include <vector>

#include "cli/ClipNames.h"
#include "cli/Findings.h"
#include "cli/Inputs.h"
#include "cli/Verb.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/myGUID.h"

namespace oxmv::cli {

// A clip's stream, and the GUID that the clip has before a record of the stream says otherwise: of
// the "last" file the one at its head, of a clip of the database its own, of any other zero.
struct ClipStream {
  Bytes bytes;
  myGUID guid;
  std::size_t head = 0;  // bytes of the file that stand before the stream
};

// Says nothing.
std::variant<ClipStream, FileProblem> readStream(const ClipName& name);

struct Clip {
  Dictionary tags;
  // As the library has it: GUID records change it, but not that of a combined file.
  myGUID guid;
  std::vector<Finding> losses;  // what it holds and readers ignore
  std::size_t size;             // of the stream, in bytes
};

Clip decodeClip(const ClipName& name, const ClipStream& stream);

// Everything that is odd about the stream.
std::vector<Finding> findingsIn(const ClipName& name, const ClipStream& stream);

// Both at once. What keeps the clip from being read is said already.
std::variant<Clip, FileProblem> readClip(Call& call, const ClipName& name);

// Says what readers ignore, as warnings.
void warnOfLosses(Call& call, const ClipName& name, const Clip& clip);

// Puts a stream where the clip belongs, whatever is there. Kept on purpose: an eye without tags has
// no file, so an empty stream removes it, if it is there; any other clip leaves an empty file.
[[nodiscard]] bool writeClip(const ClipName& name, const Bytes& stream, std::error_code& error);

// Says why a clip was not written, and the way out; answers what was said.
FileProblem sayWriteFailed(Call& call, const ClipName& name, const std::error_code& error);

}  // namespace oxmv::cli
