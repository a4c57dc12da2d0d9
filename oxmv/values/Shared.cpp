#include "oxmv/values/Shared.h"

namespace oxmv::detail {

void Shared::destroy() const noexcept {
  thread_local const Shared* doomed = nullptr;  // a chain of those that wait
  thread_local bool deleting = false;
  nextDoomed_ = std::exchange(doomed, this);
  if (deleting) return;  // the loop below, further up the stack, comes to it
  deleting = true;
  while (doomed != nullptr) {
    const Shared* current = std::exchange(doomed, doomed->nextDoomed_);
    delete current;
  }
  deleting = false;
}

}  // namespace oxmv::detail
