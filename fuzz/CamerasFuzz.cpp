// Any text as tables of cameras. What must hold for all of them:
//
// - there are tables, or words for what is wrong;
// - tables are of their shape: prefixes of 3 and 6 characters, firmware texts of 12.

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <variant>

#include "fuzz/Require.h"
#include "oxmv/import/CameraTables.h"

namespace {

using namespace oxmv;
using fuzz::require;

void check(const CameraTables& tables) {
  for (const auto& row : tables.shortPrefixes())
    require(row.prefix.size() == CameraTables::shortPrefix && !row.name.empty());
  for (const auto& row : tables.longPrefixes())
    require(row.prefix.size() == CameraTables::longPrefix && !row.name.empty());
  for (const auto& row : tables.modelTexts())
    require(row.firmware.size() == 12 && !row.text.empty() && !row.name.empty());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto read = CameraTables::fromText({reinterpret_cast<const char*>(data), size});
  if (const auto* problem = std::get_if<CameraTablesProblem>(&read)) {
    require(!problem->message.empty());
  } else {
    check(std::get<CameraTables>(read));
  }
  return 0;
}
