// Clips as the command reads them.

#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "cli/Findings.h"
#include "cli/Inputs.h"
#include "cli/Verb.h"
#include "oxmv/metadata/MetadataDictionary.h"

namespace oxmv::cli {

struct Clip {
  MetadataDictionary metadata;
  std::vector<Finding> losses;  // what it holds and readers ignore
  std::size_t size;             // in bytes
};

Clip decodeClip(const Bytes& bytes);

// A file's clip. What keeps it from being read is said already.
std::variant<Clip, FileProblem> readClip(Call& call, const std::string& name);

// Says what readers ignore, as warnings.
void warnOfLosses(Call& call, const std::string& name, const Clip& clip);

}  // namespace oxmv::cli
