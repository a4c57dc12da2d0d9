// Whether a loss that is named really happens: found out by saving and loading.

#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Numbers.h"

namespace oxmv::test {

// What a stream of these tags decodes to, however short it is.
inline Dictionary reread(const Dictionary& tags, Layout layout) {
  const auto stream = encodeStream(tags, layout).value();
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

// What there is after saving and loading.
inline Dictionary comesBack(const Dictionary& tags, Layout layout) {
  const bool isShort = encodeStream(tags, layout).value().size() < shortestData;
  return isShort ? Dictionary() : reread(tags, layout);
}

inline bool differAt(const Dictionary& a, const Dictionary& b, std::string_view path);

// What `path` names within the values, or the values themselves where it is at its end.
inline bool differBehind(const Value& a, const Value& b, std::string_view path) {
  if (path.empty()) return a != b;
  if (path.front() == '/') return differAt(a.dictionary(), b.dictionary(), path.substr(1));
  const std::size_t end = path.find(']');
  if (path.front() != '[' || end == std::string_view::npos) return false;
  const auto index = static_cast<std::size_t>(leadingInteger(path.substr(1, end - 1)));
  const auto element = [&](const Array& array) {
    return index < array.size() ? array[index] : Value();
  };
  return differBehind(element(a.array()), element(b.array()), path.substr(end + 1));
}

// Whether the two have different values at a loss's path. Keys may hold '/' and '[': every way of
// reading the path counts.
inline bool differAt(const Dictionary& a, const Dictionary& b, std::string_view path) {
  for (const Dictionary* keys : {&a, &b}) {
    for (const auto& [key, value] : *keys) {
      if (path.starts_with(key) && differBehind(a[key], b[key], path.substr(key.size())))
        return true;
    }
  }
  return false;
}

// The losses that make a reader misread what follows the entry that they name.
inline bool isDamage(const Loss& loss) {
  return loss.code == LossCode::dataUnaligned || loss.code == LossCode::size16bit ||
         loss.code == LossCode::guidLength;
}

// The outermost tag of such a loss.
inline std::string_view damagingTag(std::string_view path) { return path.substr(0, 4); }

// Whether that entry, or something that is written behind it, comes back differently.
inline bool damages(const Dictionary& tags, std::string_view path, Layout layout) {
  const std::string_view key = damagingTag(path);
  const Dictionary back = reread(tags, layout);
  if (back[key] != tags[key]) return true;
  Dictionary without = tags;
  without.remove(key);
  Dictionary backWithout = back;
  backWithout.remove(key);
  return reread(without, layout) != backWithout;
}

// What is left when everything is taken out that makes a reader misread what follows it, but one.
inline Dictionary withoutDamage(Dictionary tags, const std::vector<Loss>& losses,
                                std::string_view keptTag = {}) {
  for (const Loss& loss : losses) {
    if (isDamage(loss) && damagingTag(loss.path) != keptTag) tags.remove(damagingTag(loss.path));
  }
  return tags;
}

// The same, also where others damage those entries anyway: then it shows without the others.
inline bool damagesByItself(const Dictionary& tags, std::string_view path, Layout layout) {
  if (damages(tags, path, layout)) return true;
  const auto losses = findLosses(tags, layout);
  return damages(withoutDamage(tags, losses, damagingTag(path)), path, layout);
}

// What a path's first part names, on its own: of "DSPm[1]/REEL" a list DSPm that has the second
// element only, and "DSPm[0]/REEL".
struct SingledOut {
  Dictionary tags;
  std::string path;
};

inline SingledOut singledOut(const Dictionary& tags, std::string_view path) {
  const std::string_view key = path.substr(0, 4);
  const std::size_t end = path.find(']');
  if (path.size() < 5 || path[4] != '[' || end == std::string_view::npos)
    return {{{key, tags[key]}}, std::string(path)};
  const auto index = static_cast<std::size_t>(leadingInteger(path.substr(5)));
  const Array array = tags[key].array();
  const Array element = index < array.size() ? Array::of(array[index]) : Array();
  return {{{key, element}}, std::string(key) + "[0" + std::string(path.substr(end))};
}

// The dictionary under the tag of what was singled out, or in its list.
inline Dictionary nestedIn(const SingledOut& single) {
  const Value value = single.tags[single.path.substr(0, 4)];
  const Array array = value.array();
  return array.empty() ? value.dictionary() : array[0].dictionary();
}

// Whether the path's value comes back differently: as part of the whole; or where others hide that,
// because they do damage or vanish from the front of a list, without those or on its own; or as
// part of the nested dictionary around it.
inline bool shows(const Dictionary& tags, std::string_view path, Layout layout) {
  if (differAt(tags, comesBack(tags, layout), path)) return true;
  const Dictionary undamaged = withoutDamage(tags, findLosses(tags, layout));
  if (differAt(undamaged, comesBack(undamaged, layout), path)) return true;
  const SingledOut single = singledOut(tags, path);
  if (differAt(single.tags, comesBack(single.tags, layout), single.path)) return true;
  const std::size_t slash = path.find('/');
  return slash != std::string_view::npos && shows(nestedIn(single), path.substr(slash + 1), layout);
}

inline bool isReal(const Loss& loss, const Dictionary& tags, Layout layout) {
  return isDamage(loss) ? damagesByItself(tags, loss.path, layout) : shows(tags, loss.path, layout);
}

}  // namespace oxmv::test
