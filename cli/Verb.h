// What the command can do.

#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>

#include "cli/Flags.h"
#include "cli/Messages.h"
#include "cli/StandardStreams.h"
#include "cli/Style.h"

namespace oxmv::cli {

// One call of a verb.
struct Call {
  std::span<const std::string> words;  // behind the verb
  const Arguments& arguments;
  StandardOutput& output;
  Style style;  // of the output
  Messages& messages;
};

// A verb stands in a file of its own. Its help text begins with the examples.
struct Verb {
  std::string_view name;
  std::string_view words;       // what follows it: "CLIP..."
  std::string_view summary;     // in a line
  std::string_view examples;    // one a line
  std::string_view details;     // lines; may be empty
  std::span<const Flag> flags;  // beside commonFlags
  std::size_t fewestWords;
  std::size_t mostWords;
  void (*run)(Call& call);
};

constexpr std::size_t anyNumber = static_cast<std::size_t>(-1);

extern const Verb showVerb, getVerb, setVerb, unsetVerb, diffVerb, dumpVerb, checkVerb, encodeVerb,
    tagsVerb, stillVerb, demoVerb, helpVerb, versionVerb;

// Every verb, in the order in which help lists them.
std::span<const Verb* const> verbs() noexcept;

// Throws UsageError, with the nearest verbs in it, when there is none of that name.
const Verb& verbNamed(std::string_view name);

}  // namespace oxmv::cli
