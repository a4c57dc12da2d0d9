// The names of files in the clip database.

#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "oxmv/values/myGUID.h"

namespace oxmv {

// The file of a clip by its name in the folder of the database, as the built-in templates make it:
//
//   name := GUID ".colr"         combined; the GUID in upper case, 8-4-4-4-12 digits
//         | GUID ".col" NUMBER   of one eye: its index plus one, 1 and more
//
// A host whose templates are others has files of other names.
struct ClipFileName {
  // The index of the last eye: names count as signed numbers of 32 bits do.
  static constexpr std::size_t lastEye = 0x7FFFFFFE;

  myGUID guid;
  std::optional<std::size_t> eye;  // none: combined

  bool operator==(const ClipFileName&) const = default;

  // Nothing for a name that the library gives to no file.
  static std::optional<ClipFileName> from(std::string_view name) noexcept;

  std::string text() const;
};

}  // namespace oxmv
