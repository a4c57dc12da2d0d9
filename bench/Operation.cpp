#include "Operation.h"

namespace bench {

std::vector<Operation>& operations() {
  static std::vector<Operation> all;
  return all;
}

std::vector<std::function<void()>>& checks() {
  static std::vector<std::function<void()>> all;
  return all;
}

}  // namespace bench
