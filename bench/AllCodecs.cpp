#include "Operation.h"

namespace bench {

void addAll() {
  addOurs();
  addMsgpack();
  addNlohmann();
  addProtobuf();
  addRapidJson();
  addSimdjson();
  addFloors();
}

}  // namespace bench
