#include <clocale>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

#include <gtest/gtest.h>
#include <libintl.h>

#include "oxmv/host/LinuxHost.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/EnvironmentVariable.h"
#include "tests/support/Printing.h"
#include "tests/support/TempDir.h"

namespace oxmv {
namespace {

namespace fs = std::filesystem;
using test::EnvironmentVariable;

constexpr std::string_view app = "com.ombrix.oxmv";

void put(const fs::path& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

std::string get(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

// A user's file and two of the system, in folders of the test's own.
class LinuxHostPreferences : public testing::Test {
 protected:
  void SetUp() override {
    for (const char* folder : {"user", "first", "second"}) fs::create_directory(dir / folder);
  }

  Value preference(std::string_view key) { return host.copyPreference(key, app); }
  void set(std::string_view key, const Value& value) { host.setPreference(key, value, app); }
  std::error_code synchronize() {
    std::error_code error = std::make_error_code(std::errc::io_error);
    const bool isDone = host.synchronizePreferences(app, &error);
    EXPECT_EQ(isDone, !error);
    return error;
  }

  const test::TempDir dir;
  const fs::path user = dir / "user/com.ombrix.oxmv.toml";
  const fs::path first = dir / "first/com.ombrix.oxmv.toml";
  const fs::path second = dir / "second/com.ombrix.oxmv.toml";
  EnvironmentVariable home{"HOME", (dir / "home").string()};
  EnvironmentVariable config{"XDG_CONFIG_HOME", (dir / "user").string()};
  EnvironmentVariable folders{"XDG_CONFIG_DIRS",
                              (dir / "first").string() + ":" + (dir / "second").string()};
  LinuxHost host;
};

TEST_F(LinuxHostPreferences, AreNothingWhereThereIsNoFile) {
  EXPECT_TRUE(preference("LUTsPath").isNothing());
}

TEST_F(LinuxHostPreferences, ComeFromTheFirstFileThatHasThem) {
  put(user, "a = 'user'");
  put(first, "a = 'first'\nb = 'first'");
  put(second, "a = 'second'\nb = 'second'\nc = 'second'");
  EXPECT_EQ(preference("a"), Value("user"));
  EXPECT_EQ(preference("b"), Value("first"));
  EXPECT_EQ(preference("c"), Value("second"));
  EXPECT_TRUE(preference("d").isNothing());
  EXPECT_EQ(host.findPreference("a", app).file, user);
  EXPECT_EQ(host.findPreference("c", app).file, second);
}

TEST_F(LinuxHostPreferences, AreSeenAsWhatTheyAre) {
  put(user, "a = 5\nb = ['x']\nc = true\nd = ''");
  put(first, "a = 'text'");
  EXPECT_EQ(preference("a"), Value(5));  // also where a later file has a text
  EXPECT_EQ(preference("b").kind(), Value::Kind::array);
  EXPECT_TRUE(preference("c").isNumber());
  EXPECT_EQ(preference("d"), Value(""));
}

TEST_F(LinuxHostPreferences, AreReadAfreshEachTime) {
  put(user, "a = 1");
  EXPECT_EQ(preference("a"), Value(1));
  put(user, "a = 2");
  EXPECT_EQ(preference("a"), Value(2));
}

TEST_F(LinuxHostPreferences, PassOverFilesThatCannotBeRead) {
  put(user, "a = 'user'\nb");
  fs::create_directory(first);
  put(second, "a = 'second'");
  EXPECT_EQ(preference("a"), Value("second"));
}

TEST_F(LinuxHostPreferences, AreKeptByIdentifier) {
  host.setPreference("a", 1, "one");
  host.setPreference("a", 2, "two");
  EXPECT_EQ(host.copyPreference("a", "one"), Value(1));
  EXPECT_TRUE(host.synchronizePreferences("one"));
  EXPECT_EQ(get(dir / "user/one.toml"), "a = 1\n");
  EXPECT_FALSE(fs::exists(dir / "user/two.toml"));
  EXPECT_EQ(host.copyPreference("a", "two"), Value(2));
}

TEST_F(LinuxHostPreferences, AreWrittenWhenTheyAreSynchronised) {
  put(user, "# mine\na = 1 # one\n");
  set("a", "x");
  set("b", 2);
  EXPECT_EQ(preference("a"), Value("x"));
  EXPECT_EQ(host.findPreference("a", app).file, fs::path());
  EXPECT_EQ(get(user), "# mine\na = 1 # one\n");

  EXPECT_FALSE(synchronize());
  EXPECT_EQ(get(user), "# mine\na = \"x\" # one\nb = 2\n");
  EXPECT_EQ(host.findPreference("a", app).file, user);

  put(user, "a = 'theirs'");  // nothing of ours is left to win
  EXPECT_EQ(preference("a"), Value("theirs"));
  EXPECT_FALSE(synchronize());
  EXPECT_EQ(get(user), "a = 'theirs'");
}

TEST_F(LinuxHostPreferences, ShowTheSystemsWhenTheUsersAreRemoved) {
  put(user, "a = 'user'\n");
  put(first, "a = 'first'\n");
  set("a", {});
  EXPECT_EQ(preference("a"), Value("first"));
  EXPECT_FALSE(synchronize());
  EXPECT_EQ(preference("a"), Value("first"));
  EXPECT_EQ(get(user), "");
  EXPECT_EQ(get(first), "a = 'first'\n");
}

TEST_F(LinuxHostPreferences, StayInAFileThatIsNotToml) {
  put(user, "a = \n");
  set("a", "x");
  EXPECT_EQ(synchronize(), PreferencesError::notToml);
  EXPECT_EQ(get(user), "a = \n");
  EXPECT_EQ(preference("a"), Value("x"));

  put(user, "a = 1\n");  // mended: what could not be written is written now
  EXPECT_FALSE(synchronize());
  EXPECT_EQ(get(user), "a = \"x\"\n");
}

TEST_F(LinuxHostPreferences, HaveNoPlaceWithoutAHome) {
  home.set(std::nullopt);
  config.set(std::nullopt);
  put(first, "a = 'first'");
  EXPECT_EQ(preference("a"), Value("first"));
  EXPECT_FALSE(synchronize());  // nothing to write
  set("a", "x");
  EXPECT_EQ(synchronize(), PreferencesError::noPlace);
  EXPECT_EQ(preference("a"), Value("x"));
  EXPECT_EQ(LinuxHost::preferencesFiles(app).size(), 2u);
}

TEST_F(LinuxHostPreferences, HaveNoPlaceForAnIdentifierThatIsNoFileName) {
  std::error_code error;
  host.setPreference("a", 1, "../a");
  EXPECT_FALSE(host.synchronizePreferences("../a", &error));
  EXPECT_EQ(error, PreferencesError::noPlace);
  EXPECT_FALSE(host.synchronizePreferences("../a"));
  EXPECT_EQ(host.copyPreference("a", "../a"), Value(1));
}

TEST_F(LinuxHostPreferences, TakeKeysThatAreNotUtf8AsLatin1) {
  set("\xE9", 1);
  EXPECT_EQ(preference("\xE9"), Value(1));
  EXPECT_FALSE(synchronize());
  EXPECT_EQ(preference("\xE9"), Value(1));
  EXPECT_EQ(preference("é"), Value(1));
}

TEST_F(LinuxHostPreferences, SayWhatIsWrongWithEachFile) {
  put(user, "a = 1\nb");
  put(second, "a = 1");
  const auto files = LinuxHost::preferencesFiles(app);
  ASSERT_EQ(files.size(), 3u);
  EXPECT_EQ(files[0].path, user);
  EXPECT_EQ(files[0].state, PreferencesFile::State::notToml);
  EXPECT_EQ(files[0].problem.line, 2u);
  EXPECT_EQ(files[1].state, PreferencesFile::State::absent);
  EXPECT_EQ(files[2].state, PreferencesFile::State::good);
  EXPECT_EQ(files[2].values, (Dictionary{{"a", 1}}));
}

TEST_F(LinuxHostPreferences, AreForThreadsAtOnce) {
  constexpr int rounds = 10;
  std::vector<std::thread> threads;
  for (const char* key : {"a", "b", "c", "d"}) {
    threads.emplace_back([this, key] {
      for (int i = 1; i <= rounds; ++i) {
        set(key, i);
        EXPECT_EQ(preference(key), Value(i));
        EXPECT_FALSE(synchronize());
        EXPECT_EQ(preference(key), Value(i));
      }
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(readPreferencesFile(user).values,
            (Dictionary{{"a", rounds}, {"b", rounds}, {"c", rounds}, {"d", rounds}}));
}

// Newer values must never be overtaken by older ones that another thread has taken along.
TEST_F(LinuxHostPreferences, StayTheNewestOfThreadsAtOnce) {
  std::vector<std::thread> threads;
  for (int thread = 0; thread < 2; ++thread) {
    threads.emplace_back([this] {
      for (int i = 0; i < 20; ++i) EXPECT_FALSE(synchronize());
    });
  }
  for (int i = 1; i <= 20; ++i) {
    set("a", i);
    EXPECT_EQ(preference("a"), Value(i));
  }
  for (auto& thread : threads) thread.join();
  EXPECT_FALSE(synchronize());
  EXPECT_EQ(readPreferencesFile(user).values["a"], Value(20));
}

// A message catalogue: its pairs in the order of their keys, the empty key first.
std::string catalogue(const std::vector<std::pair<std::string, std::string>>& pairs) {
  const auto count = static_cast<std::uint32_t>(pairs.size());
  const auto number = [](std::uint32_t n) {
    std::string bytes;
    for (int shift = 0; shift < 32; shift += 8) bytes += static_cast<char>(n >> shift & 0xFF);
    return bytes;
  };
  const std::uint32_t headerSize = 28;
  std::string tables[2];
  std::string texts;
  for (int side = 0; side < 2; ++side) {
    for (const auto& pair : pairs) {
      const std::string& text = side == 0 ? pair.first : pair.second;
      const auto offset = headerSize + 16 * count + static_cast<std::uint32_t>(texts.size());
      tables[side] += number(static_cast<std::uint32_t>(text.size())) + number(offset);
      texts += text + '\0';
    }
  }
  return number(0x950412DE) +              // magic
         number(0) + number(count) +       // revision, strings
         number(headerSize) +              // where the keys' table is
         number(headerSize + 8 * count) +  // and that of the texts
         number(0) + number(0) +           // no hash table
         tables[0] + tables[1] + texts;
}

TEST(LinuxHostStrings, AreTheBuiltInOnesWithoutACatalogue) {
  LinuxHost host;
  EXPECT_EQ(host.localizedString("OXMVLutsPath", "/built/in"), "/built/in");
  EXPECT_EQ(host.localizedString("OXMVLutsPath", ""), "");
}

TEST(LinuxHostStrings, AreTheBuiltInOnesForKeysThatAreNone) {
  LinuxHost host;
  EXPECT_EQ(host.localizedString("", "built in"), "built in");
  EXPECT_EQ(host.localizedString(std::string_view("OXMVLutsPath\0x", 14), "built in"), "built in");
}

TEST(LinuxHostStrings, ComeFromTheCatalogueOfTheTextDomain) {
  // In the plain C locale gettext looks into no catalogue.
  const std::string before = std::setlocale(LC_ALL, nullptr);
  const char* const locale = std::setlocale(LC_ALL, "C.UTF-8");
  std::setlocale(LC_ALL, before.c_str());
  if (locale == nullptr) GTEST_SKIP() << "there is no locale C.UTF-8";

  const test::TempDir dir;
  // Newer systems ask for a catalogue of that name, older ones also for a language's.
  for (const char* name : {"C.UTF-8", "de"}) {
    fs::create_directories(dir / name / "LC_MESSAGES");
    put(dir / name / "LC_MESSAGES/viewer.mo",
        catalogue({{"", "Content-Type: text/plain; charset=UTF-8\n"},
                   {"OXMVGUIDPathTemplate", "%@/%@/%08X.colr"},
                   {"OXMVLutsPath", "/Farbtöne"},
                   {"same", "same"}}));
  }
  EXPECT_TRUE(test::inChildProcess([&] {
    ::setenv("LANGUAGE", "de", 1);
    std::setlocale(LC_ALL, "C.UTF-8");
    ::bindtextdomain("viewer", dir.path().c_str());
    ::textdomain("viewer");
    LinuxHost host;
    const std::string_view key = std::string_view("OXMVLutsPath, and more").substr(0, 12);
    return host.localizedString(key, "built in") == "/Farbtöne" &&
           host.localizedString("OXMVGUIDPathTemplate", "built in") == "%@/%@/%08X.colr" &&
           host.localizedString("same", "built in") == "same" &&
           host.localizedString("other", "built in") == "built in" &&
           host.localizedString("", "built in") == "built in";
  }));
}

}  // namespace
}  // namespace oxmv
