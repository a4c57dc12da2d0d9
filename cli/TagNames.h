// Tags as people write and read them.

#pragma once

#include <string>
#include <string_view>

#include "oxmv/metadata/Tag.h"
#include "oxmv/metadata/TagTable.h"

namespace oxmv::cli {

// The four characters, for a line of text; each that is not printable ASCII as "\xNN".
std::string visibleTag(Tag tag);

// The four bytes as characters of the same number, for JSON: different tags stay different.
std::string tagInJson(Tag tag);

// The tag that a user named by its four letters or by its label. The space at the end of "TAG " and
// "REG " may be left out, and in a label upper and lower case count as the same. Throws UsageError,
// with the nearest tags in it, when there is none.
const TagRow& tagNamed(std::string_view typed);

// "; did you mean REEL (Reel name) or REEA (Reel name ALT)?": the tags whose letters or labels are
// nearest; empty when none is.
std::string tagsMeantBy(std::string_view typed);

// Whether `text` contains `part`, upper and lower case counting as the same.
bool containsIgnoringCase(std::string_view text, std::string_view part);

}  // namespace oxmv::cli
