// Where in a clip a value stands, as users name it.
//
//   REEL, "Reel name"        a tag
//   COL1/WBAL                a tag of the stream nested under COL1
//   TAG/ISO, "TAG /ISO"      an entry of the group "TAG "; behind the '/' stands its name

#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

struct TagPath {
  std::vector<std::string> keys;  // from the clip's own dictionary inwards
  const TagRow* row;              // of the last tag among them
  bool isEntry;                   // the last key is a name in that tag's group

  // "COL1/WBAL"
  std::string text() const;
};

// Throws UsageError, with the nearest tags in it, for a name that is no tag, and for a tag that
// holds no others and has one behind it.
TagPath tagPathFrom(std::string_view typed);

// What stands there; nothing if nothing does. Names in the group "REG " end with NULs that nobody
// types.
Value valueAt(const Dictionary& tags, const TagPath& path);

// The dictionary in which nothing but that value stands, there.
Dictionary holding(const Value& value, const TagPath& path);

bool isGroup(const TagRow& row) noexcept;

}  // namespace oxmv::cli
