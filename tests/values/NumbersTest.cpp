#include <bit>
#include <clocale>
#include <cmath>
#include <locale>
#include <string>

#include <gtest/gtest.h>

#include "oxmv/values/Numbers.h"

namespace oxmv::test {
namespace {

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr std::int64_t int64Min = std::numeric_limits<std::int64_t>::min();
constexpr std::int64_t int64Max = std::numeric_limits<std::int64_t>::max();

std::string zeros(std::size_t count) { return std::string(count, '0'); }

TEST(Numbers, TruncatedSaturatesExactlyAtTheEnds) {
  EXPECT_EQ(truncated<std::int8_t>(127.9), 127);
  EXPECT_EQ(truncated<std::int8_t>(128.0), 127);
  EXPECT_EQ(truncated<std::int8_t>(-128.9), -128);
  EXPECT_EQ(truncated<std::int8_t>(-129.0), -128);
  EXPECT_EQ(truncated<std::int8_t>(-1.9), -1);
  EXPECT_EQ(truncated<std::int64_t>(infinity), int64Max);
  EXPECT_EQ(truncated<std::int64_t>(-infinity), int64Min);
  EXPECT_EQ(truncated<std::int64_t>(std::nan("")), 0);
}

TEST(Numbers, IntegerEndsAtTheFirstOtherCharacter) {
  EXPECT_EQ(leadingInteger("12abc"), 12);
  EXPECT_EQ(leadingInteger("12.9"), 12);
  EXPECT_EQ(leadingInteger("12 34"), 12);
  EXPECT_EQ(leadingInteger("1,000"), 1);
  EXPECT_EQ(leadingInteger("0x10"), 0);
  EXPECT_EQ(leadingInteger("1e3"), 1);
}

TEST(Numbers, IntegerTakesWhiteSpaceAndOneSign) {
  EXPECT_EQ(leadingInteger(" \t\n\v\f\r7"), 7);
  EXPECT_EQ(leadingInteger("  -7"), -7);
  EXPECT_EQ(leadingInteger("  +7"), 7);
  EXPECT_EQ(leadingInteger("- 7"), 0);
  EXPECT_EQ(leadingInteger("--7"), 0);
  EXPECT_EQ(leadingInteger("-"), 0);
  EXPECT_EQ(leadingInteger(" "), 0);
  EXPECT_EQ(leadingInteger(""), 0);
}

TEST(Numbers, IntegerSaturatesExactlyAtTheEnds) {
  EXPECT_EQ(leadingInteger("9223372036854775806"), int64Max - 1);
  EXPECT_EQ(leadingInteger("9223372036854775807"), int64Max);
  EXPECT_EQ(leadingInteger("9223372036854775808"), int64Max);
  EXPECT_EQ(leadingInteger("9223372036854775810"), int64Max);
  EXPECT_EQ(leadingInteger("-9223372036854775807"), int64Min + 1);
  EXPECT_EQ(leadingInteger("-9223372036854775808"), int64Min);
  EXPECT_EQ(leadingInteger("-9223372036854775809"), int64Min);
  EXPECT_EQ(leadingInteger("1" + zeros(100)), int64Max);
  EXPECT_EQ(leadingInteger("-1" + zeros(100)), int64Min);
  EXPECT_EQ(leadingInteger(zeros(100) + "5"), 5);
}

TEST(Numbers, FloatTakesFractionAndExponent) {
  EXPECT_EQ(leadingFloat("1.5"), 1.5f);
  EXPECT_EQ(leadingFloat(" -1.5e2x"), -150.0f);
  EXPECT_EQ(leadingFloat("+25e-2"), 0.25f);
  EXPECT_EQ(leadingFloat("2E1"), 20.0f);
  EXPECT_EQ(leadingFloat(".5"), 0.5f);
  EXPECT_EQ(leadingFloat("5."), 5.0f);
  EXPECT_EQ(leadingFloat("1.2.3"), 1.2f);
  EXPECT_EQ(leadingDouble("0.1"), 0.1);
}

TEST(Numbers, ExponentWithoutDigitsIsNotPartOfTheNumber) {
  EXPECT_EQ(leadingDouble("3e"), 3.0);
  EXPECT_EQ(leadingDouble("3e+"), 3.0);
  EXPECT_EQ(leadingDouble("3ex"), 3.0);
}

TEST(Numbers, NamesOfNumbersAreNotNumbers) {
  for (const char* text : {"inf", "-inf", "infinity", "nan", "NAN(1)", "e1", ".", "-.", ".e1", "x"})
    EXPECT_EQ(leadingDouble(text), 0.0) << text;
  EXPECT_EQ(leadingDouble("0x1p4"), 0.0);
}

TEST(Numbers, FloatIsRoundedOnce) {
  // Halfway between 1 and the next float, and a little more than that: by way of a double, which
  // cannot hold the little more, this would become 1.
  EXPECT_EQ(leadingFloat("1.00000005960464477539062500001"), std::bit_cast<float>(0x3F800001u));
  EXPECT_EQ(leadingFloat("1.000000059604644775390625"), 1.0f);
}

TEST(Numbers, FloatOutOfRangeIsInfinite) {
  EXPECT_EQ(leadingFloat("3.4028235e38"), std::numeric_limits<float>::max());
  EXPECT_EQ(leadingFloat("3.5e38"), std::numeric_limits<float>::infinity());
  EXPECT_EQ(leadingFloat("-1e39"), -std::numeric_limits<float>::infinity());
  EXPECT_EQ(leadingDouble("1e39"), 1e39);
  EXPECT_EQ(leadingDouble("1e309"), infinity);
  EXPECT_EQ(leadingDouble("-1e309"), -infinity);
  EXPECT_EQ(leadingDouble("1" + zeros(400)), infinity);
  EXPECT_EQ(leadingDouble("1" + zeros(400) + "x9"), infinity);
  EXPECT_EQ(leadingDouble("1e99999999999999999999999"), infinity);
  EXPECT_EQ(leadingDouble("1E99999999999999999999999"), infinity);
}

TEST(Numbers, FloatTooSmallIs0WithItsSign) {
  EXPECT_EQ(leadingFloat("1e-45"), std::numeric_limits<float>::denorm_min());
  EXPECT_EQ(leadingFloat("1e-60"), 0.0f);
  EXPECT_EQ(leadingDouble("1e-60"), 1e-60);
  EXPECT_EQ(leadingDouble("1e-400"), 0.0);
  EXPECT_EQ(leadingDouble("0." + zeros(400) + "1"), 0.0);
  EXPECT_EQ(leadingDouble("1e-99999999999999999999999"), 0.0);
  EXPECT_EQ(leadingDouble("123456e-500"), 0.0);
  EXPECT_TRUE(std::signbit(leadingDouble("-1e-400")));
  EXPECT_TRUE(std::signbit(leadingDouble("-0")));
  EXPECT_FALSE(std::signbit(leadingDouble("1e-400")));
}

TEST(Numbers, ZeroStays0WhateverItsExponent) {
  EXPECT_EQ(leadingDouble("0e99999999999999999999999"), 0.0);
  EXPECT_EQ(leadingDouble("0.000e500"), 0.0);
  EXPECT_EQ(leadingFloat("0" + zeros(400)), 0.0f);
}

TEST(Numbers, DigitsAndExponentThatWorkAgainstEachOther) {
  EXPECT_EQ(leadingDouble("0." + zeros(400) + "1e401"), 1.0);
  EXPECT_EQ(leadingDouble("1" + zeros(400) + "e-400"), 1.0);
  EXPECT_EQ(leadingDouble("0." + zeros(400) + "1e500"), 1e99);
  // 10^-3001 times 10^4000, and 10^3000 times 10^-4000: out of range towards the exponent's side.
  EXPECT_EQ(leadingDouble("0." + zeros(3000) + "1e4000"), infinity);
  EXPECT_EQ(leadingDouble("1" + zeros(3000) + "e-4000"), 0.0);
}

// A locale whose decimal point is a comma: its rules must not reach us.
class Comma : public std::numpunct<char> {
 protected:
  char do_decimal_point() const override { return ','; }
  char do_thousands_sep() const override { return '.'; }
  std::string do_grouping() const override { return "\3"; }
};

TEST(Numbers, DoNotDependOnTheLocale) {
  const std::locale before = std::locale::global(std::locale(std::locale(), new Comma));
  const std::string cBefore = std::setlocale(LC_ALL, nullptr);
  // Few machines have one of these; on the others the locale above has to do.
  for (const char* name : {"de_DE.UTF-8", "fr_FR.UTF-8", "nl_NL.UTF-8", "de_DE", "fr_FR"}) {
    if (std::setlocale(LC_ALL, name) != nullptr) break;
  }
  EXPECT_EQ(leadingFloat("1.5"), 1.5f);
  EXPECT_EQ(leadingDouble("1,5"), 1.0);
  EXPECT_EQ(leadingInteger("1.000"), 1);
  EXPECT_EQ(leadingDouble("1.000,5"), 1.0);
  std::setlocale(LC_ALL, cBefore.c_str());
  std::locale::global(before);
}

}  // namespace
}  // namespace oxmv::test
