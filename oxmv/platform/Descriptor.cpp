#include "oxmv/platform/Descriptor.h"

#include <algorithm>
#include <cerrno>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "oxmv/platform/WholeFile.h"

namespace oxmv {

Descriptor::~Descriptor() {
  if (isOpen()) ::close(number_);
}

bool Descriptor::close() { return ::close(std::exchange(number_, -1)) == 0; }

Descriptor openToRead(const Descriptor* folder, const char* name) {
  constexpr int flags = O_RDONLY | O_CLOEXEC | O_NOCTTY;
  const int at = folder == nullptr ? AT_FDCWD : folder->number();
  // Non-blocking, so that a pipe without a writer answers at once. It means nothing to a regular
  // file, unless another process holds a lease on it: then the system asks for it back, and the
  // file can be opened after a while.
  const int number = ::openat(at, name, flags | O_NONBLOCK);
  if (number >= 0 || errno != EWOULDBLOCK) return Descriptor(number);
  struct stat status = {};
  if (::fstatat(at, name, &status, 0) == 0 && !S_ISREG(status.st_mode)) {
    errno = EWOULDBLOCK;
    return Descriptor(-1);
  }
  for (;;) {
    const int waited = ::openat(at, name, flags);
    if (waited >= 0 || errno != EINTR) return Descriptor(waited);
  }
}

std::error_code lastError() noexcept { return {errno, std::generic_category()}; }

std::error_code objectionToKind(const struct stat& status) noexcept {
  if (S_ISDIR(status.st_mode)) return make_error_code(std::errc::is_a_directory);
  if (!S_ISREG(status.st_mode)) return FileError::notRegular;
  return {};
}

std::optional<struct stat> regularStatus(const Descriptor& file, std::error_code& error) {
  struct stat status = {};
  if (::fstat(file.number(), &status) != 0) return error = lastError(), std::nullopt;
  if ((error = objectionToKind(status))) return std::nullopt;
  return status;
}

std::optional<std::uintmax_t> regularSize(const Descriptor& file, std::error_code& error) {
  const auto status = regularStatus(file, error);
  if (!status) return std::nullopt;
  return static_cast<std::uintmax_t>(status->st_size);
}

std::optional<std::size_t> readInto(std::span<std::uint8_t> content, const Descriptor& file,
                                    std::error_code& error) {
  std::size_t size = 0;
  while (size < content.size()) {
    const ssize_t count = ::read(file.number(), content.data() + size, content.size() - size);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return error = lastError(), std::nullopt;
    if (count == 0) break;
    size += static_cast<std::size_t>(count);
  }
  return size;
}

std::optional<std::size_t> readToEnd(std::vector<std::uint8_t>& buffer, std::size_t size,
                                     const Descriptor& file, std::error_code& error) {
  for (;;) {
    const auto count = readInto(std::span(buffer).subspan(size), file, error);
    if (!count) return std::nullopt;
    size += *count;
    if (size > maxFileSize) return error = FileError::tooLarge, std::nullopt;
    if (size < buffer.size()) return size;
    buffer.resize(std::min(std::max<std::size_t>(2 * size, 4096), maxFileSize + 1));
  }
}

}  // namespace oxmv
