// How a fuzz target says what must hold.

#pragma once

#include <cstdlib>

namespace oxmv::fuzz {

// Ends the run where it does not: the fuzzer keeps the input.
inline void require(bool holds) {
  if (!holds) std::abort();
}

}  // namespace oxmv::fuzz
