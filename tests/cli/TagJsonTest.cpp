#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>

#include <gtest/gtest.h>

#include "cli/TagJson.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/values/Array.h"
#include "tests/support/StreamBuilder.h"

namespace oxmv::cli::test {
namespace {

using oxmv::test::StreamBuilder;

std::string written(const Value& value) {
  StringSink sink;
  JsonWriter json(sink);
  writeTagJson(json, value);
  return sink.text;
}

Dictionary read(std::string_view text) {
  auto result = readTagJson(text);
  if (const auto* error = std::get_if<JsonError>(&result)) {
    ADD_FAILURE() << text << ": " << error->message;
    return {};
  }
  return std::get<Dictionary>(result);
}

// "line:column code: message"
std::string errorIn(std::string_view text) {
  const auto result = readTagJson(text);
  const auto* error = std::get_if<JsonError>(&result);
  if (error == nullptr) return "none";
  return std::to_string(error->line) + ':' + std::to_string(error->column) + ' ' +
         std::string(error->code) + ": " + error->message;
}

// Writing.

TEST(TagJson, WritesIntegersBare) {
  EXPECT_EQ(written(0), "0");
  EXPECT_EQ(written(-5), "-5");
  EXPECT_EQ(written(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
}

TEST(TagJson, WritesFloatsWithTheFewestDigitsAndNeverLikeIntegers) {
  EXPECT_EQ(written(1.0f), "1.0");
  EXPECT_EQ(written(0.1f), "0.1");
  EXPECT_EQ(written(-0.0f), "-0.0");
  EXPECT_EQ(written(1e-45f), "1e-45");
  EXPECT_EQ(written(1e20f), "1e+20");
  EXPECT_EQ(written(16777216.0f), "16777216.0");
  EXPECT_EQ(written(std::numeric_limits<float>::max()), "3.4028235e+38");
}

TEST(TagJson, WritesDoublesWithTheirOwnDigits) {
  EXPECT_EQ(written(0.1), "0.1");
  EXPECT_EQ(written(static_cast<double>(0.1f)), "0.10000000149011612");
  EXPECT_EQ(written(2.0), "2.0");
}

TEST(TagJson, WritesFloatsThatAreNotFiniteByTheirBits) {
  EXPECT_EQ(written(std::bit_cast<float>(0x7fc00000u)), R"({"$float":"0x7fc00000"})");
  EXPECT_EQ(written(std::bit_cast<float>(0xffc12345u)), R"({"$float":"0xffc12345"})");
  EXPECT_EQ(written(-std::numeric_limits<float>::infinity()), R"({"$float":"0xff800000"})");
  EXPECT_EQ(written(std::numeric_limits<double>::infinity()), R"({"$float":"0x7f800000"})");
}

TEST(TagJson, WritesTextEscapingWhatMustNotBeSeen) {
  EXPECT_EQ(written("a\"b\\c/d"), R"("a\"b\\c/d")");
  EXPECT_EQ(written(std::string_view("\0\x1B\n\x7F", 4)), R"("\u0000\u001b\u000a\u007f")");
  EXPECT_EQ(written("é\xC2\x9B\xE2\x80\xAE\xE2\x81\xA6\xE2\x80\xA8"),
            "\"é\\u009b\\u202e\\u2066\\u2028\"");
  EXPECT_EQ(written("\xF0\x9F\x8E\xA5"), "\"\xF0\x9F\x8E\xA5\"");
}

TEST(TagJson, WritesDataAsHexadecimalDigits) {
  EXPECT_EQ(written(Value::data(std::vector<std::uint8_t>{0x00, 0xFF, 0x80})),
            R"({"$data":"00ff80"})");
  EXPECT_EQ(written(Value::data({})), R"({"$data":""})");
}

TEST(TagJson, WritesMembersInTheOrderOfTheDictionary) {
  EXPECT_EQ(written(Dictionary{{"b", 1}, {"a", Array::of(1, 2.5f, "x")}, {"c", Dictionary()}}),
            R"({"b":1,"a":[1,2.5,"x"],"c":{}})");
}

TEST(TagJson, PutsADollarBeforeNamesThatBeginWithOne) {
  EXPECT_EQ(written(Dictionary{{"$data", "x"}, {"$$", 1}, {"a$", 2}}),
            R"({"$$data":"x","$$$":1,"a$":2})");
}

// Reading.

TEST(TagJson, ReadsEveryKind) {
  const Dictionary expected = {
      {"i", -5},
      {"f", 1.5f},
      {"t", "x"},
      {"d", Value::data(std::vector<std::uint8_t>{0, 255})},
      {"n", std::bit_cast<float>(0x7fc00001u)},
      {"a", Array::of(1, 2.0f, "three")},
      {"o", Dictionary{{"x", 1}}},
      {"ea", Array()},
      {"eo", Dictionary()},
  };
  EXPECT_EQ(read(R"({"i":-5,"f":1.5,"t":"x","d":{"$data":"00fF"},"n":{"$float":"0x7FC00001"},)"
                 R"("a":[1,2.0,"three"],"o":{"x":1},"ea":[],"eo":{}})"),
            expected);
}

TEST(TagJson, KeepsTheOrderOfMembers) {
  const Dictionary tags = read(R"({"b":1,"a":2,"c":3})");
  std::string keys;
  for (const auto& entry : tags) keys += entry.key;
  EXPECT_EQ(keys, "bac");
}

TEST(TagJson, TellsIntegersFromFloatsByTheirSpelling) {
  const Dictionary tags = read(R"({"a":1,"b":1.0,"c":1e0,"d":1E+2,"e":-0,"f":-0.0})");
  EXPECT_EQ(tags["a"].kind(), Value::Kind::integer);
  for (const char* key : {"b", "c", "d", "f"})
    EXPECT_EQ(tags[key].kind(), Value::Kind::float32) << key;
  EXPECT_EQ(tags["d"].floatValue(), 100.0f);
  EXPECT_EQ(tags["e"], Value(0));
  EXPECT_TRUE(std::signbit(tags["f"].floatValue()));
}

TEST(TagJson, ReadsIntegersOf64Bits) {
  const Dictionary tags = read(R"({"a":9223372036854775807,"b":-9223372036854775808})");
  EXPECT_EQ(tags["a"].int64Value(), std::numeric_limits<std::int64_t>::max());
  EXPECT_EQ(tags["b"].int64Value(), std::numeric_limits<std::int64_t>::min());
}

TEST(TagJson, RoundsFloatsOnce) {
  // Just above the middle between 1 and the float behind it; as a double it is the middle itself,
  // which would be rounded down.
  EXPECT_EQ(read(R"({"a":1.00000005960464477540})")["a"].floatValue(), 1.00000011920928955f);
  EXPECT_EQ(read(R"({"a":1.00000005960464477539})")["a"].floatValue(), 1.0f);
}

TEST(TagJson, ReadsZeroForWhatIsNearerToItThanToAnyOtherFloat) {
  const std::string zeros = "0." + std::string(60, '0') + "1";
  const std::string many = "0." + std::string(400, '0') + "1e+10";
  for (const std::string number :
       {"1e-46", "7.0e-46", "1e-400", "1e-99999999999999999999", "123.5e-60", zeros.c_str(),
        many.c_str(), "0.0", "0e5", "0.0e99999999999999999999"}) {
    SCOPED_TRACE(number);
    const Value positive = read("{\"a\":" + number + "}")["a"];
    EXPECT_EQ(positive.kind(), Value::Kind::float32);
    EXPECT_EQ(positive.floatBits(), 0u);
    EXPECT_EQ(read("{\"a\":-" + number + "}")["a"].floatBits(), 0x80000000u);
  }
  EXPECT_EQ(read(R"({"a":7.1e-46})")["a"].floatBits(), 1u);
}

TEST(TagJson, ReadsNamesWithDollars) {
  const Dictionary expected = {{"$data", "x"}, {"$", 1}, {"$$a", 2}};
  EXPECT_EQ(read(R"({"$$data":"x","$$":1,"$$$a":2})"), expected);
}

TEST(TagJson, ReadsEscapesAndAByteOrderMark) {
  EXPECT_EQ(read("\xEF\xBB\xBF{\"a\":\"\\u00e9\\ud83c\\udfa5\\n\"}")["a"].text(),
            "é\xF0\x9F\x8E\xA5\n");
}

TEST(TagJson, ReadsBackEveryFloat) {
  for (std::uint64_t bits = 0; bits <= 0xFFFFFFFF; bits += 99991) {
    const auto number = std::bit_cast<float>(static_cast<std::uint32_t>(bits));
    const Dictionary tags = {{"a", number}};
    ASSERT_EQ(read(written(tags)), tags) << bits;
  }
}

// As deep as the decoder goes, with a group and a list of lists at the bottom.
TEST(TagJson, ReadsBackTheDeepestStreamThatIsDecoded) {
  const std::vector<std::uint8_t> point(8, 1);
  StreamBuilder stream;
  stream.record("TAGN", 'c', "a").record("TAGV", 'L', 1).record("CTLp", '\0', point);
  for (int i = 0; i < 62; ++i) stream = StreamBuilder().record("DSPm", '\0', stream.bytes());
  const Dictionary tags = MetadataDictionary().initWithData(stream.bytes()).metadata();
  EXPECT_EQ(read(written(tags)), tags);

  StreamBuilder group;
  group.record("TAGN", 'c', "a").record("TAGV", 'L', 1);
  for (int i = 0; i < 63; ++i) group = StreamBuilder().record("COL1", '\0', group.bytes());
  const Dictionary grouped = MetadataDictionary().initWithData(group.bytes()).metadata();
  EXPECT_NE(written(grouped).find("\"TAG \":{\"a\":1}"), std::string::npos);
  EXPECT_EQ(read(written(grouped)), grouped);
}

std::string nested(int levels, const std::string& inner) {
  std::string text = inner;
  for (int i = 0; i < levels; ++i) text = "{\"a\":" + text + "}";
  return text;
}

TEST(TagJson, RefusesMoreThan64Levels) {
  EXPECT_EQ(errorIn(nested(63, "{}")), "none");
  EXPECT_EQ(errorIn(nested(64, "{}")), "1:321 json-depth: nested deeper than 64 levels");
  EXPECT_EQ(errorIn(nested(63, "{\"TAG \":{}}")), "none");
  EXPECT_EQ(errorIn(nested(63, "{\"TAG \":{\"TAG \":{}}}")),
            "1:332 json-depth: nested deeper than 64 levels");
  EXPECT_EQ(errorIn(nested(64, "[1]")), "none");
  EXPECT_EQ(errorIn(nested(64, "[[1]]")), "1:322 json-depth: nested deeper than 64 levels");
  EXPECT_EQ(errorIn("{\"a\":" + std::string(100000, '[')),
            "1:70 json-depth: nested deeper than 64 levels");
}

TEST(TagJson, RefusesWhatIsNoObject) {
  EXPECT_EQ(errorIn("[1]"), "1:1 json-not-object: tags are an object: {...}");
  EXPECT_EQ(errorIn(" 5"), "1:2 json-not-object: tags are an object: {...}");
  EXPECT_EQ(errorIn("\"x\""), "1:1 json-not-object: tags are an object: {...}");
}

TEST(TagJson, RefusesMembersOfTheSameName) {
  EXPECT_EQ(errorIn("{\"a\":1,\n  \"a\":2}"), "2:3 json-duplicate: member \"a\" stands twice");
  EXPECT_EQ(errorIn("{\"é\":1, \"\\u00e9\":2}"), "1:9 json-duplicate: member \"é\" stands twice");
  EXPECT_EQ(errorIn("{\"a\\\"\\\\\":1,\"a\\\"\\\\\":2}"),
            "1:12 json-duplicate: member \"a\"\\\" stands twice");
  EXPECT_EQ(errorIn("{\"x\":{\"a\":1},\"y\":{\"a\":1}}"), "none");
}

TEST(TagJson, RefusesWordsThatAreNoValues) {
  EXPECT_EQ(errorIn("{\"a\":true}"), "1:6 json-literal: true has no place in a dictionary");
  EXPECT_EQ(errorIn("{\"a\":\n[1, false]}"),
            "2:5 json-literal: false has no place in a dictionary");
  EXPECT_EQ(errorIn("null"), "1:1 json-literal: null has no place in a dictionary");
}

TEST(TagJson, RefusesIntegersOfMoreThan64Bits) {
  EXPECT_EQ(errorIn("{\"a\":9223372036854775808}"),
            "1:6 json-integer-range: the integer does not fit 64 bits");
  EXPECT_EQ(errorIn("{\"a\": -9223372036854775809 }"),
            "1:7 json-integer-range: the integer does not fit 64 bits");
  EXPECT_EQ(errorIn("{\"a\":[1,18446744073709551616]}"),
            "1:9 json-integer-range: the integer does not fit 64 bits");
  EXPECT_EQ(errorIn("{\"a\":" + std::string(400, '9') + "}"),
            "1:6 json-integer-range: the integer does not fit 64 bits");
}

TEST(TagJson, RefusesFloatsOutOfRange) {
  const std::string message = "1:6 json-float-range: the number does not fit a float";
  const std::string digits = "1" + std::string(400, '0') + "e-10";
  for (const char* number : {"3.5e38", "-1e39", "1e400", "1e99999999999", digits.c_str()})
    EXPECT_EQ(errorIn("{\"a\":" + std::string(number) + "}"), message) << number;
  EXPECT_EQ(errorIn("{\"a\":0e999}"), "none");
  EXPECT_EQ(errorIn("{\"a\":3.4028235e38}"), "none");
}

TEST(TagJson, RefusesNamesWithADollarThatMeanNothing) {
  EXPECT_EQ(errorIn("{\"$x\":1}"),
            "1:2 json-dollar: \"$x\" means nothing; a name that begins with $ is written with $$");
  EXPECT_EQ(errorIn("{\"$\":1}"),
            "1:2 json-dollar: \"$\" means nothing; a name that begins with $ is written with $$");
  EXPECT_EQ(errorIn("{\"$data\":\"00\"}"),
            "1:2 json-dollar: $data stands alone in an object of its own");
  EXPECT_EQ(errorIn("{\"a\":{\"b\":1,\"$data\":\"\"}}"),
            "1:13 json-dollar: $data stands alone in an object of its own");
  EXPECT_EQ(errorIn("{\"a\":{\"$data\":\"\",\"b\":1}}"),
            "1:18 json-dollar: $data and $float stand alone in their object");
  EXPECT_EQ(errorIn("{\"a\":{\"$data\":\"\",\"$data\":\"\"}}"),
            "1:18 json-dollar: $data and $float stand alone in their object");
}

TEST(TagJson, RefusesDataAndBitsThatAreNone) {
  for (const char* digits : {"0", "0g", "0x", " 00"})
    EXPECT_EQ(errorIn("{\"a\":{\"$data\":\"" + std::string(digits) + "\"}}"),
              "1:15 json-dollar: $data takes hexadecimal digits, two for each byte")
        << digits;
  for (const char* bits : {"", "7fc00000", "0x7fc0000", "0x7fc000000", "0x7fc0000g", "0x-fc00000"})
    EXPECT_EQ(errorIn("{\"a\":{\"$float\":\"" + std::string(bits) + "\"}}"),
              "1:16 json-dollar: $float takes the 32 bits, such as \"0x7fc00000\"")
        << bits;
  for (const char* value : {"5", "1.5", "[]", "{}"})
    EXPECT_EQ(errorIn("{\"a\":{\"$data\":" + std::string(value) + "}}"),
              "1:15 json-dollar: a text has to follow, of hexadecimal digits")
        << value;
}

TEST(TagJson, RefusesTrailingText) {
  EXPECT_EQ(errorIn("{\"a\":1} x"), "1:9 json-trailing-text: more text behind the tags");
  EXPECT_EQ(errorIn("{}\n{}"), "2:1 json-trailing-text: more text behind the tags");
  EXPECT_EQ(errorIn("{} \"xyz\""), "1:4 json-trailing-text: more text behind the tags");
  EXPECT_EQ(errorIn("{}\n \n"), "none");
}

TEST(TagJson, RefusesTextThatIsNotUtf8) {
  EXPECT_EQ(errorIn("{\"a\":\"\xFF\"}"), "1:7 json-utf8: the text is not UTF-8");
  EXPECT_EQ(errorIn("{\"a\":\"é\xC3(\"}"), "1:9 json-utf8: the text is not UTF-8");
  EXPECT_EQ(errorIn("\xFF"), "1:1 json-utf8: the text is not UTF-8");
}

TEST(TagJson, NamesTheCharacterWhereTheTextIsNoJson) {
  const auto placeOf = [](std::string_view text) {
    const std::string error = errorIn(text);
    return error.substr(0, error.find(':', error.find(':') + 1));
  };
  EXPECT_EQ(placeOf(""), "1:1 json-syntax");
  EXPECT_EQ(placeOf("{"), "1:2 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":1,}"), "1:8 json-syntax");
  EXPECT_EQ(placeOf("{\"a\" 1}"), "1:6 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":[1 2]}"), "1:9 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":\"x\"  \"y\"}"), "1:11 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":tru}"), "1:9 json-syntax");
  EXPECT_EQ(placeOf("{true:1}"), "1:2 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":-}"), "1:7 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":\"\n\"}"), "1:7 json-syntax");
  EXPECT_EQ(placeOf("{\"a\":\"abc"), "1:10 json-syntax");
  EXPECT_EQ(placeOf("{\n\n  \"a\": 1,\n  b: 2}"), "4:3 json-syntax");
  EXPECT_EQ(errorIn("{\"a\":1,}"), "1:8 json-syntax: unexpected '}'; expected string literal");
  // Whatever the text says of itself.
  EXPECT_EQ(placeOf("{\"a\":\"unexpected string UTF-8\n\"}"), "1:30 json-syntax");
  EXPECT_EQ(placeOf("{\"; last read: ; expected x\":tru}"), "1:33 json-syntax");
}

TEST(TagJson, SurvivesEveryCutText) {
  const std::string text =
      R"({"a":[1,-2.5e3,"\u00e9x"],"b":{"$data":"00ff"},"c":{"$float":"0x7fc00000"},"$$d":{}})";
  for (std::size_t size = 0; size < text.size(); ++size)
    EXPECT_NE(errorIn(text.substr(0, size)), "none") << size;
  EXPECT_EQ(errorIn(text), "none");
}

}  // namespace
}  // namespace oxmv::cli::test
