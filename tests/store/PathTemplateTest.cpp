#include <array>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/store/PathTemplate.h"

namespace oxmv {
namespace {

// The templates of the tests have the same arguments: two texts and two numbers.
std::string formatted(std::string_view pathTemplate) {
  constexpr std::array<PathArgument, 4> arguments = {"Looks", "db", 0xABCDu, 0xFFFFFFFEu};
  return formatPath(pathTemplate, arguments);
}

TEST(PathTemplate, PutsTheArgumentsInTheirOrder) {
  EXPECT_EQ(formatted("/%@/%@/%X.%d"), "/Looks/db/ABCD.-2");
}

TEST(PathTemplate, WithoutConversionsIsTheText) {
  EXPECT_EQ(formatted(""), "");
  EXPECT_EQ(formatted("/a folder/clip"), "/a folder/clip");
}

TEST(PathTemplate, LeavesArgumentsThatAreNotAskedFor) { EXPECT_EQ(formatted("%@"), "Looks"); }

TEST(PathTemplate, PrintsNumbersOfEachKind) {
  EXPECT_EQ(formatted("%3$d %3$i %3$u %3$x %3$X"), "43981 43981 43981 abcd ABCD");
  EXPECT_EQ(formatted("%4$d %4$i %4$u %4$x %4$X"), "-2 -2 4294967294 fffffffe FFFFFFFE");
}

TEST(PathTemplate, PrintsTheLowestSignedNumber) {
  constexpr std::array<PathArgument, 1> lowest = {0x80000000u};
  EXPECT_EQ(formatPath("%d", lowest), "-2147483648");
}

TEST(PathTemplate, FillsNumbersUpToTheWidth) {
  EXPECT_EQ(formatted("[%3$8X]"), "[    ABCD]");
  EXPECT_EQ(formatted("[%3$08X]"), "[0000ABCD]");
  EXPECT_EQ(formatted("[%3$-8X]"), "[ABCD    ]");
  EXPECT_EQ(formatted("[%3$-08X]"), "[ABCD    ]");
  EXPECT_EQ(formatted("[%3$2X]"), "[ABCD]");
  EXPECT_EQ(formatted("[%4$6d]"), "[    -2]");
  EXPECT_EQ(formatted("[%4$06d]"), "[-00002]");
}

TEST(PathTemplate, MarksNumbersAsTheFlagsSay) {
  EXPECT_EQ(formatted("%3$+d %3$ d %4$+d"), "+43981  43981 -2");
  EXPECT_EQ(formatted("%3$#x %3$#X %3$#010X"), "0xabcd 0XABCD 0X0000ABCD");
  constexpr std::array<PathArgument, 1> zero = {0u};
  EXPECT_EQ(formatPath("%#x %1$#X", zero), "0 0");
  EXPECT_EQ(formatted("%3$#u %3$#d"), "43981 43981");
}

TEST(PathTemplate, FillsTextsUpToTheWidth) {
  EXPECT_EQ(formatted("[%7@]"), "[  Looks]");
  EXPECT_EQ(formatted("[%-7@]"), "[Looks  ]");
  EXPECT_EQ(formatted("[%07@]"), "[  Looks]");
  constexpr std::array<PathArgument, 1> accented = {"h\u00E9"};
  EXPECT_EQ(formatPath("[%4@]", accented), "[  h\u00E9]");
}

TEST(PathTemplate, ReadsLengthsAndIgnoresThem) {
  EXPECT_EQ(formatted("%3$hX %3$hhX %3$lX %3$llX %4$ld"), "ABCD ABCD ABCD ABCD -2");
}

TEST(PathTemplate, PicksArgumentsByPosition) {
  EXPECT_EQ(formatted("%2$@/%1$@"), "db/Looks");
  EXPECT_EQ(formatted("%2$@/%@/%@"), "db/Looks/db");
}

TEST(PathTemplate, PrintsAPercentSignForTwo) {
  EXPECT_EQ(formatted("100%%"), "100%");
  EXPECT_EQ(formatted("%%@"), "%@");
  EXPECT_EQ(formatted("%%%@"), "%Looks");
}

TEST(PathTemplate, LeavesConversionsWithoutAnArgument) {
  EXPECT_EQ(formatted("%@ %@ %X %X %X %@"), "Looks db ABCD FFFFFFFE %X %@");
  EXPECT_EQ(formatPath("%@/%08X", {}), "%@/%08X");
  EXPECT_EQ(formatted("%5$@ %0$@ %99999999999$@"), "%5$@ %0$@ %99999999999$@");
}

TEST(PathTemplate, LeavesConversionsOfTheOtherKind) {
  EXPECT_EQ(formatted("%d"), "%d");
  EXPECT_EQ(formatted("%3$@"), "%3$@");
  // Does not take the argument: that is there for the next.
  EXPECT_EQ(formatted("%X %@"), "%X Looks");
}

TEST(PathTemplate, LeavesWhatWouldBeUnsafe) {
  for (const std::string_view conversion :
       {"%n", "%s",  "%p",    "%c",   "%f",   "%e",   "%g",   "%a",  "%S",   "%C",  "%o",
        "%m", "%*d", "%*3$d", "%.3d", "%.*d", "%1$n", "%1$s", "%Lf", "%lln", "%hhn"}) {
    EXPECT_EQ(formatted(conversion), conversion);
    EXPECT_EQ(formatted(std::string(conversion) + "/%@"), std::string(conversion) + "/Looks");
  }
}

TEST(PathTemplate, LeavesWidthsThatNoNameHas) {
  EXPECT_EQ(formatted("%3$255X"), std::string(251, ' ') + "ABCD");
  EXPECT_EQ(formatted("%3$256X"), "%3$256X");
  EXPECT_EQ(formatted("%99999999999X"), "%99999999999X");
  EXPECT_EQ(formatted("%099999999999d"), "%099999999999d");
}

TEST(PathTemplate, LeavesConversionsThatAreCutOff) {
  constexpr std::string_view whole = "%1$-012ll@";
  EXPECT_EQ(formatted(whole), "Looks       ");
  for (std::size_t size = 1; size < whole.size(); ++size)
    EXPECT_EQ(formatted(whole.substr(0, size)), whole.substr(0, size));
}

TEST(PathTemplate, LeavesAPercentSignBetweenConversions) {
  EXPECT_EQ(formatted("%-%@"), "%-Looks");
  EXPECT_EQ(formatted("%1$%@"), "%1$Looks");
  EXPECT_EQ(formatted("%5%@"), "%5Looks");
}

TEST(PathTemplate, KeepsBytesThatAreNoText) {
  EXPECT_EQ(formatted("\xFF%@\xFE"), "\xFFLooks\xFE");
  EXPECT_EQ(formatted(std::string_view("a\0%@", 4)), std::string_view("a\0Looks", 7));
}

}  // namespace
}  // namespace oxmv
