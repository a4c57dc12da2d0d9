#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/host/TomlOutline.h"

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
    const auto obstacle = outlineToml(text).obstacle;
    return obstacle ? std::optional(obstacle->at) : std::nullopt;
  };
  EXPECT_FALSE(tooDeep(nested(maxTomlNesting, "[", "]")));
  EXPECT_EQ(tooDeep(nested(maxTomlNesting + 1, "[", "]")), 4 + maxTomlNesting + 1);
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
  for (const std::string text : {"é = 1", "a é = 1", "a.é = 1", "a = é", "a = 1é", "a = 1 é",
                                 "a = 'x'é", "a = [é]", "a = [] é", "a = { é = 1 }", "[é]", "[aé]",
                                 "[a]é", "[[a]] é", "'a'é = 1", "a = \"\"\"\\é\"\"\""}) {
    const auto obstacle = outlineToml(text).obstacle;
    ASSERT_TRUE(obstacle) << text;
    EXPECT_EQ(obstacle->at, text.find('\xC3')) << text;
  }
  EXPECT_TRUE(outlineToml("\xEF\xBB\xBF\xEF\xBB\xBF").obstacle);
  for (const char* text : {"# é", "'é' = 'é' # é", "\"é\".'é' = \"é\"", "[ 'é' ] # é",
                           "a = [ # é\n'é' ]", "a = '''\né\\é'''", "a = \"\"\"\né\"\"\""}) {
    EXPECT_FALSE(outlineToml(text).obstacle) << text;
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
