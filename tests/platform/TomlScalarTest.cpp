#include <gtest/gtest.h>

#include "oxmv/platform/TomlScalar.h"

namespace oxmv {
namespace {

TEST(TomlScalar, IsABooleanANumberADateOrATime) {
  for (const char* text : {"true",
                           "false",
                           "0",
                           "-0",
                           "+17",
                           "1_000_000",
                           "0xdead_BEEF",
                           "0o755",
                           "0b1_0",
                           "inf",
                           "-inf",
                           "+nan",
                           "0.5",
                           "-3.14_15",
                           "5e+22",
                           "1_0E0_6",
                           "6.626e-34",
                           "0e0",
                           "0.0",
                           "1979-05-27",
                           "1979-05-27T07:32:00",
                           "1979-05-27t07:32:00.999z",
                           "1979-05-27 07:32:00Z",
                           "1979-05-27T00:32:00.5-07:00",
                           "1979-05-27T00:32:00+07:00",
                           "07:32:00",
                           "00:32:00.999999"})
    EXPECT_TRUE(isTomlScalar(text)) << text;
}

TEST(TomlScalar, IsNothingElse) {
  for (const char* text : {"",
                           "True",
                           "truefalse",
                           "+",
                           "--1",
                           "_1",
                           "1_",
                           "1__0",
                           "01",
                           "-01",
                           "00.5",
                           "0_1",
                           "0x",
                           "0x_1",
                           "+0x1",
                           "0X1",
                           "0x1G",
                           "0o",
                           "0o8",
                           "0o18",
                           "0b",
                           "0b2",
                           "0b12",
                           "Inf",
                           "infinity",
                           ".5",
                           "5.",
                           "5.e1",
                           "1._5",
                           "1e",
                           "1e+",
                           "1e5.5",
                           "1.2.3",
                           "1979-05-27 ",
                           "1979-05-27 7",
                           "1979-05-27T",
                           "1979-05-27T07:32",
                           "1979-5-27",

                           "1979-05-27T07:32:00.",
                           "1979-05-27T07:32:00+7",
                           "1979-05-27T07:32:00+07:00Z",
                           "1979-05-27Z",
                           "07:32",
                           "07:32:00Z",
                           "7:32:00",
                           "07:32:00.x",
                           "1979-05-27  07:32:00",
                           "é"})
    EXPECT_FALSE(isTomlScalar(text)) << text;
}

}  // namespace
}  // namespace oxmv
