// Any bytes as a dictionary: first as a tag stream that is decoded, then as choices of keys and
// values. What must hold for all of them, in both layouts:
//
// - no loss is named exactly when saving and loading gives the same dictionary;
// - every loss that is named is real (of many, some are tried), and none is named twice;
// - a loss says where it can be avoided exactly when the other layout does not name it.

#include <cstddef>
#include <cstdint>
#include <set>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "fuzz/FuzzInput.h"
#include "fuzz/Require.h"
#include "oxmv/metadata/Losses.h"
#include "tests/support/RealLosses.h"

namespace {

using namespace oxmv;
using fuzz::require;

using Name = std::pair<LossCode, std::string>;

std::set<Name> namesOf(const std::vector<Loss>& losses) {
  std::set<Name> names;
  for (const Loss& loss : losses) require(names.emplace(loss.code, loss.path).second);
  return names;
}

std::vector<Loss> lossesOf(const Dictionary& tags, Layout layout) {
  std::vector<Loss> losses = findLosses(tags, layout);
  require(losses.empty() == (test::comesBack(tags, layout) == tags));
  for (const Loss& loss : losses)
    require(!loss.message.empty() && lossCodeOf(codeOf(loss.code)) == loss.code);
  // For each the whole dictionary is saved and loaded, and some inputs make a thousand of them.
  constexpr std::size_t mostTried = 50;
  const std::size_t step = losses.size() / mostTried + 1;
  for (std::size_t i = 0; i < losses.size(); i += step)
    require(test::isReal(losses[i], tags, layout));
  return losses;
}

void check(const Dictionary& tags) {
  const auto exact = lossesOf(tags, Layout::exact);
  const auto readable = lossesOf(tags, Layout::readable);
  const auto names = namesOf(exact);
  const auto otherNames = namesOf(readable);
  for (const Loss& loss : exact)
    require(loss.avoidedBy.has_value() != otherNames.contains({loss.code, loss.path}));
  for (const Loss& loss : readable)
    require(loss.avoidedBy.has_value() != names.contains({loss.code, loss.path}));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::span bytes(data, size);
  check(decodeStream(bytes, static_cast<std::int32_t>(size)));
  check(fuzz::FuzzInput(bytes).dictionary(3));
  return 0;
}
