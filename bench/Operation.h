// What is measured, as the programs that measure it see it: a name and a function that does it many
// times.
//
//   decode    a document to a dictionary that owns what it holds and can be edited, and drops it
//   read      the same, and every key and value is read before
//   encode    a dictionary to a document
//   edit      decode, replace WBAL, encode
//   look-up   eight look-ups by tag

#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace bench {

enum class What { decode, read, encode, edit, lookUp };
inline constexpr What everything[] = {What::decode, What::read, What::encode, What::edit,
                                      What::lookUp};

constexpr std::string_view nameOf(What what) {
  switch (what) {
    case What::decode: return "decode";
    case What::read: return "read";
    case What::encode: return "encode";
    case What::edit: return "edit";
    case What::lookUp: return "look-up";
  }
  return {};
}

inline constexpr std::string_view ours = "oxmv";
inline constexpr std::string_view copyFloor = "copy";
inline constexpr std::string_view walkFloor = "walk";

struct Operation {
  std::string_view corpus;
  std::string_view what;
  std::string_view by;  // ours, a peer or a floor
  bool comparable;      // owns its content and can be edited, as ours
  std::size_t clips;    // in the corpus
  // Does it to `count` clips, beginning with clip `first` and going round.
  std::function<void(std::size_t first, std::size_t count)> run;
};

// Every operation of every codec on every corpus; the documents are made when one first needs them.
std::vector<Operation>& operations();

// Checks of the codecs themselves, each to be run once: that they read the same content as ours
// from every document, from one that they encoded, and from one that they edited. Throw
// std::logic_error.
std::vector<std::function<void()>>& checks();

// Adds the operations and checks of all codecs: ours, the peers and the floors. Each of these has a
// file of its own.
void addAll();
void addOurs();
void addMsgpack();
void addNlohmann();
void addProtobuf();
void addRapidJson();
void addSimdjson();
void addFloors();

}  // namespace bench
