#include <cstdlib>
#include <ctime>
#include <fstream>
#include <limits>
#include <string>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "oxmv/platform/CreationTime.h"
#include "tests/support/TempDir.h"
#include "tests/support/TimeZone.h"

namespace oxmv {
namespace {

using test::TempDir;
using test::TimeZone;

TEST(CreationTime, MomentsAreToldInTheTimeZoneOfTheProcess) {
  const TimeZone utc("UTC0");
  EXPECT_EQ(localTime(0), (CalendarTime{1970, 1, 1, 0, 0, 0}));
  EXPECT_EQ(localTime(1709215439), (CalendarTime{2024, 2, 29, 14, 3, 59}));
  const TimeZone east("EST-5:30");  // east of Greenwich: the sign is the other way round
  EXPECT_EQ(localTime(0), (CalendarTime{1970, 1, 1, 5, 30, 0}));
  const TimeZone west("WST8");
  EXPECT_EQ(localTime(0), (CalendarTime{1969, 12, 31, 16, 0, 0}));
}

TEST(CreationTime, SummerTimeCounts) {
  const TimeZone zone("CET-1CEST,M3.5.0,M10.5.0/3");
  EXPECT_EQ(localTime(1704067200), (CalendarTime{2024, 1, 1, 1, 0, 0}));
  EXPECT_EQ(localTime(1719792000), (CalendarTime{2024, 7, 1, 2, 0, 0}));
}

TEST(CreationTime, YearsMayBeFarAway) {
  const TimeZone utc("UTC0");
  EXPECT_EQ(localTime(253402300800), (CalendarTime{10000, 1, 1, 0, 0, 0}));
  EXPECT_EQ(localTime(-62167219200), (CalendarTime{0, 1, 1, 0, 0, 0}));
  EXPECT_EQ(localTime(-62167219201), (CalendarTime{-1, 12, 31, 23, 59, 59}));
  EXPECT_EQ(localTime(std::numeric_limits<std::int64_t>::max()), std::nullopt);
  EXPECT_EQ(localTime(std::numeric_limits<std::int64_t>::min()), std::nullopt);
}

TEST(CreationTime, TimesThatDifferInOnePartAreDifferent) {
  const CalendarTime time = {2024, 2, 28, 14, 3, 58};
  EXPECT_EQ(time, (CalendarTime{2024, 2, 28, 14, 3, 58}));
  for (const CalendarTime& other :
       {CalendarTime{2025, 2, 28, 14, 3, 58}, CalendarTime{2024, 3, 28, 14, 3, 58},
        CalendarTime{2024, 2, 29, 14, 3, 58}, CalendarTime{2024, 2, 28, 15, 3, 58},
        CalendarTime{2024, 2, 28, 14, 4, 58}, CalendarTime{2024, 2, 28, 14, 3, 59}})
    EXPECT_NE(time, other);
}

// Not all file systems keep it, so this asks the system what is to be expected.
TEST(CreationTime, IsWhatTheFileSystemRemembers) {
  const TimeZone utc("UTC0");
  const TempDir folder;
  std::ofstream(folder / "file") << "content";
  struct statx status = {};
  ASSERT_EQ(::statx(AT_FDCWD, (folder / "file").c_str(), 0, STATX_BTIME, &status), 0);
  const bool isKept = (status.stx_mask & STATX_BTIME) != 0;
  const auto expected = isKept ? localTime(status.stx_btime.tv_sec) : std::nullopt;
  EXPECT_EQ(creationTime(folder / "file"), expected);
  std::filesystem::create_symlink("file", folder / "link");
  EXPECT_EQ(creationTime(folder / "link"), expected);
}

TEST(CreationTime, ChangesOfTheFileLeaveItAlone) {
  const TempDir folder;
  std::ofstream(folder / "file") << "content";
  const auto before = creationTime(folder / "file");
  std::filesystem::last_write_time(folder / "file", std::filesystem::file_time_type());
  EXPECT_EQ(creationTime(folder / "file"), before);
}

TEST(CreationTime, WhatIsNotThereHasNone) {
  const TempDir folder;
  EXPECT_EQ(creationTime(folder / "missing"), std::nullopt);
  EXPECT_EQ(creationTime(""), std::nullopt);
  std::ofstream(folder / "file") << "content";
  EXPECT_EQ(creationTime(folder / std::string("file\0more", 9)), std::nullopt);
}

}  // namespace
}  // namespace oxmv
