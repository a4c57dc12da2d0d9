// Values as users type them, each read by the kind of its tag.
//
//   REEL=A001               text, as it is
//   TAKE=3, LCRC=0x1A2B3C4D  integer
//   SATU=0.8                float
//   WBAL=1,1.2,1,1.5        list of numbers, with commas or blanks between them
//   KWRd=day                list of texts, of one text
//   FREE=00ff               data, in hexadecimal digits
//   COL1={"SATU":0.8}       everything that holds tags, as tag JSON

#pragma once

#include <string>
#include <string_view>
#include <variant>

#include "cli/TagPaths.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

// Why a text is no value of the tag.
struct ValueProblem {
  std::string_view code;  // stable: "bad-value"
  std::string message;    // reads on behind the path: `needs an integer, got "x"`
};

// The value for what stands at `path`, where `old` is now. Texts of lists get the NULs that fill
// their records, as every writer of clips has them. The entry of a group becomes an integer if it
// is written like one, unless it was a text before.
std::variant<Value, ValueProblem> typedValue(const TagPath& path, std::string_view text,
                                             const Value& old);

// Any value, as tag JSON.
std::variant<Value, ValueProblem> jsonValue(const TagPath& path, std::string_view json);

// Whether the tag is a list that can be appended to.
bool isAppendable(const TagPath& path) noexcept;

}  // namespace oxmv::cli
