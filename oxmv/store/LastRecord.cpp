#include "oxmv/store/LastRecord.h"

#include <array>
#include <new>
#include <span>

#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

constexpr std::size_t guidSize = sizeof(myGUID);

// Kept on purpose: this one file is opened by a name in ASCII.
bool canBeOpened(const std::string& path) { return isAscii(path); }

}  // namespace

LastRecord readLastRecord(const std::string& path, std::error_code& error) {
  LastRecord last;
  if (!canBeOpened(path)) {
    error = make_error_code(std::errc::no_such_file_or_directory);
    return last;
  }
  std::array<std::uint8_t, guidSize> record{};
  std::span<std::uint8_t> head = record;
  try {
    last.stream = readBehindHead(path, head, error);
  } catch (const std::bad_alloc&) {
    error = make_error_code(std::errc::not_enough_memory);
  }
  copyOverImage(last.guid, head);
  last.guidSize = head.size();
  return last;
}

myGUID readLastGUID(const std::string& path) {
  myGUID guid;
  if (!canBeOpened(path)) return guid;
  std::error_code ignored;  // a missing file counts as one of no bytes
  if (const auto start = readFileStart(path, guidSize, ignored)) copyOverImage(guid, *start);
  return guid;
}

}  // namespace oxmv
