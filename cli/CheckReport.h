// What the verbs report that look for what is wrong with files: check, look lint, look check.
// Lines, or JSON with --json and --ndjson; exit code 1 when something was found.

#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/JsonWriter.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"

namespace oxmv::cli {

class CheckReport {
 public:
  CheckReport(Call& call, std::string_view schema)
      : call_(call), schema_(schema), isJson_(wantsJson(call)), results_(call) {}

  // A file that could not be read.
  void addProblem(const std::string& name, const FileProblem& problem) {
    call_.messages.error(name, problem.message, problem.code);
    if (!isJson_) return;
    results_.add([&](JsonWriter& json) {
      beginResult(json, schema_, name);
      json.key("findings");
      json.null();
      endResult(json, &problem);
    });
  }

  // What was found in a file. `line` gives a finding's line without its end, `write` writes its
  // object.
  template <class Finding, class Line, class Write>
  void add(const std::string& name, const std::vector<Finding>& findings, Line line, Write write) {
    if (!findings.empty()) call_.messages.raise(Outcome::no);
    if (isJson_) {
      results_.add([&](JsonWriter& json) {
        beginResult(json, schema_, name);
        json.key("findings");
        json.beginArray();
        for (const Finding& finding : findings) write(json, finding);
        json.endArray();
        endResult(json, nullptr);
      });
    } else {
      for (const Finding& finding : findings) call_.output.write(line(finding) + '\n');
    }
    call_.messages.note(name, counted(findings.size(), "finding"));
  }

  // To be called behind the last file.
  void finish() {
    if (isJson_) results_.finish();
  }

 private:
  Call& call_;
  const std::string_view schema_;
  const bool isJson_;
  JsonResults results_;
};

}  // namespace oxmv::cli
