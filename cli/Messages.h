// What goes to standard error, and the exit code that comes of it.

#pragma once

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>

#include "cli/StandardStreams.h"
#include "cli/Style.h"

namespace oxmv::cli {

// Exit codes: scripts rely on them. In a batch the highest wins.
enum class Outcome : std::uint8_t {
  done = 0,
  no = 1,       // the answer is no
  usage = 2,    // nothing was touched
  failed = 3,   // an input or output failed; the others were done
  refused = 4,  // to protect data
  bug = 70,     // ours
};

// One message is one line: program, severity, file, what and where, the stable code in brackets.
//
//   oxmv: warning: a.colr: byte 40: ABCD: ignored, no such tag (unknown-tag)
//
// `file` is the name as the user wrote it, or empty; `what` must be visible text.
class Messages {
 public:
  Messages(StandardOutput& output, const Arguments& arguments)
      : output_(output),
        style_(styleFor(isStandardErrorTerminal(), arguments)),
        isQuiet_(arguments.has(Flag::quiet)),
        isVerbose_(arguments.has(Flag::verbose)),
        isStrict_(arguments.has(Flag::strict)) {}

  // Also raises the outcome to `failed`, unless another is given.
  void error(std::string_view file, std::string_view what, std::string_view code,
             Outcome outcome = Outcome::failed);
  // Also raises the outcome to `refused`. `aftermath` stands behind the code: what was not done,
  // and the way out.
  void refused(std::string_view file, std::string_view what, std::string_view code = {},
               std::string_view aftermath = {});
  // Not said when quiet; raises the outcome to `no` when strict.
  void warning(std::string_view file, std::string_view what, std::string_view code = {});
  // Said only when verbose.
  void note(std::string_view file, std::string_view what);

  void raise(Outcome outcome) { outcome_ = std::max(outcome_, outcome); }
  Outcome outcome() const { return outcome_; }

 private:
  void say(const std::string& severity, std::string_view file, std::string_view what,
           std::string_view code, std::string_view aftermath = {});

  StandardOutput& output_;
  Style style_;
  bool isQuiet_;
  bool isVerbose_;
  bool isStrict_;
  Outcome outcome_ = Outcome::done;
};

// What a message calls the file that the user named.
std::string nameInMessages(std::string_view file);

}  // namespace oxmv::cli
