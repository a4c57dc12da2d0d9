#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/store/ClipFileName.h"
#include "oxmv/store/Locations.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Printing.h"

namespace oxmv::test {
namespace {

constexpr myGUID guid = {
    0x0A1B2C3D, 0x4E5F, 0x0607, {0x08, 0x09, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0x0F}};
const std::string stem = "0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F";

TEST(ClipFileName, NamesTheCombinedFile) {
  EXPECT_EQ(ClipFileName::from(stem + ".colr"), (ClipFileName{guid, std::nullopt}));
  EXPECT_EQ((ClipFileName{guid, std::nullopt}.text()), stem + ".colr");
}

TEST(ClipFileName, NamesTheFilesOfEyes) {
  EXPECT_EQ(ClipFileName::from(stem + ".col1"), (ClipFileName{guid, 0}));
  EXPECT_EQ(ClipFileName::from(stem + ".col2"), (ClipFileName{guid, 1}));
  EXPECT_EQ(ClipFileName::from(stem + ".col10"), (ClipFileName{guid, 9}));
  EXPECT_EQ(ClipFileName::from(stem + ".col2147483647"),
            (ClipFileName{guid, ClipFileName::lastEye}));
  EXPECT_EQ((ClipFileName{guid, 9}.text()), stem + ".col10");
}

TEST(ClipFileName, DiffersByGuidAndByEye) {
  myGUID other = guid;
  other.Data4[7] = 0;
  EXPECT_NE((ClipFileName{guid, 1}), (ClipFileName{other, 1}));
  EXPECT_NE((ClipFileName{guid, 1}), (ClipFileName{guid, 2}));
  EXPECT_NE((ClipFileName{guid, 0}), (ClipFileName{guid, std::nullopt}));
}

TEST(ClipFileName, IsTheNameThatTheLibraryGives) {
  const InstalledFakeHost host;
  const auto nameIn = [](const std::string& path) {
    return std::filesystem::path(path).filename().string();
  };
  EXPECT_EQ((ClipFileName{guid, std::nullopt}.text()), nameIn(clipFilePath(guid, "an.app")));
  for (const std::size_t eye : {std::size_t{0}, std::size_t{1}, ClipFileName::lastEye})
    EXPECT_EQ((ClipFileName{guid, eye}.text()), nameIn(eyeFilePath(guid, eye, "an.app")));
}

TEST(ClipFileName, IsNoOtherName) {
  const std::vector<std::string> names = {"",
                                          stem,
                                          stem + ".col",
                                          stem + ".col0",
                                          stem + ".col01",
                                          stem + ".col+1",
                                          stem + ".col-1",
                                          stem + ".col2147483648",
                                          stem + ".col99999999999999999999999",
                                          stem + ".col1 ",
                                          stem + ".COLR",
                                          stem + ".colr~",
                                          stem + ".colr.colr",
                                          stem + "colr",
                                          stem + ".colx",
                                          "0a1b2c3d-4e5f-0607-0809-aabbccddee0f.colr",
                                          " " + stem + ".colr",
                                          stem.substr(1) + ".colr",
                                          "override.colr",
                                          "." + stem + ".colr"};
  for (const std::string& name : names) EXPECT_EQ(ClipFileName::from(name), std::nullopt) << name;
}

}  // namespace
}  // namespace oxmv::test
