#include "oxmv/looks/Instructions.h"

namespace oxmv {

Instructions bestInstructions() noexcept {
#ifdef __x86_64__
  static const bool hasVector = __builtin_cpu_supports("avx2") && __builtin_cpu_supports("pclmul");
  return hasVector ? Instructions::vector : Instructions::portable;
#else
  return Instructions::portable;
#endif
}

}  // namespace oxmv
