#include "cli/TagPaths.h"

#include <fmt/format.h>

#include "cli/Flags.h"
#include "cli/TagNames.h"
#include "oxmv/metadata/Tag.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

std::string keyOf(const TagRow& row) {
  const auto characters = charactersOf(row.tag);
  return {characters.begin(), characters.end()};
}

Value entryOf(const Dictionary& group, std::string_view name, bool isReg) {
  if (!isReg || group.contains(name)) return group[name];
  for (const auto& [key, value] : group) {
    if (key.substr(0, key.find_last_not_of('\0') + 1) == name) return value;
  }
  return {};
}

}  // namespace

std::string TagPath::text() const { return fmt::format("{}", fmt::join(keys, "/")); }

TagPath tagPathFrom(std::string_view typed) {
  TagPath path{{}, nullptr, false};
  std::string_view rest = typed;
  for (;;) {
    const std::size_t slash = rest.find('/');
    path.row = &tagNamed(rest.substr(0, slash));
    path.keys.push_back(keyOf(*path.row));
    if (slash == std::string_view::npos) return path;
    rest.remove_prefix(slash + 1);
    if (isGroup(*path.row)) {
      path.keys.emplace_back(rest);
      path.isEntry = true;
      return path;
    }
    if (path.row->write != Write::nested)
      throw UsageError("bad-path", fmt::format("\"{}\": {} holds no other tags", visible(typed),
                                               visibleTag(path.row->tag)));
  }
}

Value valueAt(const Dictionary& tags, const TagPath& path) {
  Value value = tags;
  for (std::size_t i = 0; i < path.keys.size(); ++i) {
    const bool isName = path.isEntry && i + 1 == path.keys.size();
    const bool isReg = isName && path.row->write == Write::regGroup;
    value = entryOf(value.dictionary(), path.keys[i], isReg);
  }
  return value;
}

Dictionary holding(const Value& value, const TagPath& path) {
  Value outer = value;
  for (std::size_t i = path.keys.size(); i-- > 0;) outer = Dictionary{{path.keys[i], outer}};
  return outer.dictionary();
}

bool isGroup(const TagRow& row) noexcept {
  return row.write == Write::tagGroup || row.write == Write::regGroup;
}

}  // namespace oxmv::cli
