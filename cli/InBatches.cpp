#include "cli/InBatches.h"

#include <sched.h>

namespace oxmv::cli {

bool haveTwoProcessors() noexcept {
  cpu_set_t ours;
  CPU_ZERO(&ours);
  // Fails where there are more than the set has room for.
  return ::sched_getaffinity(0, sizeof ours, &ours) != 0 || CPU_COUNT(&ours) > 1;
}

}  // namespace oxmv::cli
