// What the measurements come to: each operation's time against the fastest comparable peer's, the
// aim we have set ourselves, and the floor that nobody gets below.

#pragma once

#include <filesystem>
#include <map>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "Operation.h"

namespace bench {

// One line of the table.
struct Line {
  std::string name;           // "decode typical"
  double ours = 0;            // ns a clip; of other things ns for all of it
  double bestPeer = 0;        // of the fastest comparable one, likewise; 0: nobody else does it
  std::string peerName = {};  // its name
  double aim = 0;             // the ratio we aim at; 0: none
  double floor = 0;           // likewise; 0: none
  double floorAim = 0;        // the part of the floor's speed we aim at; 0: none

  double ratio() const { return bestPeer / ours; }
  double overFloor() const { return ours / floor; }
  double partOfFloor() const { return floor / ours; }
};

// Times in ns, each the median of its repetitions, by operation. Operations without a time are left
// out.
using Times = std::map<const Operation*, double>;

double medianOf(std::vector<double> values);

std::vector<Line> linesOf(std::span<const Operation> operations, const Times& times);

void printLines(std::span<const Line> lines);

// Every library's time as a multiple of ours.
void printPeers(std::span<const Operation> operations, const Times& times);

// One object a line. Throws std::runtime_error when the file cannot be written.
void writeJson(const std::filesystem::path& file, std::span<const Line> lines);

// The same behind what is there.
void addJson(const std::filesystem::path& file, std::span<const Line> lines);

}  // namespace bench
