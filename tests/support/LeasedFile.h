// A file that another process holds a lease on.

#pragma once

#include <csignal>
#include <filesystem>

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace oxmv::test {

// The process has the file for itself, and gives it back when it is asked to.
class LeasedFile {
 public:
  explicit LeasedFile(const std::filesystem::path& path) {
    int ready[2] = {};
    if (::pipe(ready) != 0) return;
    child_ = ::fork();
    if (child_ == 0) {
      ::close(ready[0]);
      hold(path.c_str(), ready[1]);
    }
    ::close(ready[1]);
    char answer = 'n';
    isHeld_ = ::read(ready[0], &answer, 1) == 1 && answer == 'y';
    ::close(ready[0]);
  }
  LeasedFile(const LeasedFile&) = delete;
  LeasedFile& operator=(const LeasedFile&) = delete;
  ~LeasedFile() {
    if (child_ <= 0) return;
    ::kill(child_, SIGKILL);
    ::waitpid(child_, nullptr, 0);
  }

  // Some file systems have no leases, and only its owner may hold one on a file.
  bool isHeld() const { return isHeld_; }

 private:
  [[noreturn]] static void hold(const char* path, int ready) {
    sigset_t asked;
    ::sigemptyset(&asked);
    ::sigaddset(&asked, SIGIO);
    ::sigprocmask(SIG_BLOCK, &asked, nullptr);
    const int file = ::open(path, O_RDWR | O_CLOEXEC);
    const bool isHeld = file >= 0 && ::fcntl(file, F_SETLEASE, F_WRLCK) == 0;
    const bool isTold = ::write(ready, isHeld ? "y" : "n", 1) == 1;
    int signal = 0;
    if (isHeld && isTold && ::sigwait(&asked, &signal) == 0) ::fcntl(file, F_SETLEASE, F_UNLCK);
    ::_exit(0);
  }

  pid_t child_ = -1;
  bool isHeld_ = false;
};

}  // namespace oxmv::test
