#include <memory>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "oxmv/values/Text.h"

namespace oxmv::test {
namespace {

using namespace std::string_view_literals;

// A copy of exactly its size, where the address sanitizer sees every read beyond it.
class Alone {
 public:
  explicit Alone(std::string_view text) : copy_(new char[text.size()]), size_(text.size()) {
    text.copy(copy_.get(), size_);
  }
  std::string_view text() const { return {copy_.get(), size_}; }

 private:
  std::unique_ptr<char[]> copy_;
  std::size_t size_;
};

TEST(Text, AsciiIsEveryByteBelow0x80) {
  EXPECT_TRUE(isAscii(""));
  EXPECT_TRUE(isAscii("\0\x01\x7F"sv));
  EXPECT_FALSE(isAscii("\x80"));
  EXPECT_FALSE(isAscii("Caf\xC3\xA9"));
}

TEST(Text, OneByteSpoilsAsciiWhereverItStands) {
  for (std::size_t size = 1; size <= 40; ++size) {
    EXPECT_TRUE(isAscii(Alone(std::string(size, 'a')).text())) << size;
    for (std::size_t place = 0; place < size; ++place) {
      std::string text(size, 'a');
      text[place] = '\x80';
      EXPECT_FALSE(isAscii(Alone(text).text())) << place << " of " << size;
    }
  }
}

// The first and last characters of every length, and those beside the surrogates.
TEST(Text, TakesWellFormedUtf8) {
  for (const char* character :
       {"\x01", "\x7F", "\xC2\x80", "\xDF\xBF", "\xE0\xA0\x80", "\xE0\xBF\xBF", "\xE1\x80\x80",
        "\xEC\xBF\xBF", "\xED\x80\x80", "\xED\x9F\xBF", "\xEE\x80\x80", "\xEF\xBF\xBF",
        "\xF0\x90\x80\x80", "\xF0\xBF\xBF\xBF", "\xF1\x80\x80\x80", "\xF3\xBF\xBF\xBF",
        "\xF4\x80\x80\x80", "\xF4\x8F\xBF\xBF"}) {
    EXPECT_TRUE(isUtf8(Alone(character).text())) << testing::PrintToString(character);
  }
  EXPECT_TRUE(isUtf8(""));
  EXPECT_TRUE(isUtf8("\0"sv));
}

TEST(Text, RefusesIllFormedUtf8) {
  for (const std::string_view bytes : {"\x80"sv,
                                       "\xBF"sv,  // a middle without a beginning
                                       "\xC0\x80"sv,
                                       "\xC1\xBF"sv,
                                       "\xE0\x80\x80"sv,  // longer than need be
                                       "\xE0\x9F\xBF"sv,
                                       "\xF0\x80\x80\x80"sv,  //
                                       "\xF0\x8F\xBF\xBF"sv,  //
                                       "\xED\xA0\x80"sv,
                                       "\xED\xBF\xBF"sv,  // surrogates
                                       "\xF4\x90\x80\x80"sv,
                                       "\xF5\x80\x80\x80"sv,  // above U+10FFFF
                                       "\xFF"sv,
                                       "\xFE"sv,  // never in UTF-8
                                       "\xC2"sv,
                                       "\xE1\x80"sv,
                                       "\xF1\x80\x80"sv,
                                       "\xF1"sv,  // cut off
                                       "\xC2\x41"sv,
                                       "\xC2\xC0"sv,
                                       "\xE1\x41\x80"sv,  // no middle where one has to be
                                       "\xE1\x80\x41"sv,
                                       "\xE1\x80\xC0"sv,  //
                                       "\xF1\x41\x80\x80"sv,
                                       "\xF1\x80\x41\x80"sv,  //
                                       "\xF1\x80\x80\x41"sv,
                                       "\xF1\x80\x80\xC0"sv}) {  //
    EXPECT_FALSE(isUtf8(Alone(bytes).text())) << testing::PrintToString(bytes);
    EXPECT_FALSE(isUtf8(Alone("ab" + std::string(bytes)).text())) << testing::PrintToString(bytes);
  }
}

TEST(Text, OneByteSpoilsUtf8WhereverItStands) {
  const std::string good = "na\xC3\xAFve 16 Bytes \xE2\x82\xAC and more \xF0\x9F\x8E\xAC of them";
  ASSERT_TRUE(isUtf8(Alone(good).text()));
  for (std::size_t place = 0; place <= good.size(); ++place) {
    std::string bad = good;
    bad.insert(place, 1, '\xFF');
    EXPECT_FALSE(isUtf8(Alone(bad).text())) << place;
  }
}

TEST(Text, Latin1BecomesUtf8) {
  EXPECT_EQ(utf8FromLatin1(""), "");
  EXPECT_EQ(utf8FromLatin1("ab\0\x7F"sv), "ab\0\x7F"sv);
  EXPECT_EQ(utf8FromLatin1("\x80\xBF\xC0\xE9\xFF"),
            "\xC2\x80\xC2\xBF\xC3\x80\xC3\xA9\xC3\xBF");  // U+0080 U+00BF U+00C0 U+00E9 U+00FF
}

TEST(Text, Utf16CountsACharacterAboveFFFFTwice) {
  EXPECT_EQ(utf16Length(""), 0u);
  EXPECT_EQ(utf16Length("abc\0"sv), 4u);
  EXPECT_EQ(utf16Length("\xC2\x80\xDF\xBF"), 2u);
  EXPECT_EQ(utf16Length("\xE0\xA0\x80\xEF\xBF\xBF"), 2u);
  EXPECT_EQ(utf16Length("\xF0\x90\x80\x80"), 2u);
  EXPECT_EQ(utf16Length("\xF4\x8F\xBF\xBF\xF1\x80\x80\x80"), 4u);
}

}  // namespace
}  // namespace oxmv::test
