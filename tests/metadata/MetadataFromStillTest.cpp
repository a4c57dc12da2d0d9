#include <fstream>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/import/CameraTables.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/values/Array.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Printing.h"
#include "tests/support/StillBuilder.h"
#include "tests/support/TempDir.h"
#include "tests/support/TestData.h"

namespace oxmv::test {
namespace {

const std::filesystem::path example = OXMV_SOURCE_DIR "/examples/still.jpg";

void put(const std::filesystem::path& path, const Bytes& content) {
  std::ofstream(path, std::ios::binary)
      .write(reinterpret_cast<const char*>(content.data()),
             static_cast<std::streamsize>(content.size()));
}

TEST(MetadataFromStill, TheExampleTellsItsTags) {
  const InstalledFakeHost host;
  auto tags = MetadataDictionary::metadataFromJPEGFile(example, "A001");
  ASSERT_TRUE(tags);
  // When a copy of it was made is not known here, nor whether that is remembered.
  for (const char* tag : {"STIM", "SDAT", "TIMC"}) tags->remove(tag);
  EXPECT_EQ(*tags, (Dictionary{{"TIMB", 30},
                               {"REEL", "A001"},
                               {"CMDL", "QX Gamma"},
                               {{"FOV", 4}, Array::of(87)},
                               {"FIRM", "QX3.01.02.00"}}));
}

TEST(MetadataFromStill, TheExampleIsTheStillOfTheTests) {
  EXPECT_EQ(testData(example), exampleStill());
}

TEST(MetadataFromStill, NoPathAnswersNothing) {
  EXPECT_EQ(MetadataDictionary::metadataFromJPEGFile(std::nullopt, "A001"), std::nullopt);
}

TEST(MetadataFromStill, NoFileOrNoImageAnswersNothing) {
  const InstalledFakeHost host;
  const TempDir folder;
  EXPECT_EQ(MetadataDictionary::metadataFromJPEGFile(folder / "missing.jpg", ""), std::nullopt);
  put(folder / "text.jpg", bytesOf("not a picture"));
  EXPECT_EQ(MetadataDictionary::metadataFromJPEGFile(folder / "text.jpg", ""), std::nullopt);
  EXPECT_TRUE(host->logLines.empty());
}

TEST(MetadataFromStill, KeepsTheRangeErrorForItsCaller) {
  const InstalledFakeHost host;
  const TempDir folder;
  put(folder / "still.jpg", StillBuilder().exif(ExifBuilder().software("QX")).bytes());
  EXPECT_THROW(MetadataDictionary::metadataFromJPEGFile(folder / "still.jpg", ""),
               std::out_of_range);
}

TEST(MetadataFromStill, TablesMayBeTheCallersOwn) {
  const InstalledFakeHost host;
  const Bytes text = testData(OXMV_SOURCE_DIR "/oxmv/import/cameras.toml");
  std::string toml(text.begin(), text.end());
  const auto at = toml.find("QX Gamma");
  ASSERT_NE(at, std::string::npos);
  toml.replace(at, 8, "QX Omega");
  const auto tables = std::get<CameraTables>(CameraTables::fromText(toml));
  const auto tags = MetadataDictionary::metadataFromJPEGFile(example, "", &tables);
  ASSERT_TRUE(tags);
  EXPECT_EQ((*tags)["CMDL"], Value("QX Omega"));
}

TEST(MetadataFromStill, WhatItAnswersIsReadyForAClip) {
  const InstalledFakeHost host;
  const auto tags = MetadataDictionary::metadataFromJPEGFile(example, "A001");
  MetadataDictionary clip;
  clip.setMetadata(tags);
  const auto stream = clip.metaDataData();
  ASSERT_TRUE(stream);
  Dictionary stored = *tags;
  stored.remove({"FOV", 4});  // streams have no such tag
  EXPECT_EQ(MetadataDictionary().initWithData(*stream).metadata(), stored);
}

// Threads.

// The fake one remembers what it is told, and so is for one thread.
class DeafHost final : public Host {
 public:
  Value copyPreference(std::string_view, std::string_view) override { return {}; }
  void setPreference(std::string_view, const Value&, std::string_view) override {}
  bool synchronizePreferences(std::string_view, std::error_code*) override { return true; }
  std::string localizedString(std::string_view, std::string_view builtIn) override {
    return std::string(builtIn);
  }
  void alert(std::string_view) override {}
  void log(std::string_view) override {}
};

TEST(MetadataFromStill, ThreadsAtOnceGetTheSame) {
  const auto before = installHost(std::make_shared<DeafHost>());
  std::vector<std::optional<Dictionary>> results(4);
  std::vector<std::thread> threads;
  for (auto& result : results) {
    threads.emplace_back([&result] {
      for (int i = 0; i < 10; ++i) result = MetadataDictionary::metadataFromJPEGFile(example, "A1");
    });
  }
  for (std::thread& thread : threads) thread.join();
  installHost(before);
  ASSERT_TRUE(results[0]);
  EXPECT_EQ((*results[0])["CMDL"], Value("QX Gamma"));
  for (const auto& result : results) EXPECT_EQ(result, results[0]);
}

}  // namespace
}  // namespace oxmv::test
