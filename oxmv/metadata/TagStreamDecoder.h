// Decoding: from a tag stream to a dictionary.

#pragma once

#include <cstdint>
#include <span>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/myGUID.h"

namespace oxmv {

// Decodes the stream that starts at `bytes` and is `length` bytes long; a length of 0 or less gives
// an empty dictionary. `bytes` are those that are really there: there may be fewer than `length`
// (then decoding ends with them) or more (then a marker may reach them, and so may the first
// record, which is read whatever its size). Nothing outside `bytes` is read. At most the first 2^31
// - 1 bytes are looked at.
//
// The result owns a copy of `bytes`, and holds whatever could be read, possibly nothing; there is
// no error. Memory is linear in the size of `bytes`, and so is time but for the names of large
// groups, which are sorted; streams nested deeper than maxNesting are left out. Throws
// std::bad_alloc only (and what `observer` throws).
//
// A GUID record anywhere in the stream, nested streams included, is also laid over `guid` unless
// that is null: as many bytes as a myGUID takes, whatever the record's size, as far as there are
// bytes.
//
// `observer` may be null; it never changes the result.
Dictionary decodeStream(std::span<const std::uint8_t> bytes, std::int32_t length,
                        myGUID* guid = nullptr, StreamObserver* observer = nullptr);

}  // namespace oxmv
