// Any bytes as a camera still, from the file to its tags. What must hold for all of them:
//
// - the only exception is the range error of a firmware text that is too short;
// - only the tags of stills are there, each of its kind, texts valid and without a NUL;
// - the times depend on nothing in the file, and its bytes on nothing outside it.

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <stdexcept>
#include <string_view>

#include "fuzz/Require.h"
#include "oxmv/host/Host.h"
#include "oxmv/import/CameraStill.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Text.h"

namespace {

using namespace oxmv;
using fuzz::require;

// Counts the lines of the log, and nothing else.
class QuietHost final : public Host {
 public:
  std::size_t lines = 0;

  Value copyPreference(std::string_view, std::string_view) override { return {}; }
  void setPreference(std::string_view, const Value&, std::string_view) override {}
  bool synchronizePreferences(std::string_view, std::error_code*) override { return true; }
  std::string localizedString(std::string_view, std::string_view builtIn) override {
    return std::string(builtIn);
  }
  void alert(std::string_view) override {}
  void log(std::string_view) override { ++lines; }
};

QuietHost& quietHost() {
  static const auto host = [] {
    auto quiet = std::make_shared<QuietHost>();
    installHost(quiet);
    return quiet;
  }();
  return *host;
}

struct Answer {
  bool isTooShort = false;
  std::optional<Dictionary> tags;
  bool operator==(const Answer&) const = default;
};

Answer answerFor(std::span<const std::uint8_t> file, const std::optional<CalendarTime>& created) {
  try {
    return {.tags = tagsOfStill(file, created, "A001", CameraTables::builtIn())};
  } catch (const std::out_of_range&) {
    return {.isTooShort = true, .tags = std::nullopt};
  }
}

void check(std::string_view key, const Value& value) {
  if (key == "TIMB") return require(value == Value(30));
  if (key == fieldOfViewKey) {
    const Array array = value.array();
    require(array.size() == 1);
    const int letter = array[0].intValue();
    return require(letter == 87 || letter == 77 || letter == 78);
  }
  require(key == "REEL" || key == "CMDL" || key == "FIRM");
  require(value.isText() && isUtf8(value.text()));
  require(value.text().find('\0') == std::string_view::npos);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::span file(data, size);
  QuietHost& host = quietHost();
  host.lines = 0;
  const Answer answer = answerFor(file, std::nullopt);
  if (answer.tags) {
    for (const auto& [key, value] : *answer.tags) check(key, value);
    require(host.lines == (answer.tags->contains(fieldOfViewKey) ? 1 : 0));
  }

  Answer dated = answerFor(file, CalendarTime{2024, 2, 29, 14, 3, 9});
  if (dated.tags) {
    for (const char* tag : {"STIM", "SDAT", "TIMC"}) require(dated.tags->remove(tag));
  }
  require(dated == answer);
  return 0;
}
