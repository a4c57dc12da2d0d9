// The tags of a clip, as far as a still from the same camera tells them.

#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <span>
#include <string_view>

#include "oxmv/import/CameraTables.h"
#include "oxmv/platform/CreationTime.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv {

// How wide a camera looks. The values are the letters W, M, N; they are stored.
enum class FieldOfView : std::uint8_t { wide = 87, medium = 77, narrow = 78 };

// The key that the field of view stands under: four characters like every tag, the last of which
// has code 0. Streams have no such tag, so it lives in dictionaries only.
constexpr std::string_view fieldOfViewKey{"FOV", 4};

// The angle in degrees that a lens of this focal length, in millimetres on 35 mm film, takes in
// from corner to corner: 2 atan(21.635 / focalLength), 21.635 mm being half the diagonal of a
// frame.
double fieldOfViewDegrees(double focalLength) noexcept;

// Above 100 degrees wide, above 70 medium, above 0 narrow; else none.
std::optional<FieldOfView> fieldOfViewOf(double degrees) noexcept;

// The tags of a still, in this order as far as they are there:
//
//   STIM, SDAT, TIMC  when the file was created: "14:03:59", "2024-02-29", "14:03:59:00"
//   TIMB              30
//   REEL              the reel name, unless it is empty
//   CMDL              the model of the camera: for stills of the maker, or by the firmware text
//   "FOV\0"           an array of one FieldOfView, as an integer
//   FIRM              the firmware text, of whatever camera
//
// `file` is the whole file, `created` when it was made; without that the three times are left out.
// Answers nothing if the file is no JPEG image. Puts one line into the host's log when there is a
// field of view.
//
// Throws std::out_of_range when the still has a firmware text that is too short to be compared: of
// fewer than 3 characters, or of fewer than 6 and with neither of the short prefixes. Kept on
// purpose: what hosts have always been able to catch.
std::optional<Dictionary> tagsOfStill(std::span<const std::uint8_t> file,
                                      const std::optional<CalendarTime>& created,
                                      std::string_view reelName, const CameraTables& tables);

// The same for a file on disk, and when that was created. Answers nothing also if it cannot be read
// (readWholeFile() knows why).
std::optional<Dictionary> tagsOfStillFile(const std::filesystem::path& path,
                                          std::string_view reelName, const CameraTables& tables);

}  // namespace oxmv
