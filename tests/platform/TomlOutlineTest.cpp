#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/platform/TomlOutline.h"

namespace oxmv {
namespace {

using Texts = std::vector<std::string>;

Texts statements(std::string_view text) {
  Texts found;
  for (const auto& statement : outlineToml(text).statements)
    found.emplace_back(text.substr(statement.begin, statement.end - statement.begin));
  return found;
}

Texts values(std::string_view text) {
  Texts found;
  for (const auto& statement : outlineToml(text).statements) {
    found.emplace_back(
        text.substr(statement.valueBegin, statement.valueEnd - statement.valueBegin));
  }
  return found;
}

Texts firstKeys(std::string_view text) {
  Texts found;
  for (const auto& statement : outlineToml(text).statements) found.emplace_back(statement.firstKey);
  return found;
}

TEST(TomlOutline, FindsWholeLines) {
  EXPECT_EQ(statements("# first\na = 1\n\n  b = 2 # two\r\n\t\n[t] #\nc=3"),
            (Texts{"a = 1\n", "  b = 2 # two\r\n", "[t] #\n", "c=3"}));
  EXPECT_EQ(statements(""), Texts());
  EXPECT_EQ(statements("# nothing"), Texts());
  EXPECT_EQ(statements("\xEF\xBB\xBF"
                       "a = 1"),
            Texts{"a = 1"});
}

TEST(TomlOutline, FindsValuesWithoutWhatIsAroundThem) {
  EXPECT_EQ(values("a = 1"), Texts{"1"});
  EXPECT_EQ(values("a =1 \t# one\n"), Texts{"1"});
  EXPECT_EQ(values("a = 1979-05-27 07:32:00 \r\n"), Texts{"1979-05-27 07:32:00"});
  for (const std::string behind : {"", " ", " \n", " # 0"})
    EXPECT_EQ(values("a = 1979-05-27" + behind), Texts{"1979-05-27"}) << behind;
  EXPECT_EQ(values("a = \"#\\\"#\" # text\n"), Texts{"\"#\\\"#\""});
  EXPECT_EQ(values("a = '#\\'# text\n"), Texts{"'#\\'"});
  EXPECT_EQ(values("a = { b = \"}\", c = '}' } # }\n"), Texts{"{ b = \"}\", c = '}' }"});
}

TEST(TomlOutline, FindsValuesOfSeveralLines) {
  EXPECT_EQ(values("a = [ # ]\n 1,\n \"]\",\n] # end\nb = 2"),
            (Texts{"[ # ]\n 1,\n \"]\",\n]", "2"}));
  EXPECT_EQ(values("a = \"\"\"one\n\\\"\"\"two\"\"\"\nb = 2"),
            (Texts{"\"\"\"one\n\\\"\"\"two\"\"\"", "2"}));
  EXPECT_EQ(values("a = '''\\'''\nb = 2"), (Texts{"'''\\'''", "2"}));
}

TEST(TomlOutline, CountsTheQuotesAtTheEndOfALongString) {
  EXPECT_EQ(values("a = '''''' # empty"), Texts{"''''''"});
  EXPECT_EQ(values("a = '''x'''' # one more"), Texts{"'''x''''"});
  EXPECT_EQ(values("a = '''x''''' # two more"), Texts{"'''x'''''"});
  EXPECT_EQ(values("a = '''x''y'''"), Texts{"'''x''y'''"});
  EXPECT_EQ(values("a = '''''''' # two, and no more"), Texts{"''''''''"});
}

TEST(TomlOutline, FindsTheFirstPartOfAKey) {
  EXPECT_EQ(firstKeys("a = 1\n\"b.c\" = 2\n'd'.e = 3\n f . g = 4\n[h.i]\n[[ \"j\" ]]\n"),
            (Texts{"a", "\"b.c\"", "'d'", "f", "h", "\"j\""}));
  const auto found = outlineToml("a = 1\na.b = 1\n[a]\n[[a.b]]").statements;
  ASSERT_EQ(found.size(), 4u);
  EXPECT_FALSE(found[0].isDotted || found[0].isHeader);
  EXPECT_TRUE(found[1].isDotted && !found[1].isHeader);
  EXPECT_TRUE(!found[2].isDotted && found[2].isHeader);
  EXPECT_TRUE(found[3].isDotted && found[3].isHeader);
}

std::string nested(std::size_t depth, std::string_view open, std::string_view close) {
  std::string text = "a = ";
  for (std::size_t i = 0; i < depth; ++i) text += open;
  text += "1";
  for (std::size_t i = 0; i < depth; ++i) text += close;
  return text;
}

TEST(TomlOutline, SaysWhereATextNestsTooDeep) {
  const auto tooDeep = [](const std::string& text) -> std::optional<std::size_t> {
    const auto mistake = outlineToml(text).mistake;
    return mistake ? std::optional(mistake->at) : std::nullopt;
  };
  EXPECT_FALSE(tooDeep(nested(maxTomlNesting, "[", "]")));
  EXPECT_EQ(tooDeep(nested(maxTomlNesting + 1, "[", "]")), 4 + maxTomlNesting);
  EXPECT_FALSE(tooDeep(nested(maxTomlNesting, "{a=", "}")));
  EXPECT_TRUE(tooDeep(nested(maxTomlNesting + 1, "{a=", "}")));

  std::string key = "k";
  for (std::size_t parts = 1; parts < maxTomlNesting; ++parts) key += ".k";
  EXPECT_FALSE(tooDeep(key + " = 1"));
  EXPECT_FALSE(tooDeep("[" + key + "]"));
  EXPECT_FALSE(tooDeep("a = { " + key + " = 1, " + key + " = 1 }"));
  EXPECT_FALSE(tooDeep("a = \"" + key + ".k\""));
  EXPECT_TRUE(tooDeep(key + ".k = 1"));
  EXPECT_TRUE(tooDeep("[[" + key + ".k]]"));
  EXPECT_TRUE(tooDeep("a = { " + key + ".k = 1 }"));
}

TEST(TomlOutline, SaysWhereACharacterIsNotAsciiAndMustBe) {
  for (const std::string text :
       {"é = 1", "a é = 1", "a.é = 1", "a = é", "a = 1é", "a = 1 é", "a = 'x'é", "a = [é]",
        "a = [] é", "a = { é = 1 }", "[é]", "[aé]", "[a]é", "[[a]] é", "'a'é = 1"}) {
    const auto mistake = outlineToml(text).mistake;
    ASSERT_TRUE(mistake) << text;
    EXPECT_EQ(mistake->at, text.find('\xC3')) << text;
  }
  EXPECT_TRUE(outlineToml("\xEF\xBB\xBF\xEF\xBB\xBF").mistake);
  for (const char* text : {"# é", "'é' = 'é' # é", "\"é\".'é' = \"é\"", "[ 'é' ] # é",
                           "a = [ # é\n'é' ]", "a = '''\né\\é'''", "a = \"\"\"\né\"\"\""}) {
    EXPECT_FALSE(outlineToml(text).mistake) << text;
  }
}

std::string mistakeIn(std::string_view text) {
  const auto mistake = outlineToml(text).mistake;
  return mistake ? mistake->why + ", at " + std::to_string(mistake->at) : "none";
}

TEST(TomlOutline, SaysWhatBreaksTheGrammar) {
  EXPECT_EQ(mistakeIn("= 1"), "expected a key, at 0");
  EXPECT_EQ(mistakeIn("[]"), "expected a key, at 1");
  EXPECT_EQ(mistakeIn("[.a]"), "expected a key, at 1");
  EXPECT_EQ(mistakeIn("a. = 1"), "expected a key, at 3");
  EXPECT_EQ(mistakeIn("a = { b = 1, }"), "expected a key, at 13");
  EXPECT_EQ(mistakeIn("a"), "expected '=', at 1");
  EXPECT_EQ(mistakeIn("a b = 1"), "expected '=', at 2");
  EXPECT_EQ(mistakeIn("[a"), "expected ']', at 2");
  EXPECT_EQ(mistakeIn("[[a]"), "expected ']]', at 3");
  EXPECT_EQ(mistakeIn("[ [a]]"), "expected a key, at 2");
  EXPECT_EQ(mistakeIn("a ="), "expected a value, at 3");
  EXPECT_EQ(mistakeIn("a = # 1"), "expected a value, at 4");
  EXPECT_EQ(mistakeIn("a = 1.2.3"), "neither a text, a boolean, a number nor a date, at 4");
  EXPECT_EQ(mistakeIn("a = 1979-05-27 0#"), "neither a text, a boolean, a number nor a date, at 4");
  for (const std::string behind : {"\t07:32:00", " /", " :"})
    EXPECT_EQ(mistakeIn("a = 1979-05-27" + behind), "expected the end of the line, at 15");
  EXPECT_EQ(mistakeIn("a = [,]"), "expected a value, at 5");
  EXPECT_EQ(mistakeIn("a = [1,,]"), "expected a value, at 7");
  EXPECT_EQ(mistakeIn("a = [1 2]"), "expected ',' or ']', at 7");
  EXPECT_EQ(mistakeIn("a = [ # 1 ]"), "expected ',' or ']', at 11");
  EXPECT_EQ(mistakeIn("a = { b = 1\n}"), "expected ',' or '}', at 11");
  EXPECT_EQ(mistakeIn("a = 1 b = 2"), "expected the end of the line, at 6");
  EXPECT_EQ(mistakeIn("[a] b = 2"), "expected the end of the line, at 4");
  EXPECT_EQ(mistakeIn("a = 1\rb = 2"), "expected the end of the line, at 5");
  EXPECT_EQ(mistakeIn("a = 'x\n'"), "a string without an end, at 6");
  EXPECT_EQ(mistakeIn("a = \"x\\\"\n"), "a string without an end, at 8");
  EXPECT_EQ(mistakeIn("a = \"\"\"x\"\""), "a string without an end, at 10");
  EXPECT_EQ(mistakeIn("a = '''x\n"), "a string without an end, at 9");
  EXPECT_EQ(mistakeIn("a = \"\"\"\\é\"\"\""), "no escape begins like this, at 7");
}

TEST(TomlOutline, FindsNoMistakeInWhatIsAllowed) {
  for (const char* text : {"a = [1, 2,]", "a = [\n# 1\r\n\r\n1 # 2\n,\n]", "a = {}", "a = { }",
                           "a={b=1,c.d=[{}]}", "[ a . 'b' ]", "[[a]]#", "\t\r\n", "a = '''\n'''",
                           "a = \"\"\"\\\"\"\"\"", "a = 1979-05-27 07:32:00Z", "a = +1_0.5e-3"}) {
    EXPECT_EQ(mistakeIn(text), "none") << text;
  }
}

TEST(TomlOutline, FindsWhatIsNotAsciiWhereALineIsContinued) {
  const auto continuations = [](std::string_view text) { return outlineToml(text).continuations; };
  using Places = std::vector<std::size_t>;
  EXPECT_EQ(continuations("a = \"\"\"\\ \r\n\t\n é\"\"\""), Places{14});
  EXPECT_EQ(continuations("a = \"\"\"x\\\né\\\ny\\\\\né\"\"\""), Places{10});
  EXPECT_EQ(continuations("a = '''\\\né'''"), Places());
}

TEST(TomlOutline, ComesToAnEndWhereverATextIsCut) {
  const std::string text =
      "a = \"\\u00e9\"\n'b'.\"c\" = [1, { d = '''x''''' }]\n[[e.f]] # g\nh = \"\"\"\\\n\"\"\"\n";
  for (std::size_t size = 0; size <= text.size(); ++size) {
    const std::vector<char> cut(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(size));
    const std::string_view view(cut.data(), cut.size());
    std::size_t end = 0;
    for (const auto& statement : outlineToml(view).statements) {
      EXPECT_LE(end, statement.begin);
      EXPECT_LT(statement.begin, statement.end);
      EXPECT_LE(statement.valueBegin, statement.valueEnd);
      EXPECT_LE(statement.valueEnd, statement.end);
      end = statement.end;
    }
    EXPECT_LE(end, size);
  }
}

}  // namespace
}  // namespace oxmv
