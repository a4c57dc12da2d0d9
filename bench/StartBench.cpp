// What starting the command costs, against a program that does nothing and, where they are
// installed, commands of the same trade.
//
//   oxmv_bench_start OXMV EMPTY [REPORT]      the command and the empty program
//
// Each is asked for its version, in turn, many times. Printed are medians: processor time of the
// process, user and system, and its largest resident memory. The comparison is also added to
// REPORT.

#include <cstddef>
#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>

#include "Report.h"

extern char** environ;

namespace {

constexpr int rounds = 100;
constexpr double aim = 0.5;  // of exiv2's time

struct Program {
  std::string name;
  std::vector<std::string> command;
  std::vector<double> milliseconds = {};
  std::vector<double> mebibytes = {};
};

double millisecondsOf(const timeval& time) {
  return static_cast<double>(time.tv_sec) * 1e3 + static_cast<double>(time.tv_usec) / 1e3;
}

// Runs it once, silently. Answers whether it could be started and ended well.
bool run(Program& program) {
  std::vector<char*> arguments;
  for (std::string& argument : program.command) arguments.push_back(argument.data());
  arguments.push_back(nullptr);

  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 2, "/dev/null", O_WRONLY, 0);
  pid_t child = 0;
  const int error =
      posix_spawnp(&child, arguments[0], &actions, nullptr, arguments.data(), environ);
  posix_spawn_file_actions_destroy(&actions);
  if (error != 0) return false;

  int status = 0;
  rusage used{};
  if (wait4(child, &status, 0, &used) != child || !WIFEXITED(status) || WEXITSTATUS(status) != 0)
    return false;
  program.milliseconds.push_back(millisecondsOf(used.ru_utime) + millisecondsOf(used.ru_stime));
  program.mebibytes.push_back(static_cast<double>(used.ru_maxrss) / 1024);  // ru_maxrss is in KiB
  return true;
}

// The line has the fastest of the same trade, and the empty program as its floor.
bool addToReport(const char* report, const std::vector<Program>& programs) {
  const auto nanoseconds = [](const Program& program) {
    return bench::medianOf(program.milliseconds) * 1e6;
  };
  bench::Line line{
      .name = "start", .ours = nanoseconds(programs[0]), .floor = nanoseconds(programs[1])};
  for (std::size_t i = 2; i < programs.size(); ++i) {
    const double time = nanoseconds(programs[i]);
    if (line.bestPeer > 0 && time >= line.bestPeer) continue;
    line.bestPeer = time;
    line.peerName = programs[i].name;
  }
  if (line.peerName == "exiv2") line.aim = 1 / aim;
  try {
    bench::addJson(report, {&line, 1});
    return true;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "oxmv_bench_start: %s\n", error.what());
    return false;
  }
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3 && argc != 4) {
    std::fprintf(stderr, "usage: oxmv_bench_start OXMV EMPTY [REPORT]\n");
    return 2;
  }
  std::vector<Program> programs = {{"oxmv", {argv[1], "version"}},
                                   {"an empty program", {argv[2]}},
                                   {"exiv2", {"exiv2", "--version"}},
                                   {"exiftool", {"exiftool", "-ver"}}};
  // The first run also tells which are there, and brings them into memory.
  for (std::size_t i = programs.size(); i-- > 0;) {
    if (run(programs[i])) continue;
    std::fprintf(stderr, "oxmv_bench_start: cannot run %s%s\n", programs[i].name.c_str(),
                 i < 2 ? "" : ": left out");
    if (i < 2) return 1;
    programs.erase(programs.begin() + static_cast<std::ptrdiff_t>(i));
  }
  for (int round = 0; round < rounds; ++round) {
    for (Program& program : programs) {
      if (!run(program)) {
        std::fprintf(stderr, "oxmv_bench_start: %s failed\n", program.name.c_str());
        return 1;
      }
    }
  }

  std::printf("start of a command, medians of %d\n", rounds);
  const double own = bench::medianOf(programs[0].milliseconds);
  for (const Program& program : programs) {
    const double time = bench::medianOf(program.milliseconds);
    std::printf("  %-18s %8.2f ms %8.1f MiB", program.name.c_str(), time,
                bench::medianOf(program.mebibytes));
    if (&program != programs.data()) std::printf("   oxmv takes %.2f of it", own / time);
    if (program.name == "exiv2")
      std::printf(", aim %.1f, %s", aim, own / time <= aim ? "met" : "NOT");
    std::printf("\n");
  }
  return argc == 3 || addToReport(argv[3], programs) ? 0 : 1;
}
