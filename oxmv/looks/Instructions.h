// Which machine instructions the loops over look tables use.

#pragma once

namespace oxmv {

// `vector` needs AVX2 and PCLMULQDQ. Where they are missing it works like `portable`, so that
// either may be asked for on every machine; the results are the same.
enum class Instructions { portable, vector };

// The faster kind that this machine has. Looked up once.
Instructions bestInstructions() noexcept;

}  // namespace oxmv
