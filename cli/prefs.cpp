#include <algorithm>
#include <array>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <fmt/format.h>

#include "cli/JsonResults.h"
#include "cli/Nearest.h"
#include "cli/Preferences.h"
#include "cli/TagJson.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/host/LinuxHost.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/store/Locations.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

constexpr auto settings = std::to_array<const SettingRow*>(
    {&overrideFolderSetting, &lutsFolderSetting, &databaseFolderSetting});

// A preference as it is kept, and what is used.
struct Preference {
  std::string_view key;
  StoredPreference stored;
  std::string used;

  bool isSet() const { return !stored.value.isNothing(); }
  // Hosts take no value but a text.
  bool isGood() const { return stored.value.isText(); }
};

Preference preferenceOf(const SettingRow& row) {
  StoredPreference stored = storedPreference(row.preference);
  std::string used(stored.value.isText() ? stored.value.text() : row.builtIn);
  return {row.preference, std::move(stored), std::move(used)};
}

const SettingRow& settingNamed(std::string_view key) {
  std::vector<std::string_view> keys;
  for (const SettingRow* row : settings) {
    if (row->preference == key) return *row;
    keys.push_back(row->preference);
  }
  const std::string meant = didYouMean(nearest(key, keys));
  throw UsageError(
      "unknown-key",
      fmt::format("no preference \"{}\"{}", visible(key),
                  meant.empty() ? fmt::format("; there are {}", fmt::join(keys, ", ")) : meant));
}

std::string_view kindOf(const Value& value) {
  switch (value.kind()) {
    case Value::Kind::nothing: return "nothing";
    case Value::Kind::integer: return "integer";
    case Value::Kind::float32:
    case Value::Kind::float64: return "float";
    case Value::Kind::text: return "text";
    case Value::Kind::data: return "data";
    case Value::Kind::array: return "array";
    case Value::Kind::dictionary: return "table";
  }
  return {};
}

// "integer 5 in FILE is no text"
std::string objectionTo(const Preference& preference) {
  return fmt::format("{} {} in {} is no text", kindOf(preference.stored.value),
                     inLine(preference.stored.value, Extent::abbreviated),
                     visible(preference.stored.file.string()));
}

// Where the value that is used comes from.
std::string originOf(const Preference& preference) {
  if (!preference.isSet()) return "built-in";
  return preference.isGood() ? visible(preference.stored.file.string())
                             : fmt::format("built-in: {}", objectionTo(preference));
}

void writeTable(Call& call) {
  std::vector<Preference> preferences;
  std::size_t width = 5;
  for (const SettingRow* row : settings) {
    preferences.push_back(preferenceOf(*row));
    width = std::max(width, columns(visible(preferences.back().used)));
  }
  call.output.write(call.style.faint(fmt::format("{:<13}  {:<{}}  FROM", "KEY", "VALUE", width)) +
                    '\n');
  for (const Preference& preference : preferences) {
    const std::string value = visible(preference.used);
    const std::string origin = originOf(preference);
    call.output.write(fmt::format(
        "{:<13}  {}{}  {}\n", preference.key, value, std::string(width - columns(value), ' '),
        preference.isSet() && !preference.isGood() ? call.style.warning(origin) : origin));
  }
}

void writeJson(Call& call) {
  JsonResults results(call);
  for (const SettingRow* row : settings) {
    const Preference preference = preferenceOf(*row);
    results.add([&](JsonWriter& json) {
      const std::string file = preference.stored.file.string();
      json.beginObject();
      json.member("schema", "oxmv.prefs/1");
      json.member("file",
                  preference.isSet() ? std::optional<std::string_view>(file) : std::nullopt);
      json.member("key", preference.key);
      json.key("stored");
      if (preference.isSet()) {
        writeTagJson(json, preference.stored.value);
      } else {
        json.null();
      }
      json.member("used", preference.used);
      json.member("source", preference.isGood() ? "preference" : "built-in");
      endResult(json, nullptr);
    });
  }
  results.finish();
}

void list(Call& call) {
  sayBadPreferencesFiles(call);
  wantsJson(call) ? writeJson(call) : writeTable(call);
}

void get(Call& call, const SettingRow& row) {
  sayBadPreferencesFiles(call);
  const Preference preference = preferenceOf(row);
  if (!preference.isSet())
    return call.messages.error({}, fmt::format("{} is not set", preference.key), "absent",
                               Outcome::no);
  if (!preference.isGood())
    call.messages.warning(preference.key, objectionTo(preference) + "; what is built in is used",
                          "not-text");
  call.output.write(bare(preference.stored.value) + '\n');
}

// What to do about an error that the user can do something about.
std::string wayOutOf(const std::error_code& error) {
  if (error == PreferencesError::notToml || error == PreferencesError::tooLarge)
    return "; it stays as it is: mend it, or move it away";
  if (error == PreferencesError::noPlace) return "; set HOME or XDG_CONFIG_HOME";
  if (error == PreferencesError::busy) return "; try again";
  return {};
}

// `value`: nothing removes it.
void change(Call& call, const SettingRow& row, const Value& value) {
  const auto path = userPreferencesPath(preferencesAppID);
  const std::string name = path ? path->string() : std::string();
  const Value old = path ? readPreferencesFile(*path).values[row.preference] : Value();
  if (call.arguments.has(Flag::dryRun)) {
    const auto shown = [](const Value& one) {
      return one.isNothing() ? "(absent)" : inLine(one, Extent::whole);
    };
    if (old != value)
      call.output.write(fmt::format("{}: {} -> {}\n", row.preference, shown(old), shown(value)));
    return;
  }
  call.host.setPreference(row.preference, value, preferencesAppID);
  std::error_code error;
  if (!call.host.synchronizePreferences(preferencesAppID, &error))
    return call.messages.error(name, error.message() + wayOutOf(error), "write-failed");
  call.messages.note(name, old == value ? "nothing to change"
                                        : fmt::format("{} is {}", row.preference,
                                                      value.isNothing() ? "removed" : "set"));
}

void set(Call& call, const SettingRow& row, const std::string& text) {
  // It would be kept as other characters, and name another folder.
  if (!isUtf8(text))
    return call.messages.refused(
        {}, fmt::format("{}: \"{}\" is not UTF-8", row.preference, visible(text)), "not-utf8",
        "nothing written");
  change(call, row, Value(text));
}

void unset(Call& call, const SettingRow& row) {
  const auto path = userPreferencesPath(preferencesAppID);
  const bool isUsers = path && readPreferencesFile(*path).values.contains(row.preference);
  const Preference preference = preferenceOf(row);
  // A file that cannot be read may have it; changing that one fails, and says why.
  const bool mayBeThere = path && isBad(readPreferencesFile(*path));
  if (!isUsers && !mayBeThere)
    return call.messages.error(
        {},
        preference.isSet() ? fmt::format("{} is set in {} only, which is not the user's",
                                         row.preference, visible(preference.stored.file.string()))
                           : fmt::format("{} is not set", row.preference),
        "absent", Outcome::no);
  change(call, row, {});
}

void run(Call& call) {
  const auto words = call.words;
  if (words.empty()) return list(call);
  constexpr auto actions = std::to_array<std::string_view>({"get", "set", "unset"});
  const auto action = std::find(actions.begin(), actions.end(), words.front());
  if (action == actions.end()) {
    const std::string meant = didYouMean(nearest(words.front(), actions));
    throw UsageError("unknown-verb", fmt::format("prefs does get, set and unset, not \"{}\"{}",
                                                 visible(words.front()), meant));
  }
  const bool isSet = *action == "set";
  if (words.size() != (isSet ? 3u : 2u))
    throw UsageError("missing-words",
                     fmt::format("prefs {} needs KEY{}", *action, isSet ? " VALUE" : " alone"));
  if (wantsJson(call)) throw UsageError("bad-flags", "JSON is for the list of preferences");
  const SettingRow& row = settingNamed(words[1]);
  if (isSet) return set(call, row, words[2]);
  *action == "get" ? get(call, row) : unset(call, row);
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::dryRun});

}  // namespace

const Verb prefsVerb = {
    .name = "prefs",
    .words = "[get KEY | set KEY VALUE | unset KEY]",
    .summary = "show or change the preferences",
    .examples =
        "oxmv prefs\n"
        "oxmv prefs get LUTsPath\n"
        "oxmv prefs set LUTsPath /mnt/looks\n"
        "oxmv prefs unset LUTsPath\n",
    .details =
        "All programs that use the library share them:\n"
        "  OverridePath   the folder of the override file and of the \"last\" file\n"
        "  LUTsPath       the folder in which the clip database is\n"
        "  CurrentDBPath  the name of the clip database in there\n"
        "Without more words each is listed: what is used, and the file that says so. A value\n"
        "that is no text counts as none. get prints what is kept, and has exit code 1 when\n"
        "nothing is. set and unset change the user's own file, and nothing else in it; one that\n"
        "cannot be read stays as it is. oxmv paths shows what comes of them.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = 3,
    .run = run,
};

}  // namespace oxmv::cli
