// What holds for the losses of any dictionary, tried on many.

#include <algorithm>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"
#include "tests/support/RealLosses.h"

namespace oxmv {
namespace {

using test::comesBack;
using test::isReal;

// Random dictionaries, most of whose values are of the kind that their tag carries, and many at the
// edges.
class Maker {
 public:
  explicit Maker(std::uint32_t seed) : random_(seed) {}

  Dictionary dictionary(int depth) {
    Dictionary made;
    const std::size_t count = below(6);
    for (std::size_t i = 0; i < count; ++i) {
      const TagRow& row = tagRows()[below(tagRows().size())];
      const auto characters = charactersOf(row.tag);
      const std::string key =
          oneIn(40) ? oddKey() : std::string(characters.data(), characters.size());
      made.set(key, oneIn(8) ? anyValue(depth) : fittingValue(row, depth));
    }
    return made;
  }

 private:
  std::size_t below(std::size_t end) { return random_() % end; }
  bool oneIn(std::size_t count) { return below(count) == 0; }

  std::string oddKey() {
    static const std::vector<std::string> keys = {"",     "A",    "ABC",      "ABCDE",
                                                  "reel", "ZZZZ", "CTLPData", "R\xC3\xA9L"};
    return keys[below(keys.size())];
  }

  Value fittingValue(const TagRow& row, int depth) {
    switch (row.write) {
      case Write::timecode:
      case Write::text:
      case Write::fourCC: return text();
      case Write::float32: return number();
      case Write::none:
      case Write::integerH:
      case Write::integerL:
      case Write::integerR: return integer();
      case Write::word16: return oneIn(4) ? integer() : static_cast<std::int32_t>(below(65536));
      case Write::byte8: return oneIn(4) ? integer() : static_cast<std::int32_t>(below(256));
      case Write::guid: return data(oneIn(3) ? below(40) : 16);
      case Write::data: return data(dataSize());
      case Write::floatPair:
      case Write::floats: return array(oneIn(6) ? below(5) : row.count, [&] { return number(); });
      case Write::integerArray: return array(oneIn(2) ? 1 : below(4), [&] { return integer(); });
      case Write::integerEach: return array(below(4), [&] { return integer(); });
      case Write::textEach: return array(below(4), [&] { return text(); });
      case Write::nested: return nested(depth);
      case Write::nestedEach: return array(below(3), [&] { return nested(depth); });
      case Write::controlPoint: return array(below(3), [&] { return controlPoint(depth); });
      case Write::tagGroup:
      case Write::regGroup: return group();
    }
    return 0;
  }

  Value anyValue(int depth) {
    switch (below(7)) {
      case 0: return integer();
      case 1: return number();
      case 2: return text();
      case 3: return data(dataSize());
      case 4: return nested(depth);
      case 5: return group();
      default: return array(below(5), [&] { return anyValue(depth - 1); });
    }
  }

  Value nested(int depth) { return depth > 0 ? dictionary(depth - 1) : Dictionary(); }

  Value controlPoint(int depth) {
    Dictionary made = nested(depth).dictionary();
    if (!oneIn(6)) made.set("CTLPData", array(oneIn(6) ? below(4) : 2, [&] { return integer(); }));
    return made;
  }

  Value group() {
    Dictionary made;
    const std::size_t count = below(4);
    for (std::size_t i = 0; i < count; ++i) {
      const std::string name = oneIn(2) ? text().text() : "name " + std::to_string(below(3));
      made.set(name, oneIn(2) ? text() : oneIn(5) ? number() : integer());
    }
    return made;
  }

  template <class Element>
  Value array(std::size_t count, Element element) {
    std::vector<Value> elements;
    for (std::size_t i = 0; i < count; ++i) elements.push_back(element());
    return Array(std::move(elements));
  }

  Value integer() {
    static const std::vector<std::int64_t> edges = {
        0,     1,      -1,         255,        256,           65535,
        65536, -32768, 0x7FFFFFFF, 0x80000000, -0x80000000LL, 0x100000000LL};
    return oneIn(3) ? edges[below(edges.size())] : static_cast<std::int64_t>(below(200));
  }

  Value number() {
    if (oneIn(10)) return 0.1;
    if (oneIn(10)) return integer();
    return static_cast<float>(below(1000)) / 64.0f;
  }

  Value text() {
    static const std::vector<std::size_t> edges = {0, 1, 3, 4, 5, 254, 255, 256, 300};
    std::string made(oneIn(3) ? edges[below(edges.size())] : below(12), 'x');
    for (char& c : made) c = static_cast<char>('a' + below(26));
    if (!made.empty() && oneIn(6)) made[below(made.size())] = '\0';
    if (oneIn(6)) made.insert(below(made.size() + 1), "\xC3\xA9");
    return oneIn(8) ? Value::derivedText(made) : Value(made);
  }

  std::size_t dataSize() {
    if (oneIn(60)) return 65532 + below(10);
    return oneIn(2) ? below(8) * 4 : below(24);
  }

  static Value data(std::size_t size) { return Value::data(std::vector<std::uint8_t>(size, 0x41)); }

  std::mt19937 random_;
};

std::string describe(const std::vector<Loss>& losses) {
  std::string text;
  for (const Loss& loss : losses) text += std::string(codeOf(loss.code)) + " " + loss.path + "; ";
  return text;
}

TEST(LossesProperty, NoneIsNamedExactlyWhenEverythingComesBack) {
  Maker maker(20261121);
  std::size_t whole = 0;
  for (int i = 0; i < 20000; ++i) {
    const Dictionary tags = maker.dictionary(3);
    for (const Layout layout : {Layout::exact, Layout::readable}) {
      const auto losses = findLosses(tags, layout);
      const bool isWhole = comesBack(tags, layout) == tags;
      ASSERT_EQ(losses.empty(), isWhole) << i << ": " << describe(losses);
      whole += isWhole;
    }
  }
  EXPECT_GT(whole, 2000u);  // both answers were put to the test
  EXPECT_LT(whole, 38000u);
}

TEST(LossesProperty, EveryLossIsRealAndExplained) {
  Maker maker(4);
  std::vector<std::size_t> counts(static_cast<std::size_t>(LossCode::notReadBack) + 1);
  for (int i = 0; i < 20000; ++i) {
    const Dictionary tags = maker.dictionary(3);
    for (const Layout layout : {Layout::exact, Layout::readable}) {
      const auto losses = findLosses(tags, layout);
      for (const Loss& loss : losses) {
        ++counts[static_cast<std::size_t>(loss.code)];
        ASSERT_NE(loss.code, LossCode::notReadBack) << i << ": " << describe(losses);
        ASSERT_TRUE(isReal(loss, tags, layout))
            << i << ": " << codeOf(loss.code) << ' ' << loss.path << " of " << describe(losses);
      }
    }
  }
  for (std::size_t code = 0; code + 1 < counts.size(); ++code) {
    const auto name = codeOf(static_cast<LossCode>(code));
    if (name == "size-24bit" || name == "too-deep") continue;  // too large to make by the thousand
    EXPECT_GT(counts[code], 0u) << name;
  }
}

TEST(LossesProperty, TheOtherLayoutAvoidsWhatItIsSaidToAvoid) {
  Maker maker(77);
  std::size_t avoided = 0;
  for (int i = 0; i < 10000; ++i) {
    const Dictionary tags = maker.dictionary(3);
    for (const Loss& loss : findLosses(tags, Layout::exact)) {
      const auto others = findLosses(tags, Layout::readable);
      const bool isThere = std::any_of(others.begin(), others.end(), [&](const Loss& other) {
        return other.code == loss.code && other.path == loss.path;
      });
      ASSERT_EQ(loss.avoidedBy.has_value(), !isThere) << i << ": " << loss.path;
      avoided += loss.avoidedBy.has_value();
    }
  }
  EXPECT_GT(avoided, 100u);
}

}  // namespace
}  // namespace oxmv
