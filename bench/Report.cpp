#include "Report.h"

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <stdexcept>

#include <nlohmann/json.hpp>

namespace bench {
namespace {

struct Aim {
  std::string_view what, corpus;
  double ratio;
};

constexpr Aim aims[] = {
    {"decode", "small", 3.0}, {"decode", "typical", 3.5}, {"decode", "large", 3.3},
    {"read", "small", 1.8},   {"read", "typical", 1.8},   {"read", "large", 1.8},
    {"encode", "small", 3.0}, {"encode", "typical", 2.5}, {"encode", "large", 3.0},
    {"edit", "small", 2.7},   {"edit", "typical", 2.7},   {"edit", "large", 2.7},
};

double aimOf(const Operation& operation) {
  for (const Aim& aim : aims) {
    if (aim.what == operation.what && aim.corpus == operation.corpus) return aim.ratio;
  }
  return 0;
}

class Timed {
 public:
  Timed(std::span<const Operation> operations, const Times& times)
      : operations_(operations), times_(times) {}

  // Null when it was not measured.
  const double* find(std::string_view what, std::string_view corpus, std::string_view by) const {
    for (const Operation& operation : operations_) {
      if (operation.what == what && operation.corpus == corpus && operation.by == by)
        return of(operation);
    }
    return nullptr;
  }

  const double* of(const Operation& operation) const {
    const auto found = times_.find(&operation);
    return found == times_.end() ? nullptr : &found->second;
  }

  // What an operation cannot do without: decoding owns a copy and has stepped over the records,
  // encoding hands out memory that it has filled.
  double floor(const Operation& operation) const {
    const double* copy = find("floor", operation.corpus, copyFloor);
    const double* walk = find("floor", operation.corpus, walkFloor);
    if (copy == nullptr || walk == nullptr) return 0;
    if (operation.what == nameOf(What::encode)) return *copy;
    if (operation.what == nameOf(What::edit)) return *copy + *walk + *copy;
    if (operation.what == nameOf(What::lookUp)) return 0;
    return *copy + *walk;
  }

 private:
  std::span<const Operation> operations_;
  const Times& times_;
};

}  // namespace

double medianOf(std::vector<double> values) {
  const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
  std::nth_element(values.begin(), middle, values.end());
  return *middle;
}

std::vector<Line> linesOf(std::span<const Operation> operations, const Times& times) {
  const Timed timed(operations, times);
  std::vector<Line> lines;
  for (const Operation& operation : operations) {
    const double* time = timed.of(operation);
    if (operation.by != ours || time == nullptr) continue;
    Line line{std::string(operation.what) + " " + std::string(operation.corpus),
              *time,
              0,
              {},
              aimOf(operation),
              timed.floor(operation)};
    for (const Operation& peer : operations) {
      const double* peerTime = timed.of(peer);
      const bool same = peer.what == operation.what && peer.corpus == operation.corpus;
      if (!same || peer.by == ours || !peer.comparable || peerTime == nullptr) continue;
      if (line.peerName.empty() || *peerTime < line.bestPeer) {
        line.bestPeer = *peerTime;
        line.peerName = peer.by;
      }
    }
    if (!line.peerName.empty()) lines.push_back(std::move(line));
  }
  return lines;
}

void printLines(std::span<const Line> lines) {
  const auto printAim = [](double aim, double reached) {
    if (aim > 0) {
      std::printf(" %5.4g %4s", aim, reached >= aim ? "met" : "NOT");
    } else {
      std::printf(" %5s %4s", "", "");
    }
  };
  std::printf("\n%-20s %10s %10s  %-20s %6s %5s %4s %10s %10s %5s\n", "", "oxmv ns", "peer ns",
              "fastest peer", "ratio", "aim", "", "floor ns", "over floor", "speed");
  for (const Line& line : lines) {
    std::printf("%-20s %10.0f", line.name.c_str(), line.ours);
    if (line.bestPeer > 0) {
      std::printf(" %10.0f  %-20s %6.2f", line.bestPeer, line.peerName.c_str(), line.ratio());
    } else {
      std::printf(" %10s  %-20s %6s", "", "", "");
    }
    printAim(line.aim, line.ratio());
    if (line.floor > 0) {
      std::printf(" %10.0f %10.2f %5.2f", line.floor, line.overFloor(), line.partOfFloor());
      printAim(line.floorAim, line.partOfFloor());
    }
    std::printf("\n");
  }
}

void printPeers(std::span<const Operation> operations, const Times& times) {
  const Timed timed(operations, times);
  std::printf("\nevery library's time as a multiple of ours (in brackets: not editable)\n");
  for (const Operation& operation : operations) {
    const double* time = timed.of(operation);
    const double* own = timed.find(operation.what, operation.corpus, ours);
    if (time == nullptr || own == nullptr || operation.by == ours) continue;
    const std::string by =
        operation.comparable ? std::string(operation.by) : "(" + std::string(operation.by) + ")";
    std::printf("  %-8.*s %-8.*s %-22s %7.2f\n", static_cast<int>(operation.what.size()),
                operation.what.data(), static_cast<int>(operation.corpus.size()),
                operation.corpus.data(), by.c_str(), *time / *own);
  }
}

namespace {

void putJson(const std::filesystem::path& file, std::ios::openmode mode,
             std::span<const Line> lines) {
  std::ofstream out(file, mode);
  for (const Line& line : lines) {
    nlohmann::ordered_json object = {{"name", line.name}, {"ours", line.ours}};
    if (line.bestPeer > 0) {
      object["best peer"] = line.bestPeer;
      object["its name"] = line.peerName;
      object["ratio"] = line.ratio();
    }
    if (line.floor > 0) {
      object["floor"] = line.floor;
      object["ratio to the floor"] = line.overFloor();
    }
    if (line.aim > 0) object["aim"] = line.aim;
    if (line.floorAim > 0) object["aim for the part of the floor's speed"] = line.floorAim;
    out << object.dump() << '\n';
  }
  out.flush();
  if (!out) throw std::runtime_error("cannot write " + file.string());
}

}  // namespace

void writeJson(const std::filesystem::path& file, std::span<const Line> lines) {
  putJson(file, std::ios::out, lines);
}

void addJson(const std::filesystem::path& file, std::span<const Line> lines) {
  putJson(file, std::ios::app, lines);
}

}  // namespace bench
