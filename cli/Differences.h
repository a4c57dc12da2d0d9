// What is different between the tags of two clips, tag by tag.

#pragma once

#include <string>
#include <vector>

#include "cli/ValueText.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

struct Difference {
  std::string path;  // "COL1/WBAL", "KWRd[3]", "TAG /ISO"
  Value before;      // nothing: it is not there
  Value after;
};

// In the order of `before`, and behind that what only `after` has. A list of numbers is one value;
// of all else that holds values the innermost different ones are named. Empty exactly when the
// dictionaries are equal.
std::vector<Difference> differencesBetween(const Dictionary& before, const Dictionary& after);

// A difference in visible text. Values that would look the same, such as 5 and "5", are shown as
// tag JSON; one that is not there is empty.
struct ShownDifference {
  std::string path, before, after;
};
ShownDifference show(const Difference& difference, Extent extent);

}  // namespace oxmv::cli
