// Measures looks and the database, each beside what the system takes and beside others.
//
//   oxmv_bench_files [REPORT]     also adds the results to REPORT

#include "FilesBench.h"

#include <cstdio>
#include <exception>

int main(int argc, char** argv) {
  try {
    std::vector<bench::Line> lines = bench::measureLooks();
    for (bench::Line& line : bench::measureScan()) lines.push_back(std::move(line));
    bench::printLines(lines);
    if (argc > 1) bench::addJson(argv[1], lines);
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "oxmv_bench_files: %s\n", error.what());
    return 1;
  }
}
