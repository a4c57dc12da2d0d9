#include "oxmv/host/StandardError.h"

#include <cerrno>
#include <csignal>
#include <ctime>
#include <mutex>
#include <string>

#include <pthread.h>
#include <unistd.h>

#include "oxmv/values/Characters.h"

namespace oxmv {
namespace {

// A pipe without a reader answers with a signal that ends the process. While this lives, this
// thread gets none from what it writes.
class WithoutPipeSignal {
 public:
  WithoutPipeSignal() {
    sigset_t pending;
    sigemptyset(&pending_);
    sigaddset(&pending_, SIGPIPE);
    ::sigpending(&pending);
    wasPending_ = sigismember(&pending, SIGPIPE) == 1;
    ::pthread_sigmask(SIG_BLOCK, &pending_, &before_);
  }
  ~WithoutPipeSignal() {
    if (isOurs_ && !wasPending_) {
      const timespec atOnce = {};
      while (::sigtimedwait(&pending_, nullptr, &atOnce) < 0 && errno == EINTR) continue;
    }
    ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
  }
  WithoutPipeSignal(const WithoutPipeSignal&) = delete;
  WithoutPipeSignal& operator=(const WithoutPipeSignal&) = delete;

  // What was written has met no reader.
  void hasCome() { isOurs_ = true; }

 private:
  sigset_t pending_ = {};
  sigset_t before_ = {};
  bool wasPending_ = false;
  bool isOurs_ = false;
};

}  // namespace

void writeToStandardError(std::string_view line) {
  const std::string shown = visible(line) + '\n';
  // One write is one piece to the system only while it is short.
  static std::mutex guard;
  const std::scoped_lock lock(guard);
  WithoutPipeSignal signal;
  std::string_view rest = shown;
  while (!rest.empty()) {
    const ssize_t count = ::write(STDERR_FILENO, rest.data(), rest.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0 && errno == EPIPE) signal.hasCome();
    if (count <= 0) return;
    rest.remove_prefix(static_cast<std::size_t>(count));
  }
}

}  // namespace oxmv
