#include "cli/ShownClips.h"

#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include <fmt/format.h>

#include "cli/Clips.h"
#include "cli/Columns.h"
#include "cli/Csv.h"
#include "cli/Findings.h"
#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/TagJson.h"
#include "cli/TagsAsTable.h"
#include "cli/ValueText.h"
#include "oxmv/values/myGUID.h"

namespace oxmv::cli {
namespace {

// What is made of the clips, one after the other.
class Presentation {
 public:
  virtual ~Presentation() = default;
  virtual void add(const ClipName& name, const Clip& clip) = 0;
  // The problem has been said already.
  virtual void addProblem(const ClipName& /*name*/, const FileProblem&) {}
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

  void add(const ClipName& name, const Clip& clip) override {
    if (!std::exchange(isFirst_, false)) call_.output.write("\n");
    writeHeading(name, clip.guid);
    if (!clip.tags.empty()) {
      writeTagsAsTable(call_.output, clip.tags, call_.style, extent_);
    } else {
      call_.output.write(call_.style.faint("no tags") + '\n');
    }
  }

 private:
  void writeHeading(const ClipName& name, const myGUID& guid) {
    std::string heading;
    if (hasHeadings_) heading = call_.style.heading(nameInMessages(name.word));
    if (guid != name.guid) {  // zero where the name has none
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

  void add(const ClipName& name, const Clip& clip) override {
    results_.add([&](JsonWriter& json) {
      beginResult(json, schema, name.word);
      json.member("guid", guidText(clip.guid));
      json.key("tags");
      writeTagJson(json, clip.tags);
      writeWarnings(json, clip.losses);
      endResult(json, nullptr);
    });
  }

  void addProblem(const ClipName& name, const FileProblem& problem) override {
    results_.add([&](JsonWriter& json) {
      beginResult(json, schema, name.word);
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
  explicit AsCsv(Call& call)
      : output_(call.output),
        csv_(output_, {"file"}, columnsFrom(call.arguments.value(Flag::columns))) {}
  void add(const ClipName& name, const Clip& clip) override {
    csv_.add(output_, {name.word}, valuesOf(csv_.columns(), clip.tags));
  }

 private:
  Sink& output_;
  const CsvWriter csv_;
};

void showEach(Call& call, const std::vector<ClipName>& names, Presentation& presentation) {
  for (const ClipName& name : names) {
    const auto read = readClip(call, name);
    if (const auto* problem = std::get_if<FileProblem>(&read)) {
      presentation.addProblem(name, *problem);
      continue;
    }
    const Clip& clip = std::get<Clip>(read);
    presentation.add(name, clip);
    warnOfLosses(call, name, clip);
    call.messages.note(name.word, fmt::format("{}, {}", counted(clip.size, "byte"),
                                              counted(clip.tags.size(), "tag")));
  }
  presentation.finish();
}

}  // namespace

void showClips(Call& call, const std::function<std::vector<ClipName>(Call&)>& names) {
  const bool isCsv = call.arguments.has(Flag::csv);
  if (isCsv != call.arguments.has(Flag::columns))
    throw UsageError("bad-flags", "--csv and --columns need each other");
  if (isCsv) {
    AsCsv csv(call);  // refuses bad columns before anything is read
    return showEach(call, names(call), csv);
  }
  const std::vector<ClipName> clips = names(call);
  if (wantsJson(call)) {
    AsJson json(call);
    return showEach(call, clips, json);
  }
  AsTable table(call, clips.size() > 1);
  showEach(call, clips, table);
}

}  // namespace oxmv::cli
