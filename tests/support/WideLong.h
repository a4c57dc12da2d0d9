// The image of a GUID differs with the width of unsigned long.

#pragma once

#include <cstdint>

namespace oxmv::test {

// Most tests write down the image of a 64-bit build, and are skipped in others.
constexpr bool is64Bit = sizeof(unsigned long) == 8;

// So that they compile there, too.
constexpr unsigned long wide(std::uint64_t number) { return static_cast<unsigned long>(number); }

}  // namespace oxmv::test
