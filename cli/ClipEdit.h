// One clip that is changed: read, edited record by record, and put back whole or not at all.

#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <system_error>

#include "cli/Clips.h"
#include "cli/Verb.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv::cli {

class ClipEdit {
 public:
  // Reads the clip that the first word names. Answers nothing when that fails, which is said then,
  // with `ifMissing` if there is no such file. Throws UsageError for flags that mean nothing
  // together.
  static std::optional<ClipEdit> begin(Call& call, std::string_view ifMissing = {});

  // As the user named it.
  const std::string& name() const { return name_.word; }
  TagStreamEditor& editor() { return editor_; }
  // As edited so far.
  Dictionary tags() const;

  // Says that the editor refused something.
  void sayRefused(const std::string& path, const EditError& error);

  // Puts the edited clip where it came from, unless nothing has changed or this is a dry run, which
  // shows the changes instead.
  void finish();

 private:
  ClipEdit(Call& call, ClipName name, std::optional<Bytes> original, Layout layout);

  void save();
  bool replace(std::error_code& error) const;
  bool hasArrived() const;
  void showChanges();
  std::optional<std::string> backUp();

  Call* call_;
  ClipName name_;
  std::optional<Bytes> original_;  // none: there was no file
  TagStreamEditor editor_;
};

}  // namespace oxmv::cli
