// A clip's 128-bit identifier.

#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace oxmv {

// Data1 is as wide as the platform's unsigned long, so the structure takes 24 bytes in a 64-bit
// build (4 of them padding at its end) and 16 in a 32-bit build. Streams and files carry exactly
// that image, little-endian.
struct myGUID {
  unsigned long Data1 = 0;
  std::uint16_t Data2 = 0;
  std::uint16_t Data3 = 0;
  std::array<std::uint8_t, 8> Data4{};

  bool operator==(const myGUID&) const = default;
};

// Lays the leading bytes of `image` over `guid`'s little-endian image, at most as many as the
// structure takes; fields and parts of fields behind them keep what they held.
void copyOverImage(myGUID& guid, std::span<const std::uint8_t> image) noexcept;

// "00112233-4455-6677-8899-AABBCCDDEEFF": upper case; Data1 by its low 32 bits.
std::string guidText(const myGUID& guid);

// The GUID that such a text names; its digits may be of either case. Nothing for any other text.
std::optional<myGUID> guidFromText(std::string_view text) noexcept;

}  // namespace oxmv
