#include <cstdint>
#include <limits>
#include <new>
#include <optional>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/platform/TomlOutline.h"
#include "oxmv/platform/TomlText.h"
#include "oxmv/values/Array.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/SmallStack.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv {
namespace {

Dictionary valuesOf(const std::string& text) {
  const auto parsed = TomlText::parse(text);
  EXPECT_TRUE(parsed) << text;
  return parsed ? parsed->values() : Dictionary();
}

// The text after a change; "refused" when it cannot be made.
std::string with(const std::string& text, std::string_view key, const Value& value) {
  const auto parsed = TomlText::parse(text);
  EXPECT_TRUE(parsed) << text;
  const auto result = parsed ? parsed->with(key, value) : std::nullopt;
  return result ? result->text() : "refused";
}

std::string without(const std::string& text, std::string_view key) { return with(text, key, {}); }

TomlProblem problemOf(const std::string& text) {
  TomlProblem problem;
  EXPECT_FALSE(TomlText::parse(text, &problem)) << text;
  EXPECT_FALSE(TomlText::parse(text)) << text;
  return problem;
}

TEST(TomlText, GivesTextsAndNumbers) {
  EXPECT_EQ(
      valuesOf("LUTsPath = \"/looks/\\u00e9\"\n'a b' = 'c'\n\"n\" = -7\nf = 2.5\nx = 0xFF"),
      (Dictionary{{"LUTsPath", "/looks/é"}, {"a b", "c"}, {"n", -7}, {"f", 2.5}, {"x", 255}}));
  EXPECT_EQ(valuesOf(""), Dictionary());
  EXPECT_EQ(valuesOf("# nothing"), Dictionary());
}

TEST(TomlText, GivesWhatIsNeitherAsSomethingElseThanText) {
  const auto time = [](std::string_view text) { return Value::data(test::bytesOf(text)); };
  EXPECT_EQ(valuesOf("yes = true\nno = false"), (Dictionary{{"yes", 1}, {"no", 0}}));
  EXPECT_EQ(valuesOf("moment = 1979-05-27 07:32:00.5-07:00\nday = 1979-05-27\nhour = 07:32:00"),
            (Dictionary{{"moment", time("1979-05-27T07:32:00.5-07:00")},
                        {"day", time("1979-05-27")},
                        {"hour", time("07:32:00")}}));
  EXPECT_EQ(valuesOf("list = [1, \"two\", [3.0]]"),
            (Dictionary{{"list", Array::of(1, "two", Array::of(3.0))}}));
}

TEST(TomlText, GivesTablesUnderTheirFirstKey) {
  const Dictionary expected = {{"a", Dictionary{{"b", 1}, {"c", Dictionary{{"d", 2}}}}}};
  EXPECT_EQ(valuesOf("a = { b = 1, c = { d = 2 } }"), expected);
  EXPECT_EQ(valuesOf("a.b = 1\na.c.d = 2"), expected);
  EXPECT_EQ(valuesOf("[a]\nb = 1\n[a.c]\nd = 2"), expected);
  EXPECT_EQ(valuesOf("\"a.b\" = 1"), (Dictionary{{"a.b", 1}}));
}

TEST(TomlText, LooksPastAByteOrderMark) {
  EXPECT_EQ(valuesOf("\xEF\xBB\xBF"
                     "a = 1"),
            (Dictionary{{"a", 1}}));
}

TEST(TomlText, KeepsWhatALineBeginsWithThatContinuesAnother) {
  EXPECT_EQ(
      valuesOf("a = \"\"\"x\\\n  é\\\n\xC2\xA0\\\n\xEF\xB9\xBF\\\n\xF0\x9F\x8E\xA5\"\"\"")["a"],
      Value("xé\xC2\xA0\xEF\xB9\xBF\xF0\x9F\x8E\xA5"));
}

TEST(TomlText, SaysWhereATextIsNotToml) {
  EXPECT_EQ(problemOf("a = 1\n\nb == 2").line, 3u);
  EXPECT_NE(problemOf("a = 1\n\nb == 2").message, "");
  EXPECT_EQ(problemOf("a = 1\na = 2").line, 2u);       // twice
  EXPECT_EQ(problemOf("a = \"x").line, 1u);            // without end
  EXPECT_EQ(problemOf("a = 1\nb = '\xFF'").line, 2u);  // not UTF-8
  EXPECT_EQ(problemOf("a = '\xED\xA0\x80'").line, 1u);
  EXPECT_EQ(problemOf("a = 1\né = 2").line, 2u);
  EXPECT_NE(problemOf("a = \"\"\"\\\n\xFF\"\"\"").line, 0u);
  EXPECT_EQ(problemOf("a = \"\\uD800\"").line, 1u);
  EXPECT_EQ(problemOf(std::string("a = 1\n\0", 7)).line, 2u);
  EXPECT_EQ(problemOf("a = 1\rb = 2").line, 1u);
  EXPECT_EQ(problemOf("a = 9223372036854775808").line, 1u);
}

TEST(TomlText, RefusesAnyTextThatNestsTooDeep) {
  std::string dotted = "a = 1\nk";
  for (std::size_t i = 0; i < maxTomlNesting; ++i) dotted += ".k";
  const TomlProblem problem = problemOf(dotted + " = 1");
  EXPECT_EQ(problem.line, 2u);
  EXPECT_EQ(problem.message, "nested deeper than 8 levels");
}

TEST(TomlText, NeedsLittleStackForTheDeepestText) {
  std::string key = "k";
  for (std::size_t i = 1; i < maxTomlNesting; ++i) key += ".k";
  std::string text = "[" + key + "]\n" + key + " = ";
  for (std::size_t i = 0; i < maxTomlNesting; ++i) text += "{" + key + "=";
  text += "1";
  text += std::string(maxTomlNesting, '}');
  bool isRead = false;
  const std::size_t used =
      test::stackUsedBy([&] { isRead = TomlText::parse(text).has_value(); }, std::size_t{1} << 20);
  EXPECT_TRUE(isRead);
#ifndef OXMV_ADDRESS_SANITIZER
  EXPECT_LE(used, std::size_t{64} << 10);
#else
  EXPECT_LE(used, std::size_t{1} << 20);
#endif
}

TEST(TomlText, NeedsNoStackForTextsThatNestDeeper) {
  // A level for every other byte would take more stack than there is.
  constexpr std::size_t largeSize = std::size_t{1} << 20;
  std::string hostile = "k";
  while (hostile.size() < largeSize) hostile += ".k";
  problemOf(hostile + "=1");
  problemOf("[" + hostile + "]");
  problemOf("a = {" + hostile + "=1}");
  problemOf("a = " + std::string(largeSize, '['));
}

TEST(TomlText, ReplacesTheCharactersOfAValueOnly) {
  const std::string text =
      "# my looks\r\n  LUTsPath\t=  '/old' \t# slow\r\nother = 1\r\n[table]\r\nLUTsPath = 3";
  EXPECT_EQ(
      with(text, "LUTsPath", "/new"),
      "# my looks\r\n  LUTsPath\t=  \"/new\" \t# slow\r\nother = 1\r\n[table]\r\nLUTsPath = 3");
  EXPECT_EQ(
      with(text, "other", "one"),
      "# my looks\r\n  LUTsPath\t=  '/old' \t# slow\r\nother = \"one\"\r\n[table]\r\nLUTsPath = "
      "3");
  EXPECT_EQ(with("\xEF\xBB\xBF"
                 "a=1",
                 "a", 2),
            "\xEF\xBB\xBF"
            "a=2");
}

TEST(TomlText, ReplacesValuesBehindOtherCharactersThanAscii) {
  EXPECT_EQ(with("\"é\" = '\xF0\x9F\x8E\xA5' # ü\nb = 2 # ö", "é", "x"),
            "\"é\" = \"x\" # ü\nb = 2 # ö");
  EXPECT_EQ(with("a = 'é' # ü\nb = 2 # ö", "b", 3), "a = 'é' # ü\nb = 3 # ö");
}

TEST(TomlText, ReplacesAValueOfSeveralLinesWhole) {
  EXPECT_EQ(with("a = \"\"\"\none\n# two\n\"\"\" # end\nb = 2", "a", "x"),
            "a = \"x\" # end\nb = 2");
  EXPECT_EQ(with("a = '''\none'''''\nb = 2", "a", "x"), "a = \"x\"\nb = 2");
  EXPECT_EQ(with("a = [\n 1, # one\n] # end\nb = 2", "a", "x"), "a = \"x\" # end\nb = 2");
  EXPECT_EQ(with("a = { b = [\n1] }\n", "a", "x"), "a = \"x\"\n");
}

TEST(TomlText, FindsAKeyHoweverItIsWritten) {
  EXPECT_EQ(with("\"OverridePath\" = 1", "OverridePath", "x"), "\"OverridePath\" = \"x\"");
  EXPECT_EQ(with("'OverridePath' = 1", "OverridePath", "x"), "'OverridePath' = \"x\"");
  EXPECT_EQ(with("\"Override\\u0050ath\" = 1", "OverridePath", "x"),
            "\"Override\\u0050ath\" = \"x\"");
  EXPECT_EQ(with("\"a.b\" = 1\na.b = 2", "a.b", 3), "\"a.b\" = 3\na.b = 2");
  EXPECT_EQ(with("\"\" = 1", "", 2), "\"\" = 2");
}

TEST(TomlText, PutsANewKeyBehindTheLastAtTheTop) {
  EXPECT_EQ(with("", "a", 1), "a = 1\n");
  EXPECT_EQ(with("\xEF\xBB\xBF", "a", 1),
            "\xEF\xBB\xBF"
            "a = 1\n");
  EXPECT_EQ(with("# mine\n", "a", 1), "# mine\na = 1\n");
  EXPECT_EQ(with("b = 1 # one\n\n# table\n[t]\nc = 2\n", "a", 1),
            "b = 1 # one\na = 1\n\n# table\n[t]\nc = 2\n");
  EXPECT_EQ(with("b = [\n1,\n]\n[t]", "a", 1), "b = [\n1,\n]\na = 1\n[t]");
  EXPECT_EQ(with("b = 1\r\n[t]", "a", 1), "b = 1\r\na = 1\r\n[t]");
}

TEST(TomlText, PutsAFirstKeyBeforeTheTablesAndTheirComments) {
  EXPECT_EQ(with("[t]\nc = 2\n", "a", 1), "a = 1\n[t]\nc = 2\n");
  EXPECT_EQ(with("# mine\n\n  # table\n# of tables\n[t]", "a", 1),
            "# mine\n\na = 1\n  # table\n# of tables\n[t]");
  EXPECT_EQ(with("# table\n[t]", "a", 1), "a = 1\n# table\n[t]");
  EXPECT_EQ(with("\n[t]", "a", 1), "\na = 1\n[t]");
  EXPECT_EQ(with("\xEF\xBB\xBF# table\n[t]", "a", 1),
            "\xEF\xBB\xBF"
            "a = 1\n# table\n[t]");
}

TEST(TomlText, LeavesALastLineOpen) {
  EXPECT_EQ(with("b = 1", "a", 1), "b = 1\na = 1");
  EXPECT_EQ(with("b = 1\r\nc = 2", "a", 1), "b = 1\r\nc = 2\r\na = 1");
  EXPECT_EQ(with("# mine", "a", 1), "# mine\na = 1");
}

TEST(TomlText, WritesKeysInQuotesWhereTheyNeedThem) {
  EXPECT_EQ(with("", "a-B_9", 1), "a-B_9 = 1\n");
  EXPECT_EQ(with("", "azAZ09", 1), "azAZ09 = 1\n");
  for (const std::string beside : {"`", "{", "@", "[", "/", ":"})
    EXPECT_EQ(with("", "a" + beside, 1), "\"a" + beside + "\" = 1\n");
  EXPECT_EQ(with("", "", 1), "\"\" = 1\n");
  EXPECT_EQ(with("", "a.b \"\n", 1), "\"a.b \\\"\\n\" = 1\n");
  EXPECT_EQ(with("", "\xE9", 1), "\"é\" = 1\n");  // ISO-8859-1
}

TEST(TomlText, RemovesALineWithItsComment) {
  EXPECT_EQ(without("# first\na = 1 # one\n  # second\nb = 2\n", "a"),
            "# first\n  # second\nb = 2\n");
  EXPECT_EQ(without("a = 1\r\n\r\n b = [\r\n2] # two", "b"), "a = 1\r\n\r\n");
  EXPECT_EQ(without("a = 1", "a"), "");
  EXPECT_EQ(without("\xEF\xBB\xBF"
                    "a = 1\nb = 2",
                    "a"),
            "\xEF\xBB\xBF"
            "b = 2");
}

TEST(TomlText, RemovesNothingThatIsNotThere) {
  EXPECT_EQ(without("b = 1\n[a.c]\n", "c"), "b = 1\n[a.c]\n");
  EXPECT_EQ(without("", "a"), "");
}

TEST(TomlText, ReplacesTablesByAValue) {
  EXPECT_EQ(with("# 1\na.b = 1\nz = 0\n# 2\na.c = 2 # x\n[t]", "a", "v"),
            "# 1\na = \"v\"\nz = 0\n# 2\n[t]");
  EXPECT_EQ(with("z = 0\n[a]\nb = 1 # x\n# 2\n[t]\na = 1\n[a.c]\nd = 1", "a", "v"),
            "z = 0\na = \"v\"\n# 2\n[t]\na = 1\n");
  EXPECT_EQ(with("[[a]]\nb = 1\n[[a]]\nb = 2\n", "a", "v"), "a = \"v\"\n");
  EXPECT_EQ(without("[a]\nb = 1\n[c]\n", "a"), "[c]\n");
}

TEST(TomlText, ChangesNothingWhereTheValueIsThere) {
  const std::string text = "a = 'x' # 1\nb = 0x10\nc = 1_0.5\nd = [ 1,2 ]\n";
  EXPECT_EQ(with(text, "a", "x"), text);
  EXPECT_EQ(with(text, "b", 16), text);
  EXPECT_EQ(with(text, "c", 10.5), text);
  EXPECT_EQ(with(text, "c", 10.5f), text);
  EXPECT_EQ(with(text, "d", Array::of(1, 2)), text);
}

TEST(TomlText, EscapesWhatTomlWantsEscaped) {
  EXPECT_EQ(with("", "a", std::string_view("\0\b\t\n\f\r\x1B\x1F\"\\\x7F", 11)),
            "a = \"\\u0000\\u0008\\t\\n\\u000C\\u000D\\u001B\\u001F\\\"\\\\\\u007F\"\n");
  EXPECT_EQ(with("", "a", "é\xF0\x9F\x8E\xA5'#\xC2\x80"), "a = \"é\xF0\x9F\x8E\xA5'#\xC2\x80\"\n");
}

TEST(TomlText, KeepsEveryCharacterOfAText) {
  for (int c = 0; c < 0x80; ++c) {
    const std::string value = {'a', static_cast<char>(c), '"', '\''};
    EXPECT_EQ(valuesOf(with("", "k", value))["k"], Value(value)) << c;
  }
}

TEST(TomlText, WritesNumbers) {
  const auto literal = [](const Value& value) { return with("", "a", value).substr(4); };
  EXPECT_EQ(literal(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808\n");
  EXPECT_EQ(literal(5.0), "5.0\n");
  EXPECT_EQ(literal(-0.0), "-0.0\n");
  EXPECT_EQ(literal(0.1), "0.1\n");
  EXPECT_EQ(literal(0.1f), "0.1\n");
  EXPECT_EQ(literal(1e300), "1e+300\n");
  EXPECT_EQ(literal(std::numeric_limits<double>::infinity()), "inf\n");
  EXPECT_EQ(literal(-std::numeric_limits<float>::infinity()), "-inf\n");
  EXPECT_EQ(literal(std::numeric_limits<double>::quiet_NaN()), "nan\n");
  EXPECT_EQ(literal(-std::numeric_limits<double>::quiet_NaN()), "-nan\n");
  EXPECT_EQ(literal(std::numeric_limits<float>::quiet_NaN()), "nan\n");
  EXPECT_EQ(literal(-std::numeric_limits<float>::quiet_NaN()), "-nan\n");
}

TEST(TomlText, NumbersComeBack) {
  for (const double number : {5.0, -0.0, 0.1, 1e300, 5e-324, 1.7976931348623157e308,
                              std::numeric_limits<double>::infinity()}) {
    EXPECT_EQ(valuesOf(with("", "a", number))["a"], Value(number));
  }
  EXPECT_EQ(valuesOf(with("", "a", 16777217.0f / 3))["a"].floatValue(), 16777217.0f / 3);
}

TEST(TomlText, WritesArraysAndDictionariesInOneLine) {
  EXPECT_EQ(with("", "a", Array::of(1, "b", Array())), "a = [1, \"b\", []]\n");
  EXPECT_EQ(with("", "a", Dictionary{{"b c", 1}, {"d", Dictionary()}}),
            "a = { \"b c\" = 1, d = {} }\n");
}

TEST(TomlText, RefusesValuesThatHaveNoForm) {
  EXPECT_EQ(with("b = 1", "a", Value::data({})), "refused");
  EXPECT_EQ(with("b = 1", "a", Array::of(Value::data({}))), "refused");
  EXPECT_EQ(with("b = 1", "a", Dictionary{{"c", Value::data({})}}), "refused");
  Value deep = 1;
  for (std::size_t i = 0; i < maxTomlNesting; ++i) deep = Array::of(deep);
  EXPECT_NE(with("", "a", deep), "refused");
  EXPECT_EQ(with("", "a", Array::of(deep)), "refused");
  EXPECT_EQ(with("", "a", Dictionary{{"b", deep}}), "refused");
  deep = 1;
  for (std::size_t i = 0; i < maxTomlNesting; ++i) deep = Dictionary{{"b", deep}};
  EXPECT_EQ(with("", "a", Dictionary{{"b", deep}}), "refused");
}

TEST(TomlText, ThrowsOnlyWhenThereIsNoMemory) {
  const std::string text =
      "a = \"\"\"a text that is too long to be kept in place\\\n "
      "é\"\"\"\n[a-long-key-that-takes-memory.b]\n"
      "c = [1979-05-27, { d = 1 }]\n";
  const std::string wrong = text + "[[a-long-key-that-takes-memory]]\n";
  for (const std::string& each : {text, wrong}) {
    bool wasFelt = true;
    for (std::size_t granted = 0; wasFelt; ++granted) {
      const test::MemoryShortage shortage(granted);
      try {
        const auto parsed = TomlText::parse(each);
        if (parsed) (void)parsed->with("another long key that takes memory", "a value");
      } catch (const std::bad_alloc&) {
      }
      wasFelt = shortage.wasFelt();
    }
  }
}

TEST(TomlText, ReadsOrRefusesATextWhereverItIsCut) {
  const std::string text =
      "\xEF\xBB\xBF# é\r\na = \"\\u00e9\" # x\n'b'.\"c\" = [1, { d = '''x''''' }]\n[[e.f]] # g\nh "
      "= "
      "\"\"\"\\\n\"\"\"\ni = 1979-05-27 07:32:00.25Z\n";
  EXPECT_TRUE(TomlText::parse(text));
  for (std::size_t size = 0; size < text.size(); ++size) {
    const auto cut = TomlText::parse(text.substr(0, size));
    if (!cut) continue;
    const auto changed = cut->with("new", "x");
    ASSERT_TRUE(changed) << size;
    EXPECT_EQ(changed->values()["new"], Value("x"));
  }
}

TEST(TomlText, HasNoFormForNothingWithinAnArray) {
  EXPECT_EQ(TomlText().with("a", Array::of(1, Value())), std::nullopt);
}

}  // namespace
}  // namespace oxmv
