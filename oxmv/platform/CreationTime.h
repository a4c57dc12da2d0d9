// When a file was made, as a calendar and a clock on the wall tell it.

#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>

namespace oxmv {

struct CalendarTime {
  std::int64_t year;  // of the common era; 0 and below are the years before it
  int month;          // 1 to 12
  int day;            // 1 to 31
  int hour;           // 0 to 23
  int minute;         // 0 to 59
  int second;         // 0 to 60

  bool operator==(const CalendarTime&) const = default;
};

// A moment, in seconds since 1970-01-01 00:00:00 UTC, in the time zone of the process. Nothing for
// a moment so far away that its year cannot be counted.
std::optional<CalendarTime> localTime(std::int64_t secondsSince1970);

// When the file was created, in the time zone of the process; a symbolic link is followed. Nothing
// if its file system does not remember that (not all do), or there is no such file.
std::optional<CalendarTime> creationTime(const std::filesystem::path& path);

}  // namespace oxmv
