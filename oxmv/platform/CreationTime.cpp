#include "oxmv/platform/CreationTime.h"

#include <ctime>

#include <fcntl.h>
#include <sys/stat.h>

namespace oxmv {

static_assert(sizeof(std::time_t) >= sizeof(std::int64_t), "any moment of a file system fits");

std::optional<CalendarTime> localTime(std::int64_t secondsSince1970) {
  const std::time_t moment = secondsSince1970;
  std::tm time = {};
  if (::localtime_r(&moment, &time) == nullptr) return std::nullopt;
  return CalendarTime{
      .year = std::int64_t{1900} + time.tm_year,
      .month = time.tm_mon + 1,
      .day = time.tm_mday,
      .hour = time.tm_hour,
      .minute = time.tm_min,
      .second = time.tm_sec,
  };
}

std::optional<CalendarTime> creationTime(const std::filesystem::path& path) {
  // The system would cut the name at a NUL and tell of another file.
  if (path.native().find('\0') != std::string::npos) return std::nullopt;
  struct statx status = {};
  if (::statx(AT_FDCWD, path.c_str(), 0, STATX_BTIME, &status) != 0) return std::nullopt;
  if ((status.stx_mask & STATX_BTIME) == 0) return std::nullopt;
  // Some file systems (overlays, some network ones) say that they remember, and answer nothing but
  // zeros.
  if (status.stx_btime.tv_sec == 0 && status.stx_btime.tv_nsec == 0) return std::nullopt;
  return localTime(status.stx_btime.tv_sec);
}

}  // namespace oxmv
