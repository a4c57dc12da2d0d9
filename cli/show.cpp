#include <array>
#include <optional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Clips.h"
#include "cli/Csv.h"
#include "cli/Findings.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/TagJson.h"
#include "cli/TagsAsTable.h"
#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

// What is made of the clips, one after the other.
class Presentation {
 public:
  virtual ~Presentation() = default;
  virtual void add(const std::string& name, const Clip& clip) = 0;
  // The problem has been said already.
  virtual void addProblem(const std::string& /*name*/, const FileProblem&) {}
  virtual void finish() {}

 protected:
  Presentation() = default;
  Presentation(const Presentation&) = default;
  Presentation& operator=(const Presentation&) = default;
};

class AsTable final : public Presentation {
 public:
  AsTable(Call& call, bool hasHeadings)
      : call_(call),
        extent_(call.arguments.has(Flag::verbose) ? Extent::whole : Extent::abbreviated),
        hasHeadings_(hasHeadings) {}

  void add(const std::string& name, const Clip& clip) override {
    if (!std::exchange(isFirst_, false)) call_.output.write("\n");
    writeHeading(name, clip.metadata.GUID());
    if (clip.metadata.haveMetadata()) {
      writeTagsAsTable(call_.output, clip.metadata.metadata(), call_.style, extent_);
    } else {
      call_.output.write(call_.style.faint("no tags") + '\n');
    }
  }

 private:
  void writeHeading(const std::string& name, const myGUID& guid) {
    std::string heading;
    if (hasHeadings_) heading = call_.style.heading(nameInMessages(name));
    if (guid != myGUID()) {
      if (!heading.empty()) heading += "  ";
      heading += call_.style.faint("clip GUID ") + guidText(guid);
    }
    if (!heading.empty()) call_.output.write(heading + '\n');
  }

  Call& call_;
  const Extent extent_;
  const bool hasHeadings_;
  bool isFirst_ = true;
};

class AsJson final : public Presentation {
 public:
  explicit AsJson(Call& call) : results_(call) {}

  void add(const std::string& name, const Clip& clip) override {
    results_.add([&](JsonWriter& json) {
      beginResult(json, schema, name);
      json.member("guid", guidText(clip.metadata.GUID()));
      json.key("tags");
      writeTagJson(json, clip.metadata.metadata());
      writeWarnings(json, clip.losses);
      endResult(json, nullptr);
    });
  }

  void addProblem(const std::string& name, const FileProblem& problem) override {
    results_.add([&](JsonWriter& json) {
      beginResult(json, schema, name);
      json.member("guid", std::nullopt);
      json.member("tags", std::nullopt);
      writeWarnings(json, {});
      endResult(json, &problem);
    });
  }

  void finish() override { results_.finish(); }

 private:
  static constexpr std::string_view schema = "oxmv.show/1";

  static void writeWarnings(JsonWriter& json, const std::vector<Finding>& warnings) {
    json.key("warnings");
    json.beginArray();
    for (const Finding& warning : warnings) writeFinding(json, warning);
    json.endArray();
  }

  JsonResults results_;
};

class AsCsv final : public Presentation {
 public:
  explicit AsCsv(Call& call) : csv_(call.output, call.arguments.value(Flag::columns)) {}
  void add(const std::string& name, const Clip& clip) override {
    csv_.add(name, clip.metadata.metadata());
  }

 private:
  CsvWriter csv_;
};

void showEach(Call& call, const std::vector<std::string>& names, Presentation& presentation) {
  for (const std::string& name : names) {
    const auto read = readClip(call, name);
    if (const auto* problem = std::get_if<FileProblem>(&read)) {
      presentation.addProblem(name, *problem);
      continue;
    }
    const Clip& clip = std::get<Clip>(read);
    presentation.add(name, clip);
    warnOfLosses(call, name, clip);
    call.messages.note(name, fmt::format("{}, {}", counted(clip.size, "byte"),
                                         counted(clip.metadata.metadata().size(), "tag")));
  }
  presentation.finish();
}

void run(Call& call) {
  const bool isCsv = call.arguments.has(Flag::csv);
  if (isCsv != call.arguments.has(Flag::columns))
    throw UsageError("bad-flags", "--csv and --columns need each other");
  if (isCsv) {
    AsCsv csv(call);  // refuses bad columns before anything is read
    return showEach(call, namedInputs(call), csv);
  }
  const std::vector<std::string> names = namedInputs(call);
  if (wantsJson(call)) {
    AsJson json(call);
    return showEach(call, names, json);
  }
  AsTable table(call, names.size() > 1);
  showEach(call, names, table);
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::csv, Flag::columns,
                                      Flag::filesFrom, Flag::null, Flag::strict});

}  // namespace

const Verb showVerb = {
    .name = "show",
    .words = "CLIP...",
    .summary = "show the tags of clips, with their labels",
    .examples =
        "oxmv show clip.colr\n"
        "oxmv show --json clip.colr\n"
        "oxmv show --csv --columns REEL,TIMC,\"White balance\" *.colr > clips.csv\n"
        "find . -name '*.colr' -print0 | oxmv show --ndjson --files-from - -0\n",
    .details =
        "CLIP is a file, or - for standard input. What a clip holds and readers ignore is\n"
        "said as a warning. Long values are cut in the table, and whole with -v and in JSON.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
