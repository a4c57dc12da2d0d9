#include "cli/Verb.h"

#include <array>
#include <vector>

#include <fmt/format.h>

#include "cli/Nearest.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

constexpr auto all = std::to_array<const Verb*>({&showVerb, &getVerb, &setVerb, &unsetVerb,
                                                 &diffVerb, &dumpVerb, &checkVerb, &encodeVerb,
                                                 &tagsVerb, &demoVerb, &helpVerb, &versionVerb});

}  // namespace

std::span<const Verb* const> verbs() noexcept { return all; }

const Verb& verbNamed(std::string_view name) {
  std::vector<std::string_view> names;
  for (const Verb* verb : all) {
    if (verb->name == name) return *verb;
    names.push_back(verb->name);
  }
  const std::string meant = didYouMean(nearest(name, names));
  throw UsageError("unknown-verb", fmt::format("no verb \"{}\"{}", visible(name),
                                               meant.empty() ? "; oxmv help lists them" : meant));
}

}  // namespace oxmv::cli
