#include "cli/JsonResults.h"

namespace oxmv::cli {

bool wantsJson(const Call& call) {
  return call.arguments.has(Flag::json) || call.arguments.has(Flag::ndjson);
}

void JsonResults::begin() {
  if (!isLines_) output_.write(isFirst_ ? "[\n" : ",\n");
  isFirst_ = false;
}

void JsonResults::end() {
  if (isLines_) output_.write("\n");
  flush();
}

void JsonResults::add(std::string_view written) {
  begin();
  output_.write(written);
  if (isLines_) output_.write("\n");
}

void JsonResults::flush() {
  if (isLines_) output_.flush();  // whoever reads line by line need not wait for the next one
}

void JsonResults::finish() {
  if (!isLines_) output_.write(isFirst_ ? "[]\n" : "\n]\n");
}

void beginResult(JsonWriter& json, std::string_view schema, std::string_view file) {
  json.beginObject();
  json.member("schema", schema);
  json.member("file", file);
}

void endResult(JsonWriter& json, const FileProblem* problem) {
  json.key("error");
  if (problem == nullptr) {
    json.null();
  } else {
    json.beginObject();
    json.member("code", problem->code);
    json.member("message", problem->message);
    json.endObject();
  }
  json.endObject();
}

}  // namespace oxmv::cli
