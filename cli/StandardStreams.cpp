#include "cli/StandardStreams.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstddef>
#include <utility>

#include <fcntl.h>
#include <unistd.h>

#include "oxmv/platform/WholeFile.h"

namespace oxmv::cli {
namespace {

// Whether a status line is on the terminal.
bool isStatusShown = false;

constexpr std::size_t worthAWrite = std::size_t{64} * 1024;

// Answers the cause when not all of it could be written.
std::error_code writeAll(int descriptor, std::string_view text) noexcept {
  while (!text.empty()) {
    const ssize_t count = ::write(descriptor, text.data(), text.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return {errno, std::generic_category()};
    text.remove_prefix(static_cast<std::size_t>(count));
  }
  return {};
}

}  // namespace

void StandardOutput::write(std::string_view text) {
  waiting_ += text;
  if (waiting_.size() >= worthAWrite) flush();
}

void StandardOutput::flush() {
  if (!waiting_.empty()) showStatus({});
  const std::error_code error = writeAll(STDOUT_FILENO, waiting_);
  waiting_.clear();
  if (error) throw OutputFailed{error};
}

bool StandardOutput::isTerminal() noexcept { return ::isatty(STDOUT_FILENO) == 1; }

std::optional<std::vector<std::uint8_t>> readStandardInput(std::error_code& error) {
  error.clear();
  std::vector<std::uint8_t> content;
  std::size_t size = 0;
  for (;;) {
    if (size == content.size())
      content.resize(std::min(std::max(2 * size, worthAWrite), maxFileSize + 1));
    const ssize_t count = ::read(STDIN_FILENO, content.data() + size, content.size() - size);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return error = {errno, std::generic_category()}, std::nullopt;
    if (count == 0) break;
    size += static_cast<std::size_t>(count);
    if (size > maxFileSize) return error = FileError::tooLarge, std::nullopt;
  }
  content.resize(size);
  return content;
}

void writeStandardError(std::string_view text) noexcept {
  showStatus({});
  writeAll(STDERR_FILENO, text);
}

void showStatus(std::string_view line) noexcept {
  constexpr std::string_view backAndErased = "\r\x1B[K";
  if (std::exchange(isStatusShown, !line.empty())) writeAll(STDERR_FILENO, backAndErased);
  writeAll(STDERR_FILENO, line);
}

bool isStandardErrorTerminal() noexcept { return ::isatty(STDERR_FILENO) == 1; }

void prepareStandardStreams() noexcept {
  std::signal(SIGPIPE, SIG_IGN);
  std::signal(SIGXFSZ, SIG_IGN);  // a file over the user's limit is an error like any other
  for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (::fcntl(descriptor, F_GETFD) >= 0) continue;
    // Takes the lowest number that is free, which is this one. The wrong way round, so that using
    // it fails as using a closed one would.
    const int mode = descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY;
    if (::open("/dev/null", mode) < 0) return;
  }
}

}  // namespace oxmv::cli
