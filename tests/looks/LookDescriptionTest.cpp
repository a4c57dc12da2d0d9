#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/looks/LongRuns.h"
#include "oxmv/looks/LookDescription.h"
#include "support/Memory.h"
#include "support/TestData.h"

namespace oxmv {
namespace {

using test::Bytes;

std::span<const std::uint8_t> bytesOf(std::string_view text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

// The nodes, one in a line: "LUT", "size: 2", "table: 0000803F". Parses in both ways, which must
// agree in everything; nothing when the file is no description.
std::optional<std::string> parsed(std::string_view file) {
  LookProblem problems[2];
  std::optional<std::string> results[2];
  for (const LookParsing parsing : {LookParsing::quick, LookParsing::plain}) {
    const bool isPlain = parsing == LookParsing::plain;
    const auto description = LookDescription::parse(bytesOf(file), &problems[isPlain], parsing);
    if (!description) continue;
    std::string places;
    std::string lines;
    for (std::size_t i = 0; i < description->nodeCount(); ++i) {
      const LookNode node = description->node(i);
      switch (node.kind) {
        case LookNode::Kind::lut: lines += "LUT\n"; break;
        case LookNode::Kind::size: lines += "size: " + std::string(node.text) + '\n'; break;
        case LookNode::Kind::table: lines += "table: " + std::string(node.text) + '\n'; break;
      }
      places +=
          std::to_string(node.offset) + ' ' + std::to_string(node.textOffset.value_or(0)) + ' ';
      EXPECT_LT(node.offset, file.size());
      if (node.textOffset) {
        EXPECT_EQ(file.substr(*node.textOffset, node.text.size()), node.text);
      }
    }
    results[isPlain] = lines + places;
  }
  EXPECT_EQ(results[0], results[1]) << file.substr(0, 2000);
  EXPECT_EQ(problems[0].offset, problems[1].offset);
  EXPECT_EQ(problems[0].what, problems[1].what);
  if (results[0]) results[0]->erase(results[0]->rfind('\n') + 1);
  return results[0];
}

std::string nodesOf(std::string_view file) {
  const auto nodes = parsed(file);
  EXPECT_TRUE(nodes) << file.substr(0, 2000);
  return nodes.value_or("not parsed");
}

const std::string run(minLongRun, 'A');

// Line ends of every kind: as they are in a file, and as what is read from it has them.
const std::string returns = "\r\n" + run + "\r\n\r\n1\r\r2\n\r\n\r3\r" + run + "\r\n4\r";
const std::string feeds = "\n" + run + "\n\n1\n\n2\n\n\n3\n" + run + "\n4\n";

TEST(LookDescription, GivesTheChildrenOfItsLuts) {
  EXPECT_EQ(nodesOf("<look><LUT><size>2</size><data>0000803F</data></LUT></look>"),
            "LUT\nsize: 2\ntable: 0000803F\n");
}

TEST(LookDescription, TellsWhatItsNodesAreInTheDocument) {
  const std::string file =
      "<look><LUT> <size>2</size><a/><!-- b --><?c d?><![CDATA[e]]>f</LUT></look>";
  const auto description = LookDescription::parse(bytesOf(file));
  ASSERT_TRUE(description);
  using Form = LookNode::Form;
  std::vector<Form> forms;
  for (std::size_t i = 0; i < description->nodeCount(); ++i)
    forms.push_back(description->node(i).form);
  EXPECT_EQ(forms, (std::vector<Form>{Form::element, Form::text, Form::element, Form::element,
                                      Form::comment, Form::instruction, Form::cdata, Form::text}));
}

TEST(LookDescription, RootMayHaveAnyName) {
  EXPECT_EQ(nodesOf("<x><LUT><a/></LUT></x>"), "LUT\ntable: \n");
  EXPECT_EQ(nodesOf("<LUT><LUT><a/></LUT></LUT>"), "LUT\ntable: \n");
}

TEST(LookDescription, SkipsEverythingButLuts) {
  EXPECT_EQ(nodesOf("<look> x <other><size>2</size>12345678</other><lut>1</lut><p:LUT>1</p:LUT>"
                    "<!--1--><![CDATA[1]]><?a 1?><a><LUT>1</LUT></a></look>"),
            "");
  EXPECT_EQ(nodesOf("<LUT><size>2</size><a>0000803F</a></LUT>"), "");
}

TEST(LookDescription, EveryChildButSizeIsATable) {
  EXPECT_EQ(nodesOf("<look><LUT><a>1</a> <!--2--><![CDATA[3]]><?p 4?>5<Size>6</Size></LUT></look>"),
            "LUT\ntable: 1\ntable:  \ntable: 2\ntable: 3\ntable: 4\ntable: 5\ntable: 6\n");
}

TEST(LookDescription, WhiteSpaceIsATable) {
  EXPECT_EQ(nodesOf("<look>\n<LUT>\n<size>1</size>\n</LUT>\n</look>"),
            "LUT\ntable: \n\nsize: 1\ntable: \n\n");
}

TEST(LookDescription, SectionsAreTablesOfTheirOwn) {
  EXPECT_EQ(nodesOf("<look><LUT>1<![CDATA[2]]><![CDATA[3]]>4<![CDATA[]]></LUT></look>"),
            "LUT\ntable: 1\ntable: 2\ntable: 3\ntable: 4\ntable: \n");
}

TEST(LookDescription, TextGoesOnThroughReferencesAndLineEnds) {
  EXPECT_EQ(nodesOf("<look><LUT>1&amp;2&#51;\r\n4\r5</LUT></look>"), "LUT\ntable: 1&23\n4\n5\n");
}

TEST(LookDescription, ElementHasTheTextOfAllItsElementsAndSections) {
  EXPECT_EQ(
      nodesOf("<look><LUT><a>1<b>2<c/><![CDATA[3]]></b><!--x--><?y z?>4</a><size>1<x>7</x></size>"
              "</LUT></look>"),
      "LUT\ntable: 1234\nsize: 17\n");
}

TEST(LookDescription, ElementsWithinATableAreNoNodes) {
  EXPECT_EQ(nodesOf("<look><LUT><LUT><size>2</size><a>1</a></LUT></LUT></look>"),
            "LUT\ntable: 21\n");
}

TEST(LookDescription, EntitiesAreExpanded) {
  EXPECT_EQ(nodesOf("<!DOCTYPE look [<!ENTITY t '0000803F'><!ENTITY n '<a>&t;</a>'>]>"
                    "<look><LUT>1&t;2&n;3</LUT></look>"),
            "LUT\ntable: 10000803F2\ntable: 0000803F\ntable: 3\n");
}

TEST(LookDescription, EntitiesFromOutsideHaveNoText) {
  EXPECT_EQ(nodesOf("<!DOCTYPE look [<!ENTITY t SYSTEM '/etc/passwd'>]>"
                    "<look><LUT>&t;<a>&t;</a></LUT></look>"),
            "LUT\ntable: \n");
}

TEST(LookDescription, EncodingsAreRead) {
  using namespace std::string_view_literals;
  EXPECT_EQ(nodesOf("\xEF\xBB\xBF<look><LUT>\u00E9</LUT></look>"), "LUT\ntable: \u00E9\n");
  EXPECT_EQ(nodesOf("<?xml version='1.0' encoding='ISO-8859-1'?><look><LUT>\xE9</LUT></look>"),
            "LUT\ntable: \u00E9\n");
  EXPECT_EQ(nodesOf("\xFF\xFE<\0l\0>\0<\0L\0U\0T\0>\0\xE9\0<\0/\0L\0U\0T\0>\0<\0/\0l\0>\0"sv),
            "LUT\ntable: \u00E9\n");
}

TEST(LookDescription, LongTextsAreTheSame) {
  EXPECT_EQ(nodesOf("<look><LUT><a>" + run + "</a></LUT></look>"), "LUT\ntable: " + run + "\n");
  EXPECT_EQ(nodesOf("<look><LUT>" + run + "<a>" + run + "</a>" + run + "</LUT>" + run + "</look>"),
            "LUT\ntable: " + run + "\ntable: " + run + "\ntable: " + run + "\n");
}

TEST(LookDescription, LineEndsOfLongTextsAreLineFeeds) {
  EXPECT_EQ(nodesOf("<look><LUT><a>" + returns + "</a></LUT></look>"),
            "LUT\ntable: " + feeds + "\n");
  EXPECT_EQ(nodesOf("<look><LUT>" + returns + "<a>x<b/>" + returns + "<b/>\r\n</a>" + returns +
                    "</LUT></look>"),
            "LUT\ntable: " + feeds + "\ntable: x" + feeds + "\n\ntable: " + feeds + "\n");
  EXPECT_EQ(nodesOf("<look><LUT><![CDATA[>" + returns + "<]]></LUT>" + returns + "</look>"),
            "LUT\ntable: >" + feeds + "<\n");
  EXPECT_EQ(nodesOf("<look><LUT>" + run + "\r</LUT><LUT>\n" + run + "</LUT></look>"),
            "LUT\ntable: " + run + "\n\nLUT\ntable: \n" + run + "\n");
}

TEST(LookDescription, LongTableWithCarriageReturnsIsCopiedOnce) {
  std::string lines;
  for (int i = 0; i < 20000; ++i) lines += "0000803F0000003F\r\n";
  const std::string file = "<look><LUT><size>64</size><data>" + lines + "</data></LUT></look>";
  const test::MemoryMeter meter;
  ASSERT_TRUE(LookDescription::parse(bytesOf(file)));
  EXPECT_LT(meter.peak(), file.size() * 5 / 4);
}

TEST(LookDescription, LongTextsBesideOthersAreTheSame) {
  EXPECT_EQ(nodesOf("<look><LUT><a>x<b/>" + run + "<b/>y</a></LUT></look>"),
            "LUT\ntable: x" + run + "y\n");
  EXPECT_EQ(nodesOf("<look><LUT><a>&#62;>" + run + "</a></LUT></look>"),
            "LUT\ntable: >>" + run + "\n");
  EXPECT_EQ(nodesOf("<look><LUT>x >" + run + "</LUT></look>"), "LUT\ntable: x >" + run + "\n");
  EXPECT_EQ(nodesOf("<look><LUT><a>\u00E9></a><a>" + run + "</a></LUT></look>"),
            "LUT\ntable: \u00E9>\ntable: " + run + "\n");
}

TEST(LookDescription, LongTextsInSectionsCommentsAndAttributesAreTheSame) {
  EXPECT_EQ(nodesOf("<look><LUT><![CDATA[>" + run + "<]]></LUT></look>"),
            "LUT\ntable: >" + run + "<\n");
  EXPECT_EQ(nodesOf("<look><LUT><!-->" + run + "<--></LUT></look>"), "LUT\ntable: >" + run + "<\n");
  EXPECT_EQ(nodesOf("<look><LUT><?p >" + run + "<?></LUT></look>"), "LUT\ntable: >" + run + "<\n");
  EXPECT_EQ(nodesOf("<look><!-->" + run + "<--><LUT><a>" + run + "</a></LUT></look>"),
            "LUT\ntable: " + run + "\n");
  EXPECT_EQ(nodesOf("<look><LUT><a b='>" + run.substr(1) + "'/></LUT></look>"), "LUT\ntable: \n");
}

TEST(LookDescription, LongTextsOutsideTheRootAreTheSame) {
  const std::string blanks(2 * minLongRun, ' ');
  EXPECT_EQ(nodesOf("<?xml version='1.0'?>" + blanks + "<look><LUT/></look>" + blanks), "LUT\n");
  EXPECT_EQ(nodesOf("<?xml version='1.0'?>" + blanks + "<look><LUT>" + run + "</LUT></look>"),
            "LUT\ntable: " + run + "\n");
  EXPECT_FALSE(parsed("<?xml version='1.0'?>" + run + "<look/>"));
}

TEST(LookDescription, LongTextsOfUnusualDocumentsAreTheSame) {
  const std::string body = "<look><LUT><a>" + run + "</a></LUT></look>";
  const std::string nodes = "LUT\ntable: " + run + "\n";
  EXPECT_EQ(nodesOf("\xEF\xBB\xBF" + body), nodes);
  EXPECT_EQ(nodesOf("<?xml version='1.0' encoding='UTF-8'?>" + body), nodes);
  EXPECT_EQ(nodesOf("<?xml version='1.0' encoding='utf-8'?>" + body), nodes);
  EXPECT_EQ(nodesOf("<?xml version='1.0' encoding='ISO-8859-1'?><!--\xE9-->" + body), nodes);
  EXPECT_EQ(nodesOf("<!DOCTYPE look>" + body), nodes);
  // An entity's text has the place of its reference, and could be taken for what stands behind it.
  EXPECT_EQ(nodesOf("<!DOCTYPE look [<!ENTITY e '" + run + "'>]><look><LUT>&e;<a>" + run +
                    "</a></LUT></look>"),
            "LUT\ntable: " + run + "\ntable: " + run + "\n");
}

TEST(LookDescription, LongTextsInUtf16AreTheSame) {
  // U+3030 in UTF-16 is the bytes "00", and U+003E in the other order ends with '>'.
  for (const bool isBig : {false, true}) {
    std::string file = isBig ? "\xFE\xFF" : "\xFF\xFE";
    const auto add = [&](char32_t c) {
      const char high = static_cast<char>(c >> 8);
      const char low = static_cast<char>(c & 0xFF);
      file += isBig ? high : low;
      file += isBig ? low : high;
    };
    for (const char c : std::string_view("<look><LUT>")) add(static_cast<unsigned char>(c));
    for (std::size_t i = 0; i < minLongRun; ++i) add(0x3030);
    for (const char c : std::string_view("</LUT></look>")) add(static_cast<unsigned char>(c));
    std::string text;
    for (std::size_t i = 0; i < minLongRun; ++i) text += "\u3030";
    EXPECT_EQ(nodesOf(file), "LUT\ntable: " + text + "\n");
  }
}

TEST(LookDescription, MalformedOnesAreNothing) {
  for (const std::string& file : {
           "<look><LUT>" + run + "</look>",
           "<look><LUT>" + run + "</LUT>",
           "<look><LUT>" + run + "<",
           "<look a='>" + run + "<'/>",
           "<look a='>" + run + "\"<'/>",
           "<look><LUT>]]>" + run + "</LUT></look>",
           "<look>" + run + "</look>" + run + "<look/>",
           std::string("<look><LUT>"),
           std::string(),
       }) {
    EXPECT_FALSE(parsed(file)) << file;
  }
}

TEST(LookDescription, ProblemHasItsPlace) {
  LookProblem problem;
  EXPECT_FALSE(LookDescription::parse(bytesOf("<look>" + run + "<a></look>"), &problem));
  EXPECT_EQ(problem.offset, 6 + run.size() + 5);
  EXPECT_EQ(problem.what, "mismatched tag");
}

TEST(LookDescription, NodesKnowTheirPlaces) {
  const std::string file = "<look><LUT><size>1</size><a>" + run + "</a>x&amp;</LUT></look>";
  const auto description = LookDescription::parse(bytesOf(file));
  ASSERT_TRUE(description);
  ASSERT_EQ(description->nodeCount(), 4u);
  EXPECT_EQ(description->node(0).offset, 6u);
  EXPECT_EQ(description->node(1).offset, 11u);
  EXPECT_EQ(description->node(1).textOffset, 17u);
  EXPECT_EQ(description->node(2).textOffset, 28u);
  EXPECT_EQ(description->node(2).text.data(), file.data() + 28);  // not copied
  EXPECT_EQ(description->node(3).offset, file.find("x&amp;"));
}

TEST(LookDescription, LongTableIsNotCopied) {
  std::string lines;
  for (int i = 0; i < 20000; ++i) lines += "0000803F0000003F\n";
  const std::string file = "<look><LUT><size>64</size><data>\"" + lines + "\"</data></LUT></look>";
  const test::MemoryMeter meter;
  const auto description = LookDescription::parse(bytesOf(file));
  ASSERT_TRUE(description);
  EXPECT_LT(meter.peak(), file.size() / 4);
}

// One change somewhere: both ways must still agree, whatever comes of it.
TEST(LookDescription, DamagedOnesAreReadAlikeInBothWays) {
  std::mt19937 random(5);
  const std::string parts[] = {run,    returns,  "<a>",       "</a>", "<LUT>",          "</LUT>",
                               "<!--", "-->",    "<![CDATA[", "]]>",  "<?p ",           "?>",
                               "\"",   "'",      ">",         "<",    "&amp;",          "&#48;",
                               "\r\n", "\u00E9", "<b c='",    "'/>",  "<size>1</size>", " ",
                               "x"};
  int parsedOnes = 0;
  for (int i = 0; i < 3000; ++i) {
    std::string file = "<look><LUT>";
    const auto count = random() % 6;
    for (std::size_t k = 0; k < count; ++k) file += parts[random() % std::size(parts)];
    file += "<a>" + run + "</a></LUT><LUT>" + run + "</LUT></look>";
    const auto edits = random() % 3;
    for (std::size_t k = 0; k < edits; ++k) {
      const std::string& part = parts[random() % std::size(parts)];
      file.insert(random() % (file.size() + 1), part);
    }
    parsedOnes += parsed(file).has_value();
  }
  EXPECT_GT(parsedOnes, 300);  // of both kinds there are enough
  EXPECT_LT(parsedOnes, 2700);
}

TEST(LookDescription, EveryShorterFileIsReadAlikeInBothWays) {
  const std::string file = "<?xml version='1.0'?><look><LUT><size>1</size><a b='c'>x" + run +
                           "</a>" + run + "<!--" + run + "--></LUT></look>\n";
  for (std::size_t size = 0; size + 1 < file.size(); ++size) {
    if (size > 100 && size % 97 != 0 && file.size() - size > 100) continue;
    EXPECT_FALSE(parsed(file.substr(0, size))) << size;
  }
  EXPECT_TRUE(parsed(file));
}

TEST(LookDescription, TextOutOfTheFileIsLimitedAlikeInBothWays) {
  // Out of the file: "&" and what follows it, and a text that is taken out at its end.
  const std::string file = "<look><LUT><size>1</size><a>&amp;<b/>" + run + "</a>" + run + "<c>" +
                           run + "<d/>\r\n</c><e>" + run + "</e></LUT></look>";
  const std::size_t most = 1 + run.size() + run.size() + 1;
  for (const LookParsing parsing : {LookParsing::quick, LookParsing::plain}) {
    EXPECT_TRUE(LookDescription::parse(bytesOf(file), nullptr, parsing, most));
    LookProblem problem;
    EXPECT_FALSE(LookDescription::parse(bytesOf(file), &problem, parsing, most - 1));
    EXPECT_EQ(problem.what, "its nodes have too much text");
    EXPECT_EQ(problem.offset, file.find('\r'));
    EXPECT_FALSE(LookDescription::parse(bytesOf(file), &problem, parsing, run.size()));
    EXPECT_EQ(problem.what, "its nodes have too much text");
  }
}

TEST(LookDescription, TextOutOfTheFileIsLimitedAlikeWhereverItEnds) {
  const std::string file =
      "<look><LUT><size>1</size><a>&amp;x>" + run + "\r\n" + run + "</a></LUT></look>";
  const std::size_t all = 3 + run.size() + 1 + run.size();
  for (std::size_t most = 0; most <= all; ++most) {
    LookProblem quick, plain;
    const bool isGood = most == all;
    EXPECT_EQ(bool(LookDescription::parse(bytesOf(file), &quick, LookParsing::quick, most)),
              isGood);
    EXPECT_EQ(bool(LookDescription::parse(bytesOf(file), &plain, LookParsing::plain, most)),
              isGood);
    ASSERT_EQ(quick.what, plain.what) << most;
    ASSERT_EQ(quick.offset, plain.offset) << most;
  }
}

TEST(LookDescription, FileAboveTheLargestIsRefusedInBothWays) {
  std::string file = "<look><LUT>";
  file.resize(maxFileSize + 1 - std::string_view("</LUT></look>").size(), '0');
  file += "</LUT></look>";
  for (const LookParsing parsing : {LookParsing::quick, LookParsing::plain}) {
    LookProblem problem;
    EXPECT_FALSE(LookDescription::parse(bytesOf(file), &problem, parsing));
    EXPECT_EQ(problem.what, "larger than 256 MiB");
  }
}

TEST(LookDescription, EntitiesThatMakeTooMuchAreRefused) {
  // As many as Expat lets pass, each a node, from a file of some kilobytes.
  std::string file = "<!DOCTYPE look [<!ENTITY e0 '";
  for (int i = 0; i < 1000; ++i) file += "<a/>";
  file += "'>";
  for (int i = 1; i <= 4; ++i) {
    file += "<!ENTITY e" + std::to_string(i) + " '";
    for (int k = 0; k < 10; ++k) file += "&e" + std::to_string(i - 1) + ";";
    file += "'>";
  }
  file += "]><look><LUT>";
  LookProblem problem;
  const auto few = LookDescription::parse(bytesOf(file + "&e2;</LUT></look>"));
  ASSERT_TRUE(few);
  EXPECT_EQ(few->nodeCount(), 100001u);
  EXPECT_FALSE(LookDescription::parse(bytesOf(file + "&e3;&e3;</LUT></look>"), &problem));
  EXPECT_EQ(problem.what, "its entities make too many nodes of it");
}

TEST(LookDescription, MissingMemoryReachesTheCaller) {
  const std::string file =
      "<look><LUT><size>1</size><a>x<b/>" + run + "</a><!--" + run + "--></LUT></look>";
  int failures = 0;
  for (std::size_t granted = 0; granted < 100; ++granted) {
    const test::MemoryShortage shortage(granted);
    try {
      EXPECT_TRUE(LookDescription::parse(bytesOf(file)));
      EXPECT_FALSE(shortage.wasFelt());
      break;
    } catch (const std::bad_alloc&) {
      ++failures;
    }
  }
  EXPECT_GT(failures, 2);
}

TEST(LookSizeFrom, ReadsAWholeNumberWithinPunctuation) {
  EXPECT_EQ(lookSizeFrom("33"), 33);
  EXPECT_EQ(lookSizeFrom("\"8\""), 8);
  EXPECT_EQ(lookSizeFrom("-8"), 8);
  EXPECT_EQ(lookSizeFrom("\u201C17\u201D"), 17);
  EXPECT_EQ(lookSizeFrom(" 17"), 17);
  EXPECT_EQ(lookSizeFrom(" -17"), -17);
  EXPECT_EQ(lookSizeFrom("+17"), 17);
  EXPECT_EQ(lookSizeFrom("17x33"), 17);
  EXPECT_EQ(lookSizeFrom("17.9"), 17);
  EXPECT_EQ(lookSizeFrom("\n17\n"), 17);
}

TEST(LookSizeFrom, NoNumberIsZero) {
  for (const char* text : {"", " ", "\"\"", "x8", "--", "\" \""}) EXPECT_EQ(lookSizeFrom(text), 0);
}

TEST(LookSizeFrom, NumberOfTooManyBitsIsTheNearest) {
  EXPECT_EQ(lookSizeFrom("4294967298"), 2147483647);
  EXPECT_EQ(lookSizeFrom("99999999999999999999999999"), 2147483647);
  EXPECT_EQ(lookSizeFrom(" -4294967298"), -2147483647 - 1);
}

TEST(LookDescription, SamplesAreReadAlikeInBothWays) {
  const std::filesystem::path folders[] = {"looks", "looks/illegal"};
  for (const auto& folder : folders) {
    for (const std::string& name : test::testDataNames(folder, ".xml")) {
      const Bytes file = test::testData(folder / (name + ".xml"));
      const std::string text(file.begin(), file.end());
      EXPECT_EQ(parsed(text).has_value(), name != "not-well-formed") << name;
    }
  }
}

// In UTF-16 characters can look like a long run between '>' and '<'. One of an odd length would
// leave the document well-formed without it.
TEST(LookDescription, CharactersOfUtf16ThatLookLikeALongRunAreNone) {
  for (const bool isBig : {false, true}) {
    for (const bool hasMark : {false, true}) {
      std::string file;
      const auto add = [&](char32_t c) {
        const char high = static_cast<char>(c >> 8);
        const char low = static_cast<char>(c & 0xFF);
        file += isBig ? high : low;
        file += isBig ? low : high;
      };
      const auto addAll = [&](std::string_view ascii) {
        for (const char c : ascii) add(static_cast<unsigned char>(c));
      };
      if (hasMark) add(0xFEFF);
      addAll("<look><LUT>");
      add(0x303E);  // its last byte, or the one before, is '>'
      for (std::size_t i = 0; i < minLongRun; ++i) add(0x3030);
      if (isBig) add(0x303C);  // ends with '<'
      addAll("</LUT></look>");
      ASSERT_EQ(withoutLongRuns(file).runs.size(), 1u);
      EXPECT_EQ(withoutLongRuns(file).runs[0].text.size() % 2, 1u);
      std::string text = "\u303E";
      for (std::size_t i = 0; i < minLongRun; ++i) text += "\u3030";
      if (isBig) text += "\u303C";
      EXPECT_EQ(nodesOf(file), "LUT\ntable: " + text + "\n");
    }
  }
}

}  // namespace
}  // namespace oxmv
