// What a dictionary would lose on its way through a stream.

#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv {

// The ways in which a stream cannot carry what a dictionary holds.
enum class LossCode : std::uint8_t {
  unknownTag,      // no rule writes the tag
  noDecoder,       // written, and read by nobody
  badKey,          // a key that is not four ASCII characters
  textNonAscii,    // written as zeros
  textLong,        // cut
  textEmpty,       // not written
  textNul,         // ends at a NUL inside it, or loses those at its end
  listPads,        // a text of a list gains NULs
  listEmpty,       // a list without elements leaves no record
  listCount,       // a list of floats with the wrong number of them
  intRange,        // an integer that its record has too few bits for
  intArray,        // all elements are written into one word
  floatPrecision,  // a double becomes a float
  wrongKind,       // a value of a kind that the tag does not carry
  dataUnaligned,   // what follows is misread, for it is not a multiple of 4 bytes
  size16bit,       // its size keeps 16 bits
  size24bit,       // larger than any record that readers step over
  guidLength,      // not of 16 bytes
  regText,         // a text in the group "REG " is written as a name
  nameGrows,       // a name in the group "REG " gains NULs, more with each save
  pairAdded,       // the other one of a pair comes into being
  ctlpData,        // the two integers of a control point are not two integers
  emptyNested,     // a dictionary without entries leaves no record
  tooDeep,         // nested deeper than streams are read
  shortStream,     // all together take fewer bytes than a stream must have
  notReadBack,     // none of the above: comes back changed
};

// The stable code: "text-nonascii". Scripts rely on it; never renamed.
std::string_view codeOf(LossCode code) noexcept;

// The loss of that code; none for a text that is no code.
std::optional<LossCode> lossCodeOf(std::string_view code) noexcept;

struct Loss {
  LossCode code;
  // Where: "REEL", "COL1/WBAL", "KWRd[3]", "TAG /ISO". For pairAdded the key that is added; for
  // losses that damage what follows (dataUnaligned, size16bit, guidLength, and size24bit where the
  // layout `exact` writes it all the same) the entry that does the damage.
  std::string path;
  // What would happen; reads on behind the path: `"Café" would be written as zeros`.
  std::string message;
  // The layout in which this would not happen; none if it happens in both.
  std::optional<Layout> avoidedBy;
};

// Every way in which saving `tags` as a stream of this layout and loading it again would not give
// the same dictionary. Empty exactly when it would; that costs one encoding, one decoding and one
// comparison. Throws std::bad_alloc only, also when there is no memory to encode.
//
// Found by doing it: what comes back is compared, and each difference explained from the tag table.
std::vector<Loss> findLosses(const Dictionary& tags, Layout layout);

}  // namespace oxmv
