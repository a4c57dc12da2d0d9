// Encoding: from a dictionary to a tag stream.

#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "oxmv/values/Dictionary.h"

namespace oxmv {

// How records are laid out.
enum class Layout : std::uint8_t {
  // As the format's writer has always done: raw data and nested streams without padding, their
  // sizes by the low 16 bits, a GUID's size always 16. What is not a multiple of 4, or longer than
  // 65535 bytes, does not read back.
  exact,
  // True sizes, every record padded to 4 and none longer than readers step over: all of them find
  // what follows it. The same as `exact` for dictionaries whose data are short and come in
  // multiples of 4, and GUIDs of 16 bytes.
  readable,
};

// Encodes a dictionary: PRCS, UFRM and TIMC first, then the other tags in the dictionary's order,
// then COL1, COL2, the pairs DTIN DTDR and DTFI DTFO, and CTLp. An empty dictionary gives an empty
// stream.
//
// Never fails over a value. A key that is no tag of four characters, or that the encoder has no
// rule for, is dropped; so are a value of the wrong kind, a list of the wrong count, a record that
// is too large, and streams nested deeper than maxNesting. Too large is a payload of more than
// maxRecordSize bytes, and in the layout `readable` one of more than longestRecord: no reader would
// step over it, for its length wraps. Text is written in ASCII and at most 255 characters long;
// a text with another character among those is written as zeros.
//
// Answers nothing when there is no memory for the stream: half a dictionary never takes the place
// of a whole one.
std::optional<std::vector<std::uint8_t>> encodeStream(const Dictionary& tags,
                                                      Layout layout = Layout::exact) noexcept;

}  // namespace oxmv
