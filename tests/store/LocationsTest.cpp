#include <limits>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/store/Locations.h"
#include "oxmv/values/Array.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Printing.h"
#include "tests/support/WideLong.h"

namespace oxmv::test {
namespace {

constexpr std::string_view appID = "an.application";
constexpr std::string_view defaultFolder = "/Library/Application Support/Ombrix";

constexpr myGUID guid = {
    0x00112233, 0x4455, 0x6677, {0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xF}};

class Locations : public testing::Test {
 protected:
  FakeHost::Preferences& preferences() { return host->preferences[std::string(appID)]; }

  InstalledFakeHost host;
};

// The clip database.

TEST_F(Locations, ClipIsInTheDatabaseWithinTheLooks) {
  EXPECT_EQ(clipFilePath(guid, appID),
            "/Library/Application Support/Ombrix/LUTs/db/"
            "00112233-4455-6677-8899-AABBCCDDEE0F.colr");
  EXPECT_TRUE(preferences().empty());
  EXPECT_TRUE(host->synchronisations.empty());
}

TEST_F(Locations, DatabaseIsTheFolderOfItsClips) {
  EXPECT_EQ(databaseFolderPath(appID), "/Library/Application Support/Ombrix/LUTs/db");
  preferences()["LUTsPath"] = "/looks";
  preferences()["CurrentDBPath"] = "/clips";
  EXPECT_EQ(databaseFolderPath(appID), "/looks//clips");
  EXPECT_TRUE(clipFilePath(guid, appID).starts_with("/looks//clips/"));
  EXPECT_EQ(preferences().size(), 2u);
  EXPECT_TRUE(host->synchronisations.empty());
}

TEST_F(Locations, EyesAreBesideTheirClip) {
  const std::string stem =
      "/Library/Application Support/Ombrix/LUTs/db/00112233-4455-6677-8899-AABBCCDDEE0F.";
  EXPECT_EQ(eyeFilePath(guid, 0, appID), stem + "col1");
  EXPECT_EQ(eyeFilePath(guid, 1, appID), stem + "col2");
  EXPECT_EQ(eyeFilePath(guid, 9, appID), stem + "col10");
  EXPECT_TRUE(preferences().empty());
}

TEST_F(Locations, EyesAreCountedByALowSignedNumber) {
  const auto extension = [](std::size_t eye) {
    const std::string path = eyeFilePath(guid, eye, appID);
    return path.substr(path.rfind('.'));
  };
  EXPECT_EQ(extension(0x7FFFFFFE), ".col2147483647");
  EXPECT_EQ(extension(0x7FFFFFFF), ".col-2147483648");
  EXPECT_EQ(extension(std::numeric_limits<std::size_t>::max()), ".col0");
}

TEST_F(Locations, ZeroGuidIsAName) {
  EXPECT_EQ(
      clipFilePath({}, appID),
      "/Library/Application Support/Ombrix/LUTs/db/00000000-0000-0000-0000-000000000000.colr");
}

TEST_F(Locations, FirstFieldIsNamedByItsLow32Bits) {
  if (!is64Bit) GTEST_SKIP();
  myGUID wider = guid;
  wider.Data1 = wide(0xFFFFFFFF00112233u);
  EXPECT_EQ(clipFilePath(wider, appID), clipFilePath(guid, appID));
}

TEST_F(Locations, PreferencesPlaceTheDatabase) {
  preferences()["LUTsPath"] = "/looks";
  preferences()["CurrentDBPath"] = "clips/today";
  EXPECT_EQ(clipFilePath({}, appID),
            "/looks/clips/today/00000000-0000-0000-0000-000000000000.colr");
  EXPECT_EQ(eyeFilePath({}, 1, appID),
            "/looks/clips/today/00000000-0000-0000-0000-000000000000.col2");
}

TEST_F(Locations, PreferencesOfOtherApplicationsDoNotCount) {
  host->preferences["another.application"]["LUTsPath"] = "/looks";
  EXPECT_TRUE(clipFilePath({}, appID).starts_with(defaultFolder));
}

TEST_F(Locations, AreMadeAfreshOnEachCall) {
  preferences()["LUTsPath"] = "/one";
  EXPECT_TRUE(clipFilePath({}, appID).starts_with("/one/db/"));
  preferences()["LUTsPath"] = "/other";
  EXPECT_TRUE(clipFilePath({}, appID).starts_with("/other/db/"));
}

TEST_F(Locations, EmptyPreferencesAreUsedAsTheyAre) {
  preferences()["LUTsPath"] = "";
  EXPECT_EQ(clipFilePath({}, appID), "/db/00000000-0000-0000-0000-000000000000.colr");
  preferences()["LUTsPath"] = "/looks";
  preferences()["CurrentDBPath"] = "";
  EXPECT_EQ(clipFilePath({}, appID), "/looks//00000000-0000-0000-0000-000000000000.colr");
}

TEST_F(Locations, KeepsTheDatabaseWithinTheLooksAlsoWhenItBeginsWithASlash) {
  preferences()["LUTsPath"] = "/looks/ ";
  preferences()["CurrentDBPath"] = "/db/";
  EXPECT_EQ(clipFilePath({}, appID), "/looks/ //db//00000000-0000-0000-0000-000000000000.colr");
}

TEST_F(Locations, PreferencesThatAreNoTextGiveTheDefaultsAndStay) {
  const FakeHost::Preferences wrong = {{"LUTsPath", 7}, {"CurrentDBPath", Array::of("db2")}};
  preferences() = wrong;
  EXPECT_EQ(
      clipFilePath({}, appID),
      "/Library/Application Support/Ombrix/LUTs/db/00000000-0000-0000-0000-000000000000.colr");
  EXPECT_EQ(preferences(), wrong);
  EXPECT_TRUE(host->synchronisations.empty());
}

TEST_F(Locations, LocalisedStringPlacesTheLooksWhereNoPreferenceDoes) {
  host->strings["OXMVLutsPath"] = "/opt/Farbtabellen";
  EXPECT_TRUE(clipFilePath({}, appID).starts_with("/opt/Farbtabellen/db/"));
  preferences()["LUTsPath"] = "/looks";
  EXPECT_TRUE(clipFilePath({}, appID).starts_with("/looks/db/"));
}

TEST_F(Locations, LocalisedTemplatesNameTheFiles) {
  host->strings["OXMVGUIDPathTemplate"] = "%1$@/clips/%3$08x.clip";
  host->strings["OXMVGUIDPathTemplateR"] = "%@+%@+%X+%X+%X+%X+%X+%X+%X+%X+%X+%X+%X+%d";
  preferences()["LUTsPath"] = "/looks";
  EXPECT_EQ(clipFilePath(guid, appID), "/looks/clips/00112233.clip");
  EXPECT_EQ(eyeFilePath(guid, 1, appID), "/looks+db+112233+4455+6677+88+99+AA+BB+CC+DD+EE+F+2");
}

TEST_F(Locations, TemplateThatAsksForTooMuchIsHarmless) {
  host->strings["OXMVGUIDPathTemplate"] = "/%n%s%@%14$d";
  preferences()["LUTsPath"] = "looks";
  EXPECT_EQ(clipFilePath(guid, appID), "/%n%slooks%14$d");
}

TEST_F(Locations, OfClipsAskForTheTemplateThenTheLooksThenTheDatabase) {
  clipFilePath(guid, appID);
  EXPECT_EQ(host->questions,
            (std::vector<std::string>{"string OXMVGUIDPathTemplate", "get LUTsPath",
                                      "string OXMVLutsPath", "get CurrentDBPath"}));
  host->questions.clear();
  preferences()["LUTsPath"] = "/looks";
  eyeFilePath(guid, 0, appID);
  EXPECT_EQ(host->questions, (std::vector<std::string>{"string OXMVGUIDPathTemplateR",
                                                       "get LUTsPath", "get CurrentDBPath"}));
}

// The override folder.

TEST_F(Locations, KeepsStoringTheDefaultOfTheOverrideFolder) {
  EXPECT_EQ(overrideFilePath(appID), "/Library/Application Support/Ombrix/override.colr");
  EXPECT_EQ(preferences(), (FakeHost::Preferences{{"OverridePath", defaultFolder}}));
  EXPECT_EQ(host->synchronisations, std::vector<std::string>{std::string(appID)});
}

TEST_F(Locations, DefaultOfTheOverrideFolderIsSetBeforeItIsSynchronised) {
  const std::vector<std::string> stored = {"get OverridePath", "set OverridePath", "synchronise"};
  overrideFilePath(appID);
  EXPECT_EQ(host->questions, stored);
  host->questions.clear();
  overrideFilePath(appID);
  EXPECT_EQ(host->questions, std::vector<std::string>{"get OverridePath"});
}

TEST_F(Locations, LastFileStoresTheDefaultToo) {
  EXPECT_EQ(lastFilePath(appID), "/Library/Application Support/Ombrix/last");
  EXPECT_EQ(preferences(), (FakeHost::Preferences{{"OverridePath", defaultFolder}}));
  EXPECT_EQ(host->synchronisations.size(), 1u);
}

TEST_F(Locations, OverrideFolderThatIsNoTextIsReplaced) {
  for (const Value& wrong : {Value(7), Value(1.5), Value(Array::of("/x")), Value(Dictionary())}) {
    preferences()["OverridePath"] = wrong;
    EXPECT_EQ(overrideFilePath(appID), "/Library/Application Support/Ombrix/override.colr");
    EXPECT_EQ(preferences()["OverridePath"], Value(defaultFolder));
  }
}

TEST_F(Locations, PreferencePlacesTheOverrideFolder) {
  preferences()["OverridePath"] = "/mine";
  EXPECT_EQ(overrideFilePath(appID), "/mine/override.colr");
  EXPECT_EQ(lastFilePath(appID), "/mine/last");
  EXPECT_TRUE(host->synchronisations.empty());
}

TEST_F(Locations, EmptyOverrideFolderIsUsedAsItIs) {
  preferences()["OverridePath"] = "";
  EXPECT_EQ(overrideFilePath(appID), "/override.colr");
  EXPECT_EQ(preferences()["OverridePath"], Value(""));
}

// What decides.

TEST_F(Locations, SettingsSayWhereTheyComeFrom) {
  const auto sourceOf = [&](const SettingRow& row) { return lookUp(row, *host, appID).source; };
  EXPECT_EQ(sourceOf(lutsFolderSetting), SettingSource::builtIn);
  host->strings["OXMVLutsPath"] = "/opt/looks";
  EXPECT_EQ(sourceOf(lutsFolderSetting), SettingSource::localizedString);
  preferences()["LUTsPath"] = "/looks";
  EXPECT_EQ(sourceOf(lutsFolderSetting), SettingSource::preference);
  EXPECT_EQ(sourceOf(clipTemplateSetting), SettingSource::builtIn);
}

TEST_F(Locations, LookingUpStoresNothing) {
  EXPECT_EQ(lookUp(overrideFolderSetting, *host, appID).value, defaultFolder);
  EXPECT_TRUE(preferences().empty());
  EXPECT_TRUE(host->synchronisations.empty());
}

}  // namespace
}  // namespace oxmv::test
