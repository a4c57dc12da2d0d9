// The library as a guest of an application: another locale, another libjpeg, several threads, a
// host of the application's own. The results are the same, and the process is left as it was.

#include <array>
#include <bit>
#include <cerrno>
#include <clocale>
#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iterator>
#include <map>
#include <memory>
#include <set>
#include <span>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include "oxmv/host/Host.h"
#include "oxmv/import/CameraStill.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/platform/TomlText.h"
#include "oxmv/values/Array.h"
#include "tests/embedding/Interposed.h"
#include "tests/support/EnvironmentVariable.h"
#include "tests/support/Files.h"
#include "tests/support/Printing.h"
#include "tests/support/TempDir.h"

// Of the other libjpeg, rivalJpeg.c.
extern "C" int rivalCalls;

namespace oxmv::test {
namespace {

namespace fs = std::filesystem;

constexpr myGUID guid = {0x01234567, 0x89AB, 0xCDEF, {1, 2, 3, 4, 5, 6, 7, 8}};
const fs::path examples = OXMV_SOURCE_DIR "/examples";

// An application that keeps the files of each of its threads in a folder of their own.
class ApplicationHost final : public Host {
 public:
  static void setFolder(const fs::path& path) { folder() = path; }

  Value copyPreference(std::string_view key, std::string_view) override {
    if (key == "OverridePath" || key == "LUTsPath") return folder().string();
    return {};
  }
  void setPreference(std::string_view, const Value&, std::string_view) override {}
  bool synchronizePreferences(std::string_view, std::error_code*) override { return true; }
  std::string localizedString(std::string_view key, std::string_view builtIn) override {
    return key == "OXMVLutsPath" ? folder().string() : std::string(builtIn);
  }
  void alert(std::string_view) override {}
  void log(std::string_view) override {}

 private:
  static fs::path& folder() {
    thread_local fs::path path;
    return path;
  }
};

class InstalledHost {
 public:
  InstalledHost() : before_(installHost(std::make_shared<ApplicationHost>())) {}
  ~InstalledHost() { installHost(before_); }
  InstalledHost(const InstalledHost&) = delete;
  InstalledHost& operator=(const InstalledHost&) = delete;

 private:
  std::shared_ptr<Host> before_;
};

std::string textOf(std::span<const std::uint8_t> bytes) { return {bytes.begin(), bytes.end()}; }

// What came out of each part of the library, by the part.
using Results = std::map<std::string, std::string>;

Bytes encoded(const Dictionary& tags) {
  return encodeStream(tags, Layout::exact).value_or(Bytes());
}

void workOnStreams(Results& results) {
  for (const char* name : {"walk.colr", "groups-and-lists.colr", "typical-clip.colr"}) {
    const Bytes stream = getFile(examples / name);
    const MetadataDictionary clip = MetadataDictionary().initWithData(stream);
    results["encoded " + std::string(name)] = textOf(encoded(clip.metadata()));
  }
  TagStreamEditor editor(getFile(examples / "walk.colr"));
  results["edited"] = editor.set("COL1/SATU", 0.75f) ? "refused" : textOf(editor.stream());
  for (const Loss& loss :
       findLosses(Dictionary{{"SATU", 0.1}, {"REEL", "\u0130stanbul"}}, Layout::exact)) {
    results["losses"] += loss.path + ' ' + loss.message + '\n';
  }
  results["label"] = *MetadataDictionary::translateTag("WBAL");
}

void workOnTexts(Results& results) {
  results["float"] = std::to_string(Value("1.5,5").floatValue() == 1.5f);
  results["integer"] = std::to_string(Value("1.234").intValue());
  results["GUID"] =
      guidText(guidFromText("01234567-89ab-cdef-0102-030405060708").value_or(myGUID()));
  if (const auto toml = TomlText::parse("a = 1.5\nb = 1_000")) {
    results["TOML"] = std::to_string(toml->values() == Dictionary{{"a", 1.5}, {"b", 1000}});
  }
}

void workOnLooks(Results& results, const fs::path& folder) {
  const auto look = LookFileRef::initFromLookFile(examples / "warm.xml");
  results["look"] = look ? look->displayName().value_or("no name") : "refused";
  results["look-table file"] = textOf(getFile(folder / "44F9EE41.oxlook"));
  // In Turkish these are different letters.
  const auto named = [&](std::string_view name) {
    Bytes record = getFile(folder / "44F9EE41.oxlook");
    LookFileRef made;
    return made.generateLUTFile(name == "TITLE" ? 2 : 3, record, 3, name) ? made : LookFileRef();
  };
  const auto order = named("TITLE").lookNameCompare(named("title"));
  results["names of looks"] = order == 0 ? "equal" : "different";
}

void workOnStills(Results& results) {
  const Bytes still = getFile(examples / "still.jpg");
  const CalendarTime created = {
      .year = 2024, .month = 2, .day = 29, .hour = 1, .minute = 2, .second = 3};
  const auto tags = tagsOfStill(still, created, "A001", CameraTables::builtIn());
  results["still"] = tags ? textOf(encoded(*tags)) : "no image";
  const auto fromFile = MetadataDictionary::metadataFromJPEGFile(examples / "still.jpg", "A001");
  results["model"] = fromFile ? std::string((*fromFile)["CMDL"].text()) : "no image";
}

void workOnClips(Results& results, const fs::path& folder) {
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.addObject(Array::of(1.0f, 1.25f, 1.0f, 1.5f), "WBAL");
  const bool isSaved = clip.writeToGUIDFile() && clip.writeToOverride();
  results["saved"] = isSaved ? clip.fileURL().lexically_relative(folder).string() : "failed";
  results["loaded"] = textOf(encoded(MetadataDictionary::initFromGUID(guid).metadata())) +
                      textOf(encoded(MetadataDictionary::initFromOverride().metadata()));
  results["last"] =
      std::to_string(static_cast<int>(MetadataDictionary::initFromLast().loadError()));
}

// Everything that the library does, in a folder that is there.
Results workIn(const fs::path& folder) {
  ApplicationHost::setFolder(folder);
  Results results;
  workOnStreams(results);
  workOnTexts(results);
  workOnLooks(results, folder);
  workOnStills(results);
  workOnClips(results, folder);
  return results;
}

class Embedding : public testing::Test {
 protected:
  Results work() {
    const fs::path folder = dir_ / std::to_string(++folders_);
    fs::create_directories(folder / "db");
    return workIn(folder);
  }

  // The same in two threads at once.
  std::array<Results, 2> workInThreads() {
    std::array<fs::path, 2> folders;
    for (fs::path& folder : folders) {
      folder = dir_ / std::to_string(++folders_);
      fs::create_directories(folder / "db");
    }
    std::array<Results, 2> results;
    std::thread one([&] { results[0] = workIn(folders[0]); });
    std::thread other([&] { results[1] = workIn(folders[1]); });
    one.join();
    other.join();
    return results;
  }

  fs::path dir() const { return dir_.path(); }

 private:
  const TempDir dir_;
  int folders_ = 0;
  const InstalledHost host_;
};

TEST_F(Embedding, DoesItsWork) {
  Results results = work();
  EXPECT_EQ(results["encoded walk.colr"], textOf(getFile(examples / "walk.colr")));
  EXPECT_EQ(results["look"], "warm");
  EXPECT_EQ(results["look-table file"].size(), 64u + 81 * 4);
  EXPECT_EQ(results["names of looks"], "equal");
  EXPECT_EQ(results["float"], "1");
  EXPECT_EQ(results["integer"], "1");
  EXPECT_EQ(results["GUID"], "01234567-89AB-CDEF-0102-030405060708");
  EXPECT_EQ(results["TOML"], "1");
  EXPECT_EQ(results["label"], "White balance");
  EXPECT_EQ(results["model"], "QX Gamma");
  EXPECT_EQ(results["saved"], "db/01234567-89AB-CDEF-0102-030405060708.colr");
  EXPECT_EQ(results["loaded"].size(), 2u * 24);
  for (const auto& [part, result] : results) EXPECT_FALSE(result.empty()) << part;
}

TEST_F(Embedding, GivesTheSameInOtherLocales) {
  if (std::system("command -v localedef >/dev/null") != 0) GTEST_SKIP() << "no localedef";
  const Results results = work();
  const fs::path locales = dir() / "locales";
  fs::create_directory(locales);
  const EnvironmentVariable path("LOCPATH", locales);
  // That program may be another machine's, where ours is emulated.
  const std::string order =
      std::endian::native == std::endian::big ? " --big-endian" : " --little-endian";
  for (const std::string name : {"tr_TR", "de_DE"}) {
    const fs::path locale = locales / (name + ".UTF-8");
    const std::string make = "localedef -i " + name + " -f UTF-8" + order + " " + locale.string();
    ASSERT_EQ(std::system(make.c_str()), 0) << "the package with the sources of locales?";
    ASSERT_NE(std::setlocale(LC_ALL, (name + ".UTF-8").c_str()), nullptr);
    // The locale is one that would show.
    ASSERT_STREQ(std::localeconv()->decimal_point, ",");

    for (const Results& other : workInThreads()) EXPECT_EQ(other, results) << name;
    EXPECT_EQ(std::setlocale(LC_ALL, nullptr), name + ".UTF-8");
    std::setlocale(LC_ALL, "C");
  }
}

TEST_F(Embedding, KeepsToItsOwnLibjpeg) {
  Dl_info library = {};
  ASSERT_NE(::dladdr(::dlsym(RTLD_DEFAULT, "jpeg_read_header"), &library), 0);
  ASSERT_NE(std::strstr(library.dli_fname, "rivalJpeg"), nullptr) << "the other one comes first";
  EXPECT_EQ(work()["model"], "QX Gamma");
  EXPECT_EQ(rivalCalls, 0);
}

TEST_F(Embedding, PrintsNothing) {
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  workInThreads();
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST(Interposed, SeesWhatAGuestMustNotDo) {
  watchForIntrusions();
  EXPECT_EQ(std::getenv("OXMV_NOT_SET"), nullptr);
  std::setlocale(LC_ALL, "C");
  std::atexit([] {});
  const Intrusions seen = intrusions();
  EXPECT_EQ(seen.variables, std::set<std::string>{"OXMV_NOT_SET"});
  EXPECT_EQ(seen.localeChanges, 1);
  EXPECT_EQ(seen.exitHandlers, 1);
}

TEST_F(Embedding, AsksNothingOfTheEnvironment) {
  watchForIntrusions();
  workInThreads();
  for (const std::string& name : intrusions().variables) {
    // What Expat and libjpeg-turbo ask for: how much to tell of their work, which instructions and
    // how much memory to use. None is of any weight to the results.
    const bool isOfOthers = name.starts_with("EXPAT_") || name.starts_with("JSIMD_") ||
                            name.starts_with("TJ_") || name == "JPEGMEM";
    EXPECT_TRUE(isOfOthers) << name;
  }
}

TEST_F(Embedding, ChangesNothingInTheEnvironment) {
  const auto variables = [] {
    std::vector<std::string> all;
    for (char** variable = ::environ; *variable != nullptr; ++variable) all.emplace_back(*variable);
    return all;
  };
  const auto before = variables();
  const fs::path folder = fs::current_path();
  const mode_t mask = ::umask(022);
  ::umask(mask);
  workInThreads();
  EXPECT_EQ(variables(), before);
  EXPECT_EQ(fs::current_path(), folder);
  EXPECT_EQ(::umask(mask), mask);
}

TEST_F(Embedding, NeverChangesTheLocale) {
  const std::string before = std::setlocale(LC_ALL, nullptr);
  watchForIntrusions();
  workInThreads();
  EXPECT_EQ(intrusions().localeChanges, 0);
  EXPECT_EQ(std::setlocale(LC_ALL, nullptr), before);
}

TEST_F(Embedding, LeavesSignalsAsTheyAre) {
  // All that is known of how the process takes a signal.
  const auto actions = [] {
    std::map<int, std::string> all;
    for (int signal = 1; signal < NSIG; ++signal) {
      struct sigaction action = {};
      if (::sigaction(signal, nullptr, &action) != 0) continue;
      std::string blocked;
      for (int other = 1; other < NSIG; ++other)
        blocked += ::sigismember(&action.sa_mask, other) == 1 ? '1' : '0';
      all[signal] = std::to_string(reinterpret_cast<std::uintptr_t>(action.sa_handler)) + ' ' +
                    std::to_string(action.sa_flags) + ' ' + blocked;
    }
    sigset_t mask = {};
    ::pthread_sigmask(SIG_SETMASK, nullptr, &mask);
    for (int signal = 1; signal < NSIG; ++signal)
      all[0] += ::sigismember(&mask, signal) == 1 ? '1' : '0';
    return all;
  };
  const auto before = actions();
  work();
  EXPECT_EQ(actions(), before);
}

TEST_F(Embedding, LeavesNoThreadChildOrOpenFile) {
  const auto count = [](const char* what) {
    return std::distance(fs::directory_iterator(fs::path("/proc/self") / what), {});
  };
  const auto threads = count("task");
  const auto files = count("fd");
  work();
  EXPECT_EQ(count("task"), threads);
  workInThreads();
  EXPECT_EQ(count("fd"), files);
  EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1);
  EXPECT_EQ(errno, ECHILD);
}

TEST_F(Embedding, HasNothingToDoWhenTheProcessEnds) {
  watchForIntrusions();
  workInThreads();
  EXPECT_EQ(intrusions().exitHandlers, 0);
}

}  // namespace
}  // namespace oxmv::test
