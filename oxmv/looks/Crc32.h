// CRC-32, as ISO-HDLC and IEEE 802.3 define it: polynomial 0xEDB88320 (reflected), initial value
// and final exclusive-or 0xFFFFFFFF. The CRC of the nine ASCII digits 1 to 9 is 0xCBF43926.
// Look-table files are named by the CRC of their values.

#pragma once

#include <cstddef>
#include <cstdint>

#include "oxmv/looks/Instructions.h"

namespace oxmv {

// Makes the table of 256 entries, if it is not there. update_crc() does so by itself.
void make_crc_table() noexcept;

// The running CRC after `length` further bytes, which must be there; without initial value and
// final exclusive-or, so that a CRC can be taken piece by piece. A length below 1 changes nothing.
std::uint32_t update_crc(std::uint32_t crc, const std::uint8_t* bytes,
                         std::ptrdiff_t length) noexcept;

// The CRC of `length` bytes; 0 for a length below 1.
std::uint32_t calccrc(const std::uint8_t* bytes, std::ptrdiff_t length) noexcept;

// update_crc() with instructions of one's choice.
std::uint32_t update_crc(std::uint32_t crc, const std::uint8_t* bytes, std::ptrdiff_t length,
                         Instructions instructions) noexcept;

}  // namespace oxmv
