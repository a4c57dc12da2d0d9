#include "tests/cli/CommandRunner.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <stdexcept>

#include <pty.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

namespace oxmv::cli::test {
namespace {

// A file without a name: never full, and gone with its descriptor.
class MemoryFile {
 public:
  MemoryFile() : descriptor_(::memfd_create("oxmv-test", MFD_CLOEXEC)) {
    if (descriptor_ < 0) throw std::runtime_error("no file in memory");
  }
  explicit MemoryFile(std::string_view content) : MemoryFile() {
    if (::write(descriptor_, content.data(), content.size()) !=
        static_cast<ssize_t>(content.size()))
      throw std::runtime_error("cannot write a file in memory");
    ::lseek(descriptor_, 0, SEEK_SET);
  }
  MemoryFile(const MemoryFile&) = delete;
  MemoryFile& operator=(const MemoryFile&) = delete;
  ~MemoryFile() { ::close(descriptor_); }

  int descriptor() const { return descriptor_; }
  std::string content() const {
    ::lseek(descriptor_, 0, SEEK_SET);
    std::string text;
    std::array<char, 65536> buffer{};
    for (ssize_t n = 0; (n = ::read(descriptor_, buffer.data(), buffer.size())) > 0;)
      text.append(buffer.data(), static_cast<std::size_t>(n));
    return text;
  }

 private:
  int descriptor_;
};

// Nothing of the user who runs the tests reaches the command, and it writes nowhere in their home.
void clearEnvironment() {
  for (const char* name : {"NO_COLOR", "OXMV_DB", "OXMV_LOOKS"}) ::unsetenv(name);
  for (const char* name : {"HOME", "XDG_CONFIG_HOME", "XDG_CONFIG_DIRS"})
    ::setenv(name, "/nonexistent", 1);
  ::setenv("OXMV", OXMV_COMMAND, 1);
}

[[noreturn]] void become(std::vector<std::string> words) {
  std::vector<char*> argv;
  for (std::string& word : words) argv.push_back(word.data());
  argv.push_back(nullptr);
  ::execv(argv[0], argv.data());
  ::_exit(127);
}

int exitCodeOf(pid_t child) {
  int status = 0;
  while (::waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

Outcome runWords(const std::vector<std::string>& words, std::string_view input,
                 const std::vector<std::string>& environment = {}) {
  const MemoryFile in(input);
  const MemoryFile out;
  const MemoryFile err;
  const pid_t child = ::fork();
  if (child == 0) {
    clearEnvironment();
    for (const std::string& variable : environment)
      ::setenv(variable.substr(0, variable.find('=')).c_str(),
               variable.substr(variable.find('=') + 1).c_str(), 1);
    ::dup2(in.descriptor(), STDIN_FILENO);
    ::dup2(out.descriptor(), STDOUT_FILENO);
    ::dup2(err.descriptor(), STDERR_FILENO);
    become(words);
  }
  const int exitCode = exitCodeOf(child);
  return {exitCode, out.content(), err.content()};
}

std::vector<std::string> commandWith(const std::vector<std::string>& arguments) {
  std::vector<std::string> words = {OXMV_COMMAND};
  words.insert(words.end(), arguments.begin(), arguments.end());
  return words;
}

}  // namespace

Outcome run(const std::vector<std::string>& arguments, std::string_view input) {
  return runWords(commandWith(arguments), input);
}

Outcome runWith(const std::vector<std::string>& environment,
                const std::vector<std::string>& arguments, std::string_view input) {
  return runWords(commandWith(arguments), input, environment);
}

Outcome runShell(const std::string& script) { return runWords({"/bin/sh", "-c", script}, {}); }

Outcome runOnTerminal(const std::vector<std::string>& arguments,
                      const std::vector<std::string>& environment) {
  int terminal = -1;
  const pid_t child = ::forkpty(&terminal, nullptr, nullptr, nullptr);
  if (child < 0) throw std::runtime_error("no terminal");
  if (child == 0) {
    clearEnvironment();
    std::vector<std::string> words = {"/usr/bin/env", "TERM=xterm"};
    words.insert(words.end(), environment.begin(), environment.end());
    for (const std::string& word : commandWith(arguments)) words.push_back(word);
    become(words);
  }
  Outcome outcome{};
  std::array<char, 4096> buffer{};
  // Reading from a terminal that nobody has open any more is an error, and the end.
  for (ssize_t n = 0; (n = ::read(terminal, buffer.data(), buffer.size())) > 0;) {
    for (const char c : std::string_view(buffer.data(), static_cast<std::size_t>(n))) {
      if (c != '\r') outcome.out += c;
    }
  }
  ::close(terminal);
  outcome.exitCode = exitCodeOf(child);
  return outcome;
}

void writeFile(const std::filesystem::path& path, std::string_view content) {
  std::ofstream(path, std::ios::binary)
      .write(content.data(), static_cast<std::streamsize>(content.size()));
}

void writeFile(const std::filesystem::path& path, const oxmv::test::Bytes& content) {
  writeFile(path, std::string_view(reinterpret_cast<const char*>(content.data()), content.size()));
}

std::string readFile(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  for (std::size_t at = 0; at < text.size();) {
    const std::size_t end = std::min(text.find('\n', at), text.size());
    lines.push_back(text.substr(at, end - at));
    at = end + 1;
  }
  return lines;
}

}  // namespace oxmv::cli::test
