// The image of a GUID differs with the width of unsigned long.

#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace oxmv::test {

// Most tests write down the image of a 64-bit build, and are skipped in others.
constexpr bool is64Bit = sizeof(unsigned long) == 8;

// So that they compile there, too.
constexpr unsigned long wide(std::uint64_t number) { return static_cast<unsigned long>(number); }

// The image of a GUID in this build. Data1 is given by its low four bytes; a longer one has four of 0
// behind them, and as many that pad the end.
inline std::string guidImage(std::string_view data1, std::string_view rest) {
  const std::string filling(sizeof(unsigned long) - data1.size(), '\0');
  return std::string(data1) + filling + std::string(rest) + filling;
}

}  // namespace oxmv::test
