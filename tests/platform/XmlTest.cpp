#include <fstream>
#include <new>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <unistd.h>

#include "oxmv/platform/Xml.h"
#include "support/ChildProcess.h"
#include "support/SmallStack.h"
#include "support/TempDir.h"

namespace oxmv {
namespace {

using Kind = XmlEnd::Kind;

std::span<const std::uint8_t> bytesOf(std::string_view text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

// Writes down everything it hears; pieces of text are put together.
class Recorder : public XmlVisitor {
 public:
  std::string events;
  std::string texts;

  bool onDeclaration(std::string_view encoding) override {
    return add("xml " + std::string(encoding));
  }
  bool onDoctype() override { return add("doctype"); }
  bool onElementStart(std::string_view name, std::size_t offset) override {
    return add("<" + std::string(name) + "@" + std::to_string(offset));
  }
  bool onElementEnd() override { return add(">"); }
  bool onText(std::string_view piece, std::size_t) override {
    texts += piece;
    return true;
  }
  bool onCdataStart(std::size_t offset) override { return add("[@" + std::to_string(offset)); }
  bool onCdataEnd() override { return add("]"); }
  bool onComment(std::string_view text, std::size_t offset) override {
    return add("!" + std::string(text) + "@" + std::to_string(offset));
  }
  bool onProcessingInstruction(std::string_view data, std::size_t offset) override {
    return add("?" + std::string(data) + "@" + std::to_string(offset));
  }

 private:
  bool add(const std::string& event) {
    events += event + " ";
    return true;
  }
};

XmlEnd walk(std::string_view document, Recorder& recorder) {
  return walkXml(bytesOf(document), recorder);
}

std::string textsOf(std::string_view document) {
  Recorder recorder;
  EXPECT_EQ(walk(document, recorder).kind, Kind::wellFormed);
  return recorder.texts;
}

XmlEnd endOf(std::string_view document) {
  Recorder recorder;
  return walk(document, recorder);
}

TEST(Xml, TellsEverythingInOrder) {
  Recorder recorder;
  const XmlEnd end = walk(
      "<?xml version='1.0' encoding='UTF-8'?><a><p:b x='1'>T</p:b><!--c--><?d e "
      "f?><![CDATA[g]]></a>",
      recorder);
  EXPECT_EQ(end.kind, Kind::wellFormed);
  EXPECT_EQ(recorder.events, "xml UTF-8 <a@38 <p:b@41 > !c@59 ?e f@67 [@76 ] > ");
  EXPECT_EQ(recorder.texts, "Tg");
}

TEST(Xml, ResolvesReferencesAndLineEnds) {
  EXPECT_EQ(textsOf("<a>&lt;&#48;&#x31;&amp;\r\n2\r3</a>"), "<01&\n2\n3");
}

TEST(Xml, ReadsEncodings) {
  EXPECT_EQ(textsOf("\xEF\xBB\xBF<a>\u00E9</a>"), "\u00E9");
  EXPECT_EQ(textsOf("<?xml version='1.0' encoding='ISO-8859-1'?><a>\xE9</a>"), "\u00E9");
  EXPECT_EQ(textsOf("<?xml version='1.0' encoding='US-ASCII'?><a>e</a>"), "e");
  using namespace std::string_view_literals;
  EXPECT_EQ(textsOf("\xFF\xFE<\0a\0>\0\xE9\0<\0/\0a\0>\0"sv), "\u00E9");
  EXPECT_EQ(textsOf("\xFE\xFF\0<\0a\0>\0\xE9\0<\0/\0a\0>"sv), "\u00E9");
}

TEST(Xml, ExpandsTheEntitiesOfTheDocument) {
  EXPECT_EQ(textsOf("<!DOCTYPE a [<!ENTITY e 'x'><!ENTITY f '&e;&e;'>]><a>&f;</a>"), "xx");
  EXPECT_EQ(textsOf("<!DOCTYPE a [<!ENTITY e '<b>x</b>'>]><a>&e;</a>"), "x");
}

TEST(Xml, LoadsNothingFromOutside) {
  for (const char* document : {
           "<!DOCTYPE a [<!ENTITY e SYSTEM 'file:///etc/passwd'>]><a>&e;</a>",
           "<!DOCTYPE a [<!ENTITY e PUBLIC 'p' '/etc/passwd'>]><a>&e;</a>",
           "<!DOCTYPE a SYSTEM '/etc/passwd'><a>&e;</a>",
           "<!DOCTYPE a [<!ENTITY % e SYSTEM '/etc/passwd'>%e;]><a></a>",
       }) {
    EXPECT_EQ(textsOf(document), "") << document;
  }
}

TEST(Xml, MalformedNamesPlaceAndReason) {
  const XmlEnd end = endOf("<a><b></a>");
  EXPECT_EQ(end.kind, Kind::malformed);
  EXPECT_EQ(end.offset, 8u);
  EXPECT_EQ(end.what, "mismatched tag");
}

TEST(Xml, RefusesWhatIsNotWellFormed) {
  using namespace std::string_view_literals;
  const std::string_view documents[] = {
      ""sv,
      " "sv,
      "a"sv,
      "<a>"sv,
      "</a>"sv,
      "<a"sv,
      "<a></b>"sv,
      "<a></A>"sv,
      "<a/><b/>"sv,
      "<a/>x"sv,
      "x<a/>"sv,
      "<a b></a>"sv,
      "<a b=c></a>"sv,
      "<a b='1' b='2'/>"sv,
      "<a b='<'/>"sv,
      "<a b='1'c='2'/>"sv,
      "<a b='1/>"sv,
      "<1/>"sv,
      "< a/>"sv,
      "<a><</a>"sv,
      "<a>&</a>"sv,
      "<a>&b</a>"sv,
      "<a>&unknown;</a>"sv,
      "<a>&#0;</a>"sv,
      "<a>&#xD800;</a>"sv,
      "<a>&#xFFFFFFFFF;</a>"sv,
      "<a>]]></a>"sv,
      "<a><!-- -- --></a>"sv,
      "<a><!-- </a>"sv,
      "<a><![CDATA[</a>"sv,
      "<a><![cdata[]]></a>"sv,
      "<a><?xml version='1.0'?></a>"sv,
      "<a><?b </a>"sv,
      " <?xml version='1.0'?><a/>"sv,
      "<?xml version='2.0'?><a/>"sv,
      "<?xml version='1.'?><a/>"sv,
      "<?xml version='1.x'?><a/>"sv,
      "<?xml encoding='UTF-8'?><a/>"sv,
      "<?xml?><a/>"sv,
      "<?xml version='1.0' encoding='UTF-16'?><a/>"sv,
      "<?xml version='1.0' encoding='EBCDIC'?><a/>"sv,
      "<?xml version='1.0' encoding='windows-1252'?><a>\xE9</a>"sv,
      "<?xml version='1.0' encoding='US-ASCII'?><a>\xE9</a>"sv,
      "<a>\0</a>"sv,
      "<a>\x01</a>"sv,
      "<a>\xE9</a>"sv,
      "<a>\xC0\x80</a>"sv,
      "<a>\xED\xA0\x80</a>"sv,
      "<a>\xEF\xBF\xBE</a>"sv,
      "<a/>\0"sv,
      "\xFF\xFE<\0a\0/\0>"sv,
      "\xFF\xFE<\0a\0>\0\x00\xDC<\0/\0a\0>\0"sv,
      "<!DOCTYPE a [<!ENTITY e '&e;'>]><a>&e;</a>"sv,
      "<!DOCTYPE a [<!ENTITY e '&f;'><!ENTITY f '&e;'>]><a>&e;</a>"sv,
      "<!DOCTYPE a [<!ENTITY e '<b>'>]><a>&e;</b></a>"sv,
      "<!DOCTYPE a [<!ENTITY e '&f;'><!ENTITY f SYSTEM 'x'>]><a b='&e;'/>"sv,
      "<!DOCTYPE a"sv,
      "<!DOCTYPE a [<!ENTITY e>]><a/>"sv,
      "<a/><!DOCTYPE a>"sv,
  };
  for (const std::string_view document : documents) {
    const XmlEnd end = endOf(document);
    EXPECT_EQ(end.kind, Kind::malformed) << document;
    EXPECT_FALSE(end.what.empty()) << document;
    EXPECT_LE(end.offset, document.size()) << document;
  }
}

TEST(Xml, EveryShorterPrefixIsMalformed) {
  const std::string document =
      "<?xml version='1.0'?><a b='c'><!--d--><?e f?><![CDATA[g]]>&#48;<h/>i\u00E9</a>";
  for (std::size_t size = 0; size < document.size(); ++size) {
    EXPECT_EQ(endOf(document.substr(0, size)).kind, Kind::malformed) << size;
  }
  EXPECT_EQ(endOf(document).kind, Kind::wellFormed);
}

TEST(Xml, EntitiesThatMultiplyAreMalformed) {
  std::string document = "<!DOCTYPE a [<!ENTITY e0 '" + std::string(1000, 'x') + "'>";
  for (int i = 1; i <= 9; ++i) {
    document += "<!ENTITY e" + std::to_string(i) + " '";
    for (int k = 0; k < 10; ++k) document += "&e" + std::to_string(i - 1) + ";";
    document += "'>";
  }
  EXPECT_EQ(endOf(document + "]><a>&e9;</a>").kind, Kind::malformed);
  EXPECT_EQ(endOf(document + "]><a b='&e9;'/>").kind, Kind::malformed);
  EXPECT_EQ(endOf(document + "]><a>&e3;</a>").kind, Kind::wellFormed);
}

// An entity of a megabyte, in an attribute of an element.
std::string entityInAttribute(int times) {
  std::string document = "<!DOCTYPE a [<!ENTITY e '" + std::string(1000000, 'x') + "'>]><a b='";
  for (int i = 0; i < times; ++i) document += "&e;";
  return document + "'/>";
}

TEST(Xml, DocumentThatTakesTooMuchMemoryIsMalformed) {
  EXPECT_EQ(endOf(entityInAttribute(10)).kind, Kind::wellFormed);
  const XmlEnd end = endOf(entityInAttribute(95));
  EXPECT_EQ(end.kind, Kind::malformed);
  EXPECT_EQ(end.what, "takes too much memory");
}

TEST(Xml, MemoryGrowsWithTheDocumentUpToALimit) {
  constexpr std::uint64_t mebi = 1 << 20;
  EXPECT_EQ(maxXmlMemory(0), 64 * mebi);
  EXPECT_EQ(maxXmlMemory(1), 64 * mebi + 64);
  EXPECT_EQ(maxXmlMemory(15 * mebi), 1024 * mebi);
  EXPECT_EQ(maxXmlMemory(15 * mebi + 1), 1024 * mebi);
  EXPECT_EQ(maxXmlMemory(256 * mebi), 1024 * mebi);
}

// Takes more than the 64 MiB that every document may.
std::string differentNames() {
  std::string document = "<a>";
  for (int i = 0; i < 600000; ++i) {
    document += "<";
    for (int rest = i; rest > 0; rest /= 52)
      document += static_cast<char>((rest % 52 < 26 ? 'A' : 'a' - 26) + rest % 52);
    document += "_/>";
  }
  return document + "</a>";
}

TEST(Xml, DocumentOfDifferentNamesMayTakeTheMemoryForThem) {
  struct : XmlVisitor {
  } unmoved;
  EXPECT_EQ(walkXml(bytesOf(differentNames()), unmoved).kind, Kind::wellFormed);
}

TEST(Xml, WalkWithinAWalkHasALimitOfItsOwn) {
  struct : XmlVisitor {
    bool onElementStart(std::string_view name, std::size_t /*offset*/) override {
      if (name == "a") within = {endOf(entityInAttribute(95)).what, endOf("<c/>").what};
      return true;
    }
    std::vector<std::string_view> within;
  } visitor;
  EXPECT_EQ(walkXml(bytesOf(differentNames()), visitor).kind, Kind::wellFormed);
  EXPECT_EQ(visitor.within, (std::vector<std::string_view>{"takes too much memory", ""}));
}

// What the work answers in a process that may get 16 MiB more than it has; false if that cannot be.
template <class Work>
bool inLittleMemory(Work work) {
  return test::inChildProcess([&] {
    std::size_t pages = 0;  // that the process has by now
    std::ifstream("/proc/self/statm") >> pages;
    const std::size_t some = std::size_t{16} << 20;
    rlimit limit = {};
    if (pages == 0 || ::getrlimit(RLIMIT_AS, &limit) != 0) return false;
    limit.rlim_cur = pages * static_cast<std::size_t>(::sysconf(_SC_PAGESIZE)) + some;
    return ::setrlimit(RLIMIT_AS, &limit) == 0 && work();
  });
}

TEST(Xml, MemoryThatTheSystemLacksReachesTheCaller) {
#ifdef OXMV_ADDRESS_SANITIZER
  GTEST_SKIP() << "the sanitizer ends the program where the system has no memory";
#endif
  const std::string document = "<a b='" + std::string(std::size_t{64} << 20, 'x') + "'/>";
  const auto maps = [&] {
    return ::mmap(nullptr, document.size(), PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0) !=
           MAP_FAILED;
  };
  if (inLittleMemory(maps)) GTEST_SKIP() << "an emulator that keeps no program to its limits";
  EXPECT_TRUE(inLittleMemory([&] {
    Recorder recorder;
    try {
      walk(document, recorder);
    } catch (const std::bad_alloc&) {
      return true;
    }
    return false;
  }));
}

// A chain of entities, each within the next.
std::string chain(std::size_t nested) {
  std::string document = "<!DOCTYPE a [<!ENTITY e0 'x'>";
  for (std::size_t i = 1; i <= nested; ++i) {
    document += "<!ENTITY e" + std::to_string(i) + " '&e" + std::to_string(i - 1) + ";'>";
  }
  return document + "]><a b='&e" + std::to_string(nested) + ";'>&e" + std::to_string(nested) +
         ";</a>";
}

TEST(Xml, EntitiesWithinEntitiesAreLimited) {
  EXPECT_EQ(textsOf(chain(maxXmlNestedEntities)), "x");
  const XmlEnd end = endOf(chain(maxXmlNestedEntities + 1));
  EXPECT_EQ(end.kind, Kind::malformed);
  EXPECT_EQ(end.what, "too many entities within entities");
  EXPECT_EQ(endOf(chain(100000)).kind, Kind::malformed);
}

// Declares attributes of one element, in one list or each in its own, without a default or with
// one.
std::string declaring(std::size_t attributes, std::string_view between, std::string_view what) {
  std::string document = "<!DOCTYPE a [<!ATTLIST a";
  for (std::size_t i = 0; i < attributes; ++i) {
    if (i > 0) document += between;
    document += " b" + std::to_string(i) + ' ' + std::string(what);
  }
  return document + ">]><a/>";
}

TEST(Xml, DeclaredAttributesAreLimited) {
  for (const char* between : {"", "><!ATTLIST a", "><!ATTLIST c"}) {
    for (const char* what : {"CDATA #IMPLIED", "CDATA 'x'", "(x|y) 'x'", "ID #REQUIRED"}) {
      EXPECT_EQ(endOf(declaring(maxXmlDeclaredAttributes, between, what)).kind, Kind::wellFormed)
          << between << what;
      const XmlEnd end = endOf(declaring(maxXmlDeclaredAttributes + 1, between, what));
      EXPECT_EQ(end.kind, Kind::malformed);
      EXPECT_EQ(end.what, "too many attributes declared");
    }
  }
}

TEST(Xml, ManyDeclaredAttributesOfManyElementsAreRefusedAtOnce) {
  std::string document = declaring(20000, "", "CDATA 'x'");
  document.resize(document.size() - std::string_view("<a/>").size());
  document += "<r>";
  for (int i = 0; i < 200000; ++i) document += "<a/>";
  EXPECT_EQ(endOf(document + "</r>").what, "too many attributes declared");
}

TEST(Xml, ReadsDeclarationsInAndBehindAParameterEntity) {
  EXPECT_EQ(textsOf("<!DOCTYPE a [<!ENTITY % p '<!ENTITY e \"x\">'>%p;]><a>&e;</a>"), "x");
  EXPECT_EQ(textsOf("<!DOCTYPE a [<!ENTITY % p ' '>%p;<!ENTITY e 'x'>]><a>&e;</a>"), "x");
}

TEST(Xml, DeclarationsInAndBehindAParameterEntityCount) {
  const std::string one = "<!DOCTYPE a [<!ENTITY % p '<!ATTLIST a p CDATA #IMPLIED>'>%p;";
  const std::string_view start = "<!DOCTYPE a [";
  const std::string rest = declaring(maxXmlDeclaredAttributes, "", "CDATA 'x'");
  EXPECT_EQ(endOf(one + rest.substr(start.size())).what, "too many attributes declared");
  const std::string fewer = declaring(maxXmlDeclaredAttributes - 1, "", "CDATA 'x'");
  EXPECT_EQ(endOf(one + fewer.substr(start.size())).kind, Kind::wellFormed);
}

// A chain of parameter entities, each within the next.
std::string parameterChain(std::size_t nested) {
  std::string document = "<!DOCTYPE a [<!ENTITY % e0 '<!ENTITY x \"y\">'>";
  for (std::size_t i = 1; i <= nested; ++i) {
    document += "<!ENTITY % e" + std::to_string(i) + " '&#37;e" + std::to_string(i - 1) + ";'>";
  }
  return document + "%e" + std::to_string(nested) + ";]><a>&x;</a>";
}

TEST(Xml, ParameterEntitiesWithinParameterEntitiesAreLimited) {
  EXPECT_EQ(textsOf(parameterChain(maxXmlNestedEntities)), "y");
  EXPECT_EQ(endOf(parameterChain(maxXmlNestedEntities + 1)).what,
            "too many entities within entities");
  EXPECT_EQ(endOf(parameterChain(100000)).kind, Kind::malformed);
  EXPECT_EQ(endOf("<!DOCTYPE a [<!ENTITY % e '&#37;e;'>%e;]><a/>").kind, Kind::malformed);
}

TEST(Xml, ParameterEntityFromOutsideIsNeverOpened) {
  const test::TempDir folder;
  const std::string outside = folder / "outside";
  std::ofstream(outside) << "<!ENTITY x 'loaded'>";
  for (const std::string& start :
       {"<!DOCTYPE a SYSTEM '" + outside + "'>", "<!DOCTYPE a SYSTEM 'file://" + outside + "'>",
        "<!DOCTYPE a [<!ENTITY % e SYSTEM '" + outside + "'>%e;]>",
        "<!DOCTYPE a [<!ENTITY % e PUBLIC 'p' 'file://" + outside + "'>%e;]>"}) {
    EXPECT_EQ(textsOf(start + "<a>&x;</a>"), "") << start;
  }
  // What is declared behind it might mean something else there, and so is passed over.
  EXPECT_EQ(
      textsOf("<!DOCTYPE a [<!ENTITY % e SYSTEM '" + outside + "'>%e;<!ENTITY x 'y'>]><a>&x;</a>"),
      "");
}

std::string nested(std::size_t depth) {
  std::string document;
  for (std::size_t i = 0; i < depth; ++i) document += "<a>";
  for (std::size_t i = 0; i < depth; ++i) document += "</a>";
  return document;
}

TEST(Xml, DepthIsLimited) {
  EXPECT_EQ(endOf(nested(maxXmlDepth)).kind, Kind::wellFormed);
  const XmlEnd end = endOf(nested(maxXmlDepth + 1));
  EXPECT_EQ(end.kind, Kind::malformed);
  EXPECT_EQ(end.what, "elements nested too deep");
  EXPECT_EQ(endOf(nested(1000000)).kind, Kind::malformed);
}

TEST(Xml, NeedsLittleStack) {
  const std::size_t used = test::stackUsedBy(
      [] {
        EXPECT_EQ(endOf(nested(maxXmlDepth)).kind, Kind::wellFormed);
        EXPECT_EQ(endOf(chain(maxXmlNestedEntities)).kind, Kind::wellFormed);
        EXPECT_EQ(endOf(parameterChain(maxXmlNestedEntities)).kind, Kind::wellFormed);
      },
      std::size_t{1} << 20);
  EXPECT_LE(used, std::size_t{64} << 10);
}

TEST(Xml, TakesHugeAttributesAndNames) {
  const std::string huge(1 << 20, 'x');
  EXPECT_EQ(endOf("<a b='" + huge + "'/>").kind, Kind::wellFormed);
  EXPECT_EQ(endOf("<" + huge + "/>").kind, Kind::wellFormed);
  EXPECT_EQ(endOf("<!--" + huge + "--><a/>").kind, Kind::wellFormed);
  std::string many = "<a";
  for (int i = 0; i < 20000; ++i) many += " a" + std::to_string(i) + "=''";
  EXPECT_EQ(endOf(many + "/>").kind, Kind::wellFormed);
}

TEST(Xml, VisitorMayStop) {
  class Stopper final : public Recorder {
    bool onElementStart(std::string_view name, std::size_t offset) override {
      Recorder::onElementStart(name, offset);
      return name != "b";
    }
  };
  Stopper stopper;
  const XmlEnd end = walk("<a><b/><c/></a>", stopper);
  EXPECT_EQ(end.kind, Kind::stopped);
  EXPECT_EQ(end.offset, 3u);
  EXPECT_EQ(stopper.events, "<a@0 <b@3 ");
}

TEST(Xml, WhatTheVisitorThrowsReachesTheCaller) {
  class Thrower final : public Recorder {
    bool onComment(std::string_view, std::size_t) override { throw std::bad_alloc(); }
  };
  Thrower thrower;
  EXPECT_THROW(walk("<a><!--b--><c/></a>", thrower), std::bad_alloc);
  EXPECT_EQ(thrower.events, "<a@0 ");
}

TEST(Xml, VisitorNeedNotHearOfAnything) {
  class Deaf final : public XmlVisitor {};
  Deaf visitor;
  EXPECT_EQ(
      walkXml(bytesOf("<?xml version='1.0'?><!DOCTYPE a><a>T<!--c--><?d e?><![CDATA[g]]></a>"),
              visitor)
          .kind,
      Kind::wellFormed);
  const XmlEnd end = walkXml(bytesOf("<a>T<!--c--></b>"), visitor);
  EXPECT_EQ(end.kind, Kind::malformed);
  EXPECT_EQ(end.offset, 14u);
}

std::pair<std::size_t, std::size_t> lineAndColumn(std::string_view document, std::size_t offset) {
  const XmlPosition position = XmlPositions(bytesOf(document)).of(offset);
  return {position.line, position.column};
}

using Place = std::pair<std::size_t, std::size_t>;

TEST(XmlPositions, CountsLinesAndColumnsFromOne) {
  const std::string_view text = "ab\ncd\r\ne\rf";
  EXPECT_EQ(lineAndColumn(text, 0), Place(1, 1));
  EXPECT_EQ(lineAndColumn(text, 2), Place(1, 3));
  EXPECT_EQ(lineAndColumn(text, 3), Place(2, 1));
  EXPECT_EQ(lineAndColumn(text, 7), Place(3, 1));
  EXPECT_EQ(lineAndColumn(text, 9), Place(4, 1));
  EXPECT_EQ(lineAndColumn(text, 10), Place(4, 2));
  EXPECT_EQ(lineAndColumn(text, 1000), Place(4, 2));
  EXPECT_EQ(lineAndColumn("", 0), Place(1, 1));
  EXPECT_EQ(lineAndColumn("a\r", 2), Place(2, 1));
  EXPECT_EQ(lineAndColumn("\n\r", 2), Place(3, 1));
}

TEST(XmlPositions, MayBeAskedInAnyOrder) {
  const std::string_view text = "ab\ncd\r\ne\r\u00E9f";
  XmlPositions positions(bytesOf(text));
  for (const std::size_t offset : std::vector<std::size_t>{0, 4, 6, 7, 7, 2, 100, 11, 0, 9}) {
    const XmlPosition position = positions.of(offset);
    EXPECT_EQ(Place(position.line, position.column), lineAndColumn(text, offset)) << offset;
  }
}

TEST(XmlPositions, CountsCharacters) {
  EXPECT_EQ(lineAndColumn("\u00E9\u20ACx", 5), Place(1, 3));
  EXPECT_EQ(lineAndColumn("\xEF\xBB\xBFx", 3), Place(1, 1));
  EXPECT_EQ(lineAndColumn("\xE9\xE9x", 2), Place(1, 3));  // ISO-8859-1
  using namespace std::string_view_literals;
  EXPECT_EQ(lineAndColumn("\xFF\xFE<\0\n\0a\0b\0"sv, 8), Place(2, 2));
  EXPECT_EQ(lineAndColumn("\xFE\xFF\0<\0\n\0a\0b"sv, 8), Place(2, 2));
  EXPECT_EQ(lineAndColumn("<\0\xD8\x3C\xDF\xA8x\0"sv, 1), Place(1, 2));
  EXPECT_EQ(lineAndColumn("<\0<\xD8\xA8\xDFx\0"sv, 6), Place(1, 3));  // two units, one character
  EXPECT_EQ(lineAndColumn("\xFF\xFE<\0a"sv, 5),
            Place(1, 3));  // of the last character half is there
}

// Characters and first bytes that look like a byte order mark, and are none.
TEST(XmlPositions, CountsWhatIsNoByteOrderMark) {
  using namespace std::string_view_literals;
  EXPECT_EQ(lineAndColumn("\uFF01x", 3), Place(1, 2));
  EXPECT_EQ(lineAndColumn("\uFEFEx", 3), Place(1, 2));
  EXPECT_EQ(lineAndColumn("x\uFEFFx", 4), Place(1, 3));
  EXPECT_EQ(lineAndColumn("\xFE\xFF\xFF\x01\xFE\xFFx"sv, 6), Place(1, 3));
  EXPECT_EQ(lineAndColumn("\xFE\xFEx", 2), Place(1, 3));  // ISO-8859-1
  EXPECT_EQ(lineAndColumn("\xFF\xFFx", 2), Place(1, 3));
  EXPECT_EQ(lineAndColumn("\xEF\xBBx", 2), Place(1, 3));
}

}  // namespace
}  // namespace oxmv
