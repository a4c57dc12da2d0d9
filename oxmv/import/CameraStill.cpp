#include "oxmv/import/CameraStill.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <stdexcept>
#include <string>
#include <system_error>

#include "oxmv/host/Host.h"
#include "oxmv/import/JpegSegments.h"
#include "oxmv/platform/Exif.h"
#include "oxmv/platform/JpegImage.h"
#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

// Where the maker's cameras put two texts, each ended by a NUL. The maker that EXIF names is not
// asked, on purpose.
constexpr std::size_t makerTextOffset = 1038;
constexpr std::size_t modelTextOffset = 1062;
constexpr auto makerSpellings = std::to_array<std::string_view>({"KiVex", "Kivex"});
constexpr std::string_view makerName = makerSpellings[0];

constexpr std::int32_t timecodeBase = 30;

// The text that begins at `offset`, if it ends within the file and is UTF-8.
std::optional<std::string_view> textAt(std::span<const std::uint8_t> file, std::size_t offset) {
  if (offset >= file.size()) return std::nullopt;
  const auto rest = file.subspan(offset);
  const auto end = std::find(rest.begin(), rest.end(), std::uint8_t{0});
  if (end == rest.end()) return std::nullopt;
  const std::string_view text(reinterpret_cast<const char*>(rest.data()),
                              static_cast<std::size_t>(end - rest.begin()));
  if (!isUtf8(text)) return std::nullopt;
  return text;
}

// The model text of a still of the maker; none for stills of others.
std::optional<std::string_view> makersModelText(std::span<const std::uint8_t> file) {
  const auto maker = textAt(file, makerTextOffset);
  if (!maker ||
      std::find(makerSpellings.begin(), makerSpellings.end(), *maker) == makerSpellings.end())
    return std::nullopt;
  return textAt(file, modelTextOffset);
}

std::string digits(std::int64_t number, std::size_t fewest) {
  std::string text = std::to_string(number < 0 ? -number : number);
  if (text.size() < fewest) text.insert(0, fewest - text.size(), '0');
  return number < 0 ? "-" + text : text;
}

void setTimes(Dictionary& tags, const CalendarTime& created) {
  const std::string time =
      digits(created.hour, 2) + ':' + digits(created.minute, 2) + ':' + digits(created.second, 2);
  tags.set("STIM", time);
  tags.set("SDAT",
           digits(created.year, 4) + '-' + digits(created.month, 2) + '-' + digits(created.day, 2));
  tags.set("TIMC", time + ":00");
}

void setFieldOfView(Dictionary& tags, double focalLength) {
  if (!(focalLength > 0)) return;
  const auto fieldOfView = fieldOfViewOf(fieldOfViewDegrees(focalLength));
  if (!fieldOfView) return;
  tags.set(fieldOfViewKey, Array::of(static_cast<std::int32_t>(*fieldOfView)));
  host()->log("FOV SET, BABY!!!!!");
}

std::string replacedAll(std::string_view text, std::string_view what, std::string_view by) {
  std::string result;
  std::size_t from = 0;
  for (std::size_t at = text.find(what); at != std::string_view::npos; at = text.find(what, from)) {
    result.append(text.substr(from, at - from)).append(by);
    from = at + what.size();
  }
  return result.append(text.substr(from));
}

char smallLetter(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

// Without regard to case. The prefix is ASCII, so bytes are characters as far as they are equal.
bool beginsWith(std::string_view text, std::string_view prefix) {
  return text.size() >= prefix.size() &&
         std::equal(prefix.begin(), prefix.end(), text.begin(),
                    [](char a, char b) { return smallLetter(a) == smallLetter(b); });
}

void requireLength(std::string_view firmware, std::size_t length) {
  if (utf16Length(firmware) < length)
    throw std::out_of_range("the still's Software text has fewer than " + std::to_string(length) +
                            " characters");
}

template <class Rows>
const CameraTables::FirmwareRow* findRow(const Rows& rows, std::string_view firmware) {
  const auto row = std::find_if(rows.begin(), rows.end(), [&](const auto& candidate) {
    return beginsWith(firmware, candidate.prefix);
  });
  return row == rows.end() ? nullptr : &*row;
}

void setFirmware(Dictionary& tags, std::string_view software, const CameraTables& tables) {
  const std::string firmware = replacedAll(software, "Ver", tables.shortPrefixes()[0].prefix + '.');
  tags.set("FIRM", firmware);
  requireLength(firmware, CameraTables::shortPrefix);
  const auto* row = findRow(tables.shortPrefixes(), firmware);
  if (row == nullptr) {
    requireLength(firmware, CameraTables::longPrefix);
    row = findRow(tables.longPrefixes(), firmware);
  }
  if (row != nullptr) tags.set("CMDL", row->name);
}

void setByModel(Dictionary& tags, std::string_view model, const CameraTables& tables) {
  const auto& rows = tables.modelTexts();
  const auto row = std::find_if(rows.begin(), rows.end(),
                                [&](const auto& candidate) { return candidate.text == model; });
  if (row == rows.end()) return;
  tags.set("FIRM", row->firmware);
  tags.set("CMDL", row->name);
}

}  // namespace

double fieldOfViewDegrees(double focalLength) noexcept {
  // Kept on purpose: not the full value of pi. Do not mend it; the classes would move.
  return 2 * std::atan(21.635 / focalLength) * 180 / 3.14159;
}

std::optional<FieldOfView> fieldOfViewOf(double degrees) noexcept {
  if (degrees > 100) return FieldOfView::wide;
  if (degrees > 70) return FieldOfView::medium;
  if (degrees > 0) return FieldOfView::narrow;
  return std::nullopt;
}

std::optional<Dictionary> tagsOfStill(std::span<const std::uint8_t> file,
                                      const std::optional<CalendarTime>& created,
                                      std::string_view reelName, const CameraTables& tables) {
  if (!isJpegImage(file)) return std::nullopt;
  Dictionary tags;
  if (created) setTimes(tags, *created);
  tags.set("TIMB", timecodeBase);
  if (!reelName.empty()) tags.set("REEL", reelName);

  const auto modelText = makersModelText(file);
  if (modelText) {
    const auto& second = tables.shortPrefixes()[1];
    tags.set("CMDL", *modelText == second.prefix ? std::string_view(second.name) : makerName);
  }

  const ExifProperties properties = readExif(exifSegment(file));
  if (properties.focalLength) setFieldOfView(tags, *properties.focalLength);
  if (properties.software) {
    setFirmware(tags, *properties.software, tables);
  } else if (properties.model && modelText) {
    setByModel(tags, *properties.model, tables);
  }
  return tags;
}

std::optional<Dictionary> tagsOfStillFile(const std::filesystem::path& path,
                                          std::string_view reelName, const CameraTables& tables) {
  std::error_code ignored;
  const auto file = readWholeFile(path, ignored);
  if (!file) return std::nullopt;
  return tagsOfStill(*file, creationTime(path), reelName, tables);
}

}  // namespace oxmv
