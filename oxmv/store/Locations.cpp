#include "oxmv/store/Locations.h"

#include <cstdint>
#include <vector>

#include "oxmv/store/PathTemplate.h"

namespace oxmv {
namespace {

// Kept on purpose: of all settings only this one repairs the preferences.
std::string overrideFolder(Host& host, std::string_view appID) {
  const SettingRow& row = overrideFolderSetting;
  Setting folder = lookUp(row, host, appID);
  if (folder.source != SettingSource::preference) {
    host.setPreference(row.preference, folder.value, appID);
    host.synchronizePreferences(appID);
  }
  return std::move(folder.value);
}

// Looked up in this order: the template, the folder of the looks, the folder of the database.
std::string guidPath(const SettingRow& templateSetting, const myGUID& guid, const std::size_t* eye,
                     std::string_view appID) {
  const auto current = host();
  const std::string pathTemplate = lookUp(templateSetting, *current, appID).value;
  const std::string luts = lookUp(lutsFolderSetting, *current, appID).value;
  const std::string database = lookUp(databaseFolderSetting, *current, appID).value;
  std::vector<PathArgument> arguments = {luts, database, static_cast<std::uint32_t>(guid.Data1),
                                         std::uint32_t{guid.Data2}, std::uint32_t{guid.Data3}};
  for (const std::uint8_t byte : guid.Data4) arguments.emplace_back(std::uint32_t{byte});
  if (eye != nullptr) arguments.emplace_back(static_cast<std::uint32_t>(*eye + 1));
  return formatPath(pathTemplate, arguments);
}

}  // namespace

Setting lookUp(const SettingRow& row, Host& host, std::string_view appID) {
  if (!row.preference.empty()) {
    const Value value = host.copyPreference(row.preference, appID);
    if (value.isText()) return {std::string(value.text()), SettingSource::preference};
  }
  if (!row.string.empty()) {
    std::string text = host.localizedString(row.string, row.builtIn);
    if (text != row.builtIn) return {std::move(text), SettingSource::localizedString};
  }
  return {std::string(row.builtIn), SettingSource::builtIn};
}

std::string overrideFilePath(std::string_view appID) {
  return overrideFilePathIn(overrideFolder(*host(), appID));
}

std::string lastFilePath(std::string_view appID) {
  return lastFilePathIn(overrideFolder(*host(), appID));
}

std::string overrideFilePathIn(std::string_view folder) {
  return std::string(folder) + "/override.colr";
}

std::string lastFilePathIn(std::string_view folder) { return std::string(folder) + "/last"; }

std::string databaseFolderPath(std::string_view appID) {
  const auto current = host();
  const std::string luts = lookUp(lutsFolderSetting, *current, appID).value;
  return luts + '/' + lookUp(databaseFolderSetting, *current, appID).value;
}

std::string clipFilePath(const myGUID& guid, std::string_view appID) {
  return guidPath(clipTemplateSetting, guid, nullptr, appID);
}

std::string eyeFilePath(const myGUID& guid, std::size_t eye, std::string_view appID) {
  return guidPath(eyeTemplateSetting, guid, &eye, appID);
}

}  // namespace oxmv
