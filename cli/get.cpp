#include <algorithm>
#include <array>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Clips.h"
#include "cli/JsonResults.h"
#include "cli/TagJson.h"
#include "cli/TagPaths.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

struct Answer {
  TagPath path;
  Value value;  // nothing: it is not there
};

bool isListOfTexts(const Value& value) {
  const Array array = value.array();
  return !array.empty() && array[0].isText();
}

// The NULs at the end of a text only fill its record.
std::string withoutPadding(std::string_view text) {
  return std::string(text.substr(0, text.find_last_not_of('\0') + 1));
}

std::string bareLine(const Value& value) {
  if (value.kind() == Value::Kind::data)
    return fmt::format("{:02x}\n", fmt::join(value.data(), ""));
  return bare(value.isText() ? Value(withoutPadding(value.text())) : value) + '\n';
}

std::string rawLine(const Value& value) {
  if (value.isText()) return std::string(value.text()) + '\n';
  if (value.kind() != Value::Kind::data) return bareLine(value);
  return {value.data().begin(), value.data().end()};
}

// Whether a terminal may get it.
bool isVisible(const Value& value) {
  return value.kind() != Value::Kind::data && visible(value.text()) == value.text();
}

bool write(Call& call, const Value& value) {
  const bool isRaw = call.arguments.has(Flag::raw);
  if (isRaw && StandardOutput::isTerminal() && !isVisible(value)) {
    call.messages.refused("standard output", "the value is binary, and this is a terminal",
                          "binary-to-terminal");
    return false;
  }
  call.output.write(isRaw ? rawLine(value) : bareLine(value));
  return true;
}

void writeAnswer(Call& call, const Answer& answer) {
  if (!isListOfTexts(answer.value)) {
    write(call, answer.value);
    return;
  }
  for (const Value& element : answer.value.elements()) {
    if (!write(call, element)) return;
  }
}

// `answers` is null where there is a problem.
void writeResult(Call& call, const std::vector<Answer>* answers, const FileProblem* problem) {
  JsonResults results(call);
  results.add([&](JsonWriter& json) {
    beginResult(json, "oxmv.get/1", call.words.front());
    json.key("tags");
    if (answers == nullptr) {
      json.null();
    } else {
      json.beginObject();
      for (const Answer& answer : *answers) {
        json.key(answer.path.text());
        writeTagJson(json, answer.value);
      }
      json.endObject();
    }
    endResult(json, problem);
  });
  results.finish();
}

// Each path once.
std::vector<TagPath> pathsIn(std::span<const std::string> words) {
  std::vector<TagPath> paths;
  for (const std::string& word : words) {
    TagPath path = tagPathFrom(word);
    const bool isKnown = std::any_of(paths.begin(), paths.end(),
                                     [&](const TagPath& known) { return known.keys == path.keys; });
    if (!isKnown) paths.push_back(std::move(path));
  }
  return paths;
}

void run(Call& call) {
  const bool isJson = wantsJson(call);
  if (isJson && call.arguments.has(Flag::raw))
    throw UsageError("bad-flags", "--raw and JSON do not go together");
  std::vector<Answer> answers;
  for (TagPath& path : pathsIn(call.words.subspan(1))) answers.push_back({std::move(path), {}});
  const ClipName name = clipNameFrom(call.words.front());
  const auto read = readClip(call, name);
  if (const auto* problem = std::get_if<FileProblem>(&read)) {
    if (isJson) writeResult(call, nullptr, problem);
    return;
  }
  const Clip& clip = std::get<Clip>(read);
  bool isComplete = true;
  for (Answer& answer : answers) {
    answer.value = valueAt(clip.tags, answer.path);
    if (answer.value.isNothing()) {
      isComplete = false;
      call.messages.error(name.word, fmt::format("{} is not there", visible(answer.path.text())),
                          "absent", Outcome::no);
    } else if (!isJson) {
      writeAnswer(call, answer);
    }
  }
  if (isJson) writeResult(call, &answers, nullptr);
  if (!isComplete) warnOfLosses(call, name, clip);  // it may be among them
}

constexpr auto flags = std::to_array({Flag::raw, Flag::json, Flag::ndjson});

}  // namespace

const Verb getVerb = {
    .name = "get",
    .words = "CLIP TAG...",
    .summary = "print the values of tags, bare",
    .examples =
        "oxmv get clip.colr REEL\n"
        "oxmv get clip.colr \"White balance\" COL1/SATU TAG/ISO\n"
        "oxmv get @override LOOK\n"
        "oxmv get --raw clip.colr FREE > data.bin\n",
    .details =
        "A TAG is its four letters or its label; one that stands in another is COL1/TAG, and\n"
        "an entry of a group TAG/NAME or REG/NAME. One line for each value: lists of numbers\n"
        "with blanks between them, lists of texts a line each, data as hexadecimal digits, and\n"
        "what holds tags as JSON. NULs that only fill a text's record are left out. With --raw\n"
        "texts come with all their bytes, and data as bytes with nothing behind them. Exit\n"
        "code 1 when a tag is not there.\n",
    .flags = flags,
    .fewestWords = 2,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
