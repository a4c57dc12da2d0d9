// Measures the codecs side by side and prints how they compare.
//
//   oxmv_bench [REPORT] [--benchmark_...]
//
// The comparison is also written to REPORT, by default report.json beside the program. Repetitions
// of all operations are interleaved in random order, so that a machine that is slow for a while is
// slow for everybody; each time is the median of its repetitions, in processor time.

#include <cstdio>
#include <exception>
#include <filesystem>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "CodecOurs.h"
#include "Corpus.h"
#include "Operation.h"
#include "Report.h"

namespace {

using namespace bench;

// Enough for a median that stays the same, in under three minutes.
constexpr int repetitions = 15;
constexpr double secondsEach = 0.04;

std::string nameOf(const Operation& operation) {
  return std::string(operation.what) + "/" + std::string(operation.corpus) + "/" +
         std::string(operation.by);
}

void registerAll() {
  for (Operation& operation : operations()) {
    benchmark::RegisterBenchmark(
        nameOf(operation).c_str(),
        [&operation, next = std::size_t{0}](benchmark::State& state) mutable {
          // The next repetition goes on where this one ends, so that all clips have their turn.
          const std::size_t batch = operation.clips / 8;
          while (state.KeepRunningBatch(static_cast<benchmark::IterationCount>(batch))) {
            operation.run(next, batch);
            next = (next + batch) % operation.clips;
          }
        })
        ->MinTime(secondsEach)
        ->Repetitions(repetitions);
  }
}

class Collector : public benchmark::BenchmarkReporter {
 public:
  bool ReportContext(const Context& context) override {
    PrintBasicContext(&GetErrorStream(), context);
    return true;
  }

  void ReportRuns(const std::vector<Run>& runs) override {
    std::map<std::string, std::vector<double>> samples;
    for (const Run& run : runs) {
      if (run.run_type == Run::RT_Iteration)
        samples[run.run_name.function_name].push_back(run.GetAdjustedCPUTime());
    }
    for (const Operation& operation : operations()) {
      const auto found = samples.find(nameOf(operation));
      if (found != samples.end()) times_[&operation] = medianOf(found->second);
    }
  }

  const Times& times() const { return times_; }

 private:
  Times times_;
};

void printCorpora() {
  for (const Corpus& corpus : corpora()) {
    std::printf("%-8.*s %5zu clips of %.0f bytes\n", static_cast<int>(corpus.name.size()),
                corpus.name.data(), corpus.clips.size(), corpus.meanStreamSize);
  }
}

void addAll() {
  addOurs();
  addMsgpack();
  addNlohmann();
  addProtobuf();
  addRapidJson();
  addSimdjson();
  addFloors();
}

int run(int argc, char** argv) {
  std::string interleaved = "--benchmark_enable_random_interleaving=true";
  std::vector<char*> arguments(argv, argv + argc);
  arguments.insert(arguments.begin() + 1, interleaved.data());
  int count = static_cast<int>(arguments.size());
  arguments.push_back(nullptr);
  benchmark::Initialize(&count, arguments.data());
  std::filesystem::path report = std::filesystem::path(argv[0]).parent_path() / "report.json";
  if (count == 2 && arguments[1][0] != '-') {
    report = arguments[1];
  } else if (benchmark::ReportUnrecognizedArguments(count, arguments.data())) {
    return 2;
  }

  printCorpora();
  addAll();
  for (const auto& check : checks()) check();
  registerAll();
  Collector collector;
  benchmark::RunSpecifiedBenchmarks(&collector);

  const std::vector<Line> lines = linesOf(operations(), collector.times());
  printPeers(operations(), collector.times());
  printLines(lines);
  writeJson(report, lines);
  std::printf("\nwritten to %s\n", report.c_str());
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return run(argc, argv);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "oxmv_bench: %s\n", error.what());
    return 1;
  }
}
