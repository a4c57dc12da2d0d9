// What the command can do.

#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "cli/CommandHost.h"
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
  CommandHost& host;  // what the library asks
};

// A verb stands in a file of its own, or with the others of its family. Its help text begins with
// the examples.
struct Verb {
  std::string_view name;        // "show"; a verb of a family has two words: "db list"
  std::string_view words;       // what follows it: "CLIP..."
  std::string_view summary;     // in a line
  std::string_view examples;    // one a line
  std::string_view details;     // lines; may be empty
  std::span<const Flag> flags;  // beside commonFlags
  std::size_t fewestWords;
  std::size_t mostWords;
  void (*run)(Call& call);

  std::size_t wordsInName() const;  // 1 or 2
};

constexpr std::size_t anyNumber = static_cast<std::size_t>(-1);

extern const Verb showVerb, getVerb, setVerb, unsetVerb, diffVerb, dumpVerb, checkVerb, encodeVerb,
    tagsVerb, stillVerb, dbListVerb, dbShowVerb, dbCheckVerb, dbPathVerb, dbInitVerb, prefsVerb,
    pathsVerb, lookListVerb, lookInfoVerb, lookImportVerb, lookLintVerb, lookCheckVerb,
    lookInitVerb, demoVerb, helpVerb, versionVerb;

// Every verb, in the order in which help lists them.
std::span<const Verb* const> verbs() noexcept;

// The verbs of a family: those named "db ..." for "db"; none for any other word.
std::vector<const Verb*> familyOf(std::string_view word);

// The verb that the words begin with; there must be one word. Throws UsageError, with the nearest
// verbs in it, when there is none of that name.
const Verb& verbNamed(std::span<const std::string> words);

}  // namespace oxmv::cli
