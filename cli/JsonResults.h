// The results of a verb as JSON: an array, or one a line.

#pragma once

#include <string_view>

#include "cli/Inputs.h"
#include "cli/JsonWriter.h"
#include "cli/Verb.h"

namespace oxmv::cli {

// Whether the call asks for JSON, of either form.
bool wantsJson(const Call& call);

// Each result goes out before the next one is made.
class JsonResults {
 public:
  explicit JsonResults(Call& call)
      : output_(call.output), isLines_(call.arguments.has(Flag::ndjson)) {}

  // `write` gets a JsonWriter, and writes one value.
  template <class Write>
  void add(Write write) {
    begin();
    JsonWriter json(output_);
    write(json);
    end();
  }

  // One that is written already. On lines it goes out with flush().
  void add(std::string_view written);
  void flush();

  // To be called behind the last one.
  void finish();

 private:
  void begin();
  void end();

  StandardOutput& output_;
  bool isLines_;
  bool isFirst_ = true;
};

// The members that every object has: the first two, and the last one; null: no problem.
void beginResult(JsonWriter& json, std::string_view schema, std::string_view file);
void endResult(JsonWriter& json, const FileProblem* problem);

}  // namespace oxmv::cli
