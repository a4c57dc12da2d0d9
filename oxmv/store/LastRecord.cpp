#include "oxmv/store/LastRecord.h"

#include <cstddef>
#include <new>
#include <utility>

#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

constexpr std::size_t guidSize = sizeof(myGUID);

// Kept on purpose: this one file is opened by a name in ASCII.
bool canBeOpened(const std::string& path) { return isAscii(path); }

}  // namespace

std::optional<std::span<const std::uint8_t>> LastRecord::stream() const {
  if (content.size() < guidSize) return std::nullopt;
  return std::span(content).subspan(guidSize);
}

LastRecord readLastRecord(const std::string& path, std::error_code& error) try {
  if (!canBeOpened(path)) {
    error = make_error_code(std::errc::no_such_file_or_directory);
    return {};
  }
  auto content = readWholeFile(path, error);
  if (!content) return {error == FileError::tooLarge ? readLastGUID(path) : myGUID(), {}};
  LastRecord last{{}, *std::move(content)};
  copyOverImage(last.guid, last.content);
  return last;
} catch (const std::bad_alloc&) {
  error = make_error_code(std::errc::not_enough_memory);
  return {readLastGUID(path), {}};
}

myGUID readLastGUID(const std::string& path) {
  myGUID guid;
  if (!canBeOpened(path)) return guid;
  std::error_code ignored;  // a missing file counts as one of no bytes
  if (const auto start = readFileStart(path, guidSize, ignored)) copyOverImage(guid, *start);
  return guid;
}

}  // namespace oxmv
