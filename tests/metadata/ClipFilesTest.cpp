#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/platform/WholeFile.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Files.h"
#include "tests/support/Memory.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

namespace fs = std::filesystem;

constexpr myGUID guid = {
    0x00112233, 0x4455, 0x6677, {0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF}};
const std::string stem = "00112233-4455-6677-8899-AABBCCDDEEFF";

const Bytes takeThree = {'T', 'A', 'K', 'E', 4, 0, 0, 'B', 3, 0, 0, 0};
const Dictionary three = {{"TAKE", 3}};

// The image of a GUID of which every byte is the same; the padding is part of it.
Bytes imageOf(std::uint8_t byte) { return Bytes(sizeof(myGUID), byte); }
myGUID guidOf(std::uint8_t byte) {
  myGUID filled;
  copyOverImage(filled, imageOf(byte));
  return filled;
}
Bytes withGuidRecord(std::uint8_t byte) {
  return StreamBuilder().record("GUID", 'G', imageOf(byte)).raw(takeThree).bytes();
}

// Each test has a database and an override folder of its own.
class ClipFiles : public testing::Test {
 protected:
  ClipFiles() {
    fs::create_directories(database());
    fs::create_directory(dir_ / "Ombrix");
    preferences()["LUTsPath"] = dir_.path().string();
    preferences()["OverridePath"] = (dir_ / "Ombrix").string();
  }

  FakeHost::Preferences& preferences() { return host->preferences[std::string(preferencesAppID)]; }
  fs::path database() const { return dir_ / "db"; }
  fs::path combined() const { return database() / (stem + ".colr"); }
  fs::path left() const { return database() / (stem + ".col1"); }
  fs::path right() const { return database() / (stem + ".col2"); }
  fs::path overrideFile() const { return dir_ / "Ombrix" / "override.colr"; }
  fs::path lastFile() const { return dir_ / "Ombrix" / "last"; }

  InstalledFakeHost host;

 private:
  TempDir dir_;
};

void expectNoTags(const MetadataDictionary& object, LoadError why) {
  EXPECT_FALSE(object.haveMetadata());
  EXPECT_EQ(object.loadError(), why);
  EXPECT_EQ(static_cast<bool>(object.loadErrorCode()),
            why == LoadError::missing || why == LoadError::unreadable);
}

// Where they are.

TEST_F(ClipFiles, AreNamedByTheGuid) {
  const auto clip = MetadataDictionary::initFromGUID(guid);
  EXPECT_EQ(clip.fileURL(), combined());
  EXPECT_EQ(clip.fileURLS(0), left());
  EXPECT_EQ(clip.fileURLS(1), right());
  EXPECT_EQ(MetadataDictionary::overridePath(), overrideFile());
}

TEST_F(ClipFiles, OfANewObjectAreThoseOfTheZeroGuid) {
  EXPECT_EQ(MetadataDictionary().fileURL().filename(), "00000000-0000-0000-0000-000000000000.colr");
}

// A clip's combined file.

TEST_F(ClipFiles, CombinedObjectHasTheTagsOfItsFile) {
  putFile(combined(), takeThree);
  putFile(right(), withGuidRecord(1));
  const auto clip = MetadataDictionary::initFromGUID(guid);
  EXPECT_EQ(clip.metadata(), three);
  EXPECT_EQ(clip.GUID(), guid);
  EXPECT_FALSE(clip.isSingle());
  EXPECT_EQ(clip.eye(), 0u);
  EXPECT_EQ(clip.loadError(), LoadError::none);
  EXPECT_EQ(MetadataDictionary::initFromGUIDForRightEye(guid, false).metadata(), three);
}

TEST_F(ClipFiles, CombinedObjectKeepsItsGuidWhateverItsFileSays) {
  putFile(combined(), withGuidRecord(7));
  const auto clip = MetadataDictionary::initFromGUID(guid);
  EXPECT_EQ(clip.GUID(), guid);
  EXPECT_EQ(clip.metadata()["TAKE"].intValue(), 3);
}

TEST_F(ClipFiles, CombinedObjectWithoutAFileIsEmpty) {
  const auto clip = MetadataDictionary::initFromGUID(guid);
  expectNoTags(clip, LoadError::missing);
  EXPECT_EQ(clip.loadErrorCode(), std::errc::no_such_file_or_directory);
  EXPECT_EQ(clip.GUID(), guid);
}

TEST_F(ClipFiles, CombinedObjectWithoutAFolderIsEmpty) {
  fs::remove(database());
  expectNoTags(MetadataDictionary::initFromGUID(guid), LoadError::missing);
  putFile(database(), takeThree);  // a file where the folder should be
  expectNoTags(MetadataDictionary::initFromGUID(guid), LoadError::missing);
}

TEST_F(ClipFiles, FileOfFewerThan12BytesGivesNoTags) {
  for (std::size_t size = 1; size < 12; ++size) {
    putFile(combined(),
            Bytes(takeThree.begin(), takeThree.begin() + static_cast<std::ptrdiff_t>(size)));
    expectNoTags(MetadataDictionary::initFromGUID(guid), LoadError::tooShort);
  }
  putFile(combined(), takeThree);
  EXPECT_EQ(MetadataDictionary::initFromGUID(guid).metadata(), three);
}

TEST_F(ClipFiles, FileOfNoBytesIsAClipWithoutTags) {
  putFile(combined(), {});
  expectNoTags(MetadataDictionary::initFromGUID(guid), LoadError::none);
}

TEST_F(ClipFiles, OverrideOfNoBytesIsOneWithoutTags) {
  putFile(overrideFile(), {});
  expectNoTags(MetadataDictionary::initFromOverride(), LoadError::none);
}

// Saving an eye without tags removes its file, so one of no bytes has lost them.
TEST_F(ClipFiles, EyeFileOfNoBytesIsTooShort) {
  putFile(left(), {});
  expectNoTags(MetadataDictionary::initFromGUIDForSingleEye(guid, 0), LoadError::tooShort);
}

TEST_F(ClipFiles, LoadErrorEndsWhenTheObjectIsGivenTags) {
  auto clip = MetadataDictionary::initFromGUID(guid);
  EXPECT_EQ(clip.loadError(), LoadError::missing);
  clip.initWithData(takeThree);
  EXPECT_EQ(clip.loadError(), LoadError::none);
  EXPECT_FALSE(clip.loadErrorCode());
  clip = MetadataDictionary::initFromGUID(guid);
  clip.init();
  EXPECT_EQ(clip.loadError(), LoadError::none);
  EXPECT_FALSE(clip.loadErrorCode());
  EXPECT_EQ(clip.GUID(), guid);
}

// What cannot be read: no tags, no wait, and a reason.

TEST_F(ClipFiles, FolderInPlaceOfTheFileIsUnreadable) {
  fs::create_directory(combined());
  const auto clip = MetadataDictionary::initFromGUID(guid);
  expectNoTags(clip, LoadError::unreadable);
  EXPECT_EQ(clip.loadErrorCode(), std::errc::is_a_directory);
}

TEST_F(ClipFiles, PipeInPlaceOfTheFileIsUnreadable) {
  ASSERT_EQ(::mkfifo(combined().c_str(), 0600), 0);
  const auto clip = MetadataDictionary::initFromGUID(guid);
  expectNoTags(clip, LoadError::unreadable);
  EXPECT_EQ(clip.loadErrorCode(), FileError::notRegular);
}

TEST_F(ClipFiles, FileOfTwoGibibytesIsUnreadable) {
  putFile(combined(), takeThree);
  fs::resize_file(combined(), std::uintmax_t{1} << 31);  // none of them on the disk
  const auto clip = MetadataDictionary::initFromGUID(guid);
  expectNoTags(clip, LoadError::unreadable);
  EXPECT_EQ(clip.loadErrorCode(), FileError::tooLarge);
}

TEST_F(ClipFiles, FileWithoutPermissionIsUnreadable) {
  putFile(combined(), takeThree);
  fs::permissions(combined(), fs::perms::none);
  fs::permissions(database().parent_path(), fs::perms::all);
  EXPECT_TRUE(asOrdinaryUser([] {
    const auto clip = MetadataDictionary::initFromGUID(guid);
    return clip.loadError() == LoadError::unreadable &&
           clip.loadErrorCode() == std::errc::permission_denied && !clip.haveMetadata();
  }));
}

// One eye's file.

TEST_F(ClipFiles, EyeObjectHasTheTagsOfItsFile) {
  putFile(left(), takeThree);
  const auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 0);
  EXPECT_EQ(clip.metadata(), three);
  EXPECT_EQ(clip.GUID(), guid);
  EXPECT_TRUE(clip.isSingle());
  EXPECT_EQ(clip.eye(), 0u);
}

TEST_F(ClipFiles, EyeObjectIsOneAlsoWithoutAFile) {
  const auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 5);
  expectNoTags(clip, LoadError::missing);
  EXPECT_TRUE(clip.isSingle());
  EXPECT_EQ(clip.eye(), 5u);
  EXPECT_EQ(clip.GUID(), guid);
}

TEST_F(ClipFiles, RightEyeIsEyeOne) {
  putFile(right(), takeThree);
  const auto byName = MetadataDictionary::initFromGUIDForRightEye(guid, true);
  const auto byIndex = MetadataDictionary::initFromGUIDForSingleEye(guid, 1);
  for (const auto& clip : {byName, byIndex}) {
    EXPECT_EQ(clip.metadata(), three);
    EXPECT_TRUE(clip.isSingle());
    EXPECT_EQ(clip.eye(), 1u);
    EXPECT_EQ(clip.GUID(), guid);
  }
}

TEST_F(ClipFiles, KeepsTheGuidThatAnEyeFileSays) {
  putFile(left(), withGuidRecord(7));
  const auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 0);
  EXPECT_EQ(clip.GUID(), guidOf(7));
  EXPECT_NE(clip.GUID(), guid);
  // It is saved under the GUID that it has now.
  EXPECT_TRUE(clip.writeToGUIDFile());
  EXPECT_EQ(getFile(left()), withGuidRecord(7));
  EXPECT_TRUE(fs::exists(clip.fileURLS(0)));
  EXPECT_EQ(namesIn(database()).size(), 2u);
}

// Saving clips.

TEST_F(ClipFiles, CombinedObjectIsSavedToItsFile) {
  auto clip = MetadataDictionary::initFromGUID(guid);
  EXPECT_TRUE(clip.addObject(3, "TAKE"));
  std::error_code error = FileError::tooLarge;
  EXPECT_TRUE(clip.writeToGUIDFile(&error));
  EXPECT_EQ(error, FileError::tooLarge);  // nothing to say
  EXPECT_EQ(getFile(combined()), takeThree);
  EXPECT_EQ(namesIn(database()), std::set<std::string>{stem + ".colr"});
}

TEST_F(ClipFiles, EyeObjectIsSavedToItsOwnFile) {
  auto clip = MetadataDictionary::initFromGUIDForRightEye(guid, true);
  clip.setMetadata(three);
  EXPECT_TRUE(clip.writeToGUIDFile());
  EXPECT_EQ(getFile(right()), takeThree);
  EXPECT_EQ(namesIn(database()), std::set<std::string>{stem + ".col2"});
}

TEST_F(ClipFiles, SavingReplacesWhatIsThere) {
  putFile(combined(), withGuidRecord(1));
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(three);
  EXPECT_TRUE(clip.writeToGUIDFile());
  EXPECT_EQ(getFile(combined()), takeThree);
}

TEST_F(ClipFiles, KeepsAnEmptyFileForACombinedObjectWithoutTags) {
  putFile(combined(), takeThree);
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.removeObject("TAKE");
  EXPECT_TRUE(clip.writeToGUIDFile());
  EXPECT_TRUE(fs::is_regular_file(combined()));
  EXPECT_EQ(fs::file_size(combined()), 0u);
}

TEST_F(ClipFiles, KeepsRemovingTheFileOfAnEyeWithoutTags) {
  putFile(left(), takeThree);
  putFile(right(), takeThree);
  auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 0);
  clip.removeObject("TAKE");
  EXPECT_TRUE(clip.writeToGUIDFile());
  EXPECT_EQ(namesIn(database()), std::set<std::string>{stem + ".col2"});
}

TEST_F(ClipFiles, RemovingTheFileOfAnEyeFailsWhenThereIsNone) {
  const auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 0);
  std::error_code error;
  EXPECT_FALSE(clip.writeToGUIDFile(&error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(clip.writeToGUIDFile());  // without anybody to tell
}

TEST_F(ClipFiles, FolderIsNeverRemovedInPlaceOfAnEyeFile) {
  fs::create_directory(left());
  std::error_code error;
  EXPECT_FALSE(MetadataDictionary::initFromGUIDForSingleEye(guid, 0).writeToGUIDFile(&error));
  EXPECT_EQ(error, std::errc::is_a_directory);
  EXPECT_TRUE(fs::is_directory(left()));
}

TEST_F(ClipFiles, EyeWhoseTagsCannotBeWrittenLosesItsFileToo) {
  putFile(left(), takeThree);
  auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 0);
  clip.setMetadata(Dictionary{{"no tag", 1}});  // encodes to nothing
  EXPECT_TRUE(clip.haveMetadata());
  EXPECT_TRUE(clip.writeToGUIDFile());
  EXPECT_FALSE(fs::exists(left()));
}

TEST_F(ClipFiles, SavingMakesNoFolder) {
  fs::remove(database());
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(three);
  std::error_code error;
  EXPECT_FALSE(clip.writeToGUIDFile(&error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(fs::exists(database()));
  EXPECT_FALSE(clip.writeToGUIDFile());
}

TEST_F(ClipFiles, SavingOverAFolderFails) {
  fs::create_directory(combined());
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(three);
  std::error_code error;
  EXPECT_FALSE(clip.writeToGUIDFile(&error));
  EXPECT_EQ(error, std::errc::is_a_directory);
  EXPECT_EQ(namesIn(database()), std::set<std::string>{stem + ".colr"});
}

TEST_F(ClipFiles, SavingWithoutPermissionFailsAndLeavesTheFile) {
  putFile(combined(), takeThree);
  fs::permissions(database().parent_path(), fs::perms::all);
  fs::permissions(database(), fs::perms::owner_read | fs::perms::owner_exec |
                                  fs::perms::others_read | fs::perms::others_exec);
  EXPECT_TRUE(asOrdinaryUser([] {
    auto clip = MetadataDictionary::initFromGUID(guid);
    clip.removeObject("TAKE");
    std::error_code error;
    return !clip.writeToGUIDFile(&error) && error == std::errc::permission_denied;
  }));
  fs::permissions(database(), fs::perms::owner_all);
  EXPECT_EQ(getFile(combined()), takeThree);
}

TEST_F(ClipFiles, WithoutMemoryNothingIsWrittenAndNothingSaid) {
  putFile(combined(), takeThree);
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  std::error_code error = FileError::tooLarge;
  bool isWritten = true;
  {
    const MemoryShortage shortage(0);
    isWritten = clip.writeToGUIDFile(&error);
  }
  EXPECT_FALSE(isWritten);
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_EQ(getFile(combined()), takeThree);
}

// Loads with memory for no allocation, for one and so on, until it is enough. What could not be
// loaded says so; answers how often the GUID was there all the same.
std::size_t guidsWithoutMemory(MetadataDictionary (*load)(), const myGUID& wanted) {
  std::size_t guids = 0;
  for (std::size_t granted = 0; granted < 1000; ++granted) {
    std::optional<MetadataDictionary> object;
    bool wasFelt = false;
    {
      const MemoryShortage shortage(granted);
      object = load();
      wasFelt = shortage.wasFelt();
    }
    if (!wasFelt) {
      EXPECT_EQ(object->metadata(), three);
      EXPECT_EQ(object->loadError(), LoadError::none);
      return guids;
    }
    expectNoTags(*object, LoadError::unreadable);
    EXPECT_EQ(object->loadErrorCode(), std::errc::not_enough_memory);
    if (object->GUID() == wanted) ++guids;
  }
  ADD_FAILURE() << "never enough";
  return 0;
}

TEST_F(ClipFiles, WithoutMemoryNoTagsAreLoaded) {
  putFile(combined(), takeThree);
  putFile(left(), takeThree);
  putFile(overrideFile(), takeThree);
  EXPECT_GT(guidsWithoutMemory([] { return MetadataDictionary::initFromGUID(guid); }, guid), 5u);
  EXPECT_GT(guidsWithoutMemory([] { return MetadataDictionary::initFromGUIDForSingleEye(guid, 0); },
                               guid),
            5u);
  EXPECT_GT(guidsWithoutMemory([] { return MetadataDictionary::initFromOverride(); }, {}), 5u);
}

TEST_F(ClipFiles, WithoutMemoryForItsStreamTheLastFileGivesItsGuid) {
  Bytes content = imageOf(9);
  content.insert(content.end(), takeThree.begin(), takeThree.end());
  putFile(lastFile(), content);
  EXPECT_GT(guidsWithoutMemory([] { return MetadataDictionary::initFromLast(); }, guidOf(9)), 0u);
}

// The override file.

TEST_F(ClipFiles, OverrideObjectHasTheTagsOfTheOverrideFile) {
  putFile(overrideFile(), takeThree);
  const auto object = MetadataDictionary::initFromOverride();
  EXPECT_EQ(object.metadata(), three);
  EXPECT_EQ(object.GUID(), myGUID());
  EXPECT_FALSE(object.isSingle());
}

TEST_F(ClipFiles, OverrideObjectTakesTheGuidOfItsFile) {
  putFile(overrideFile(), withGuidRecord(7));
  const auto object = MetadataDictionary::initFromOverride();
  EXPECT_EQ(object.GUID(), guidOf(7));
  EXPECT_TRUE(object.writeToGUIDFile());
  EXPECT_EQ(namesIn(database()).size(), 1u);
  EXPECT_TRUE(fs::exists(MetadataDictionary::initFromGUID(guidOf(7)).fileURL()));
}

TEST_F(ClipFiles, OverrideObjectWithoutAFileIsEmpty) {
  expectNoTags(MetadataDictionary::initFromOverride(), LoadError::missing);
  putFile(overrideFile(), Bytes(11, 'x'));
  expectNoTags(MetadataDictionary::initFromOverride(), LoadError::tooShort);
}

TEST_F(ClipFiles, OverrideIsSavedToItsFile) {
  auto clip = MetadataDictionary::initFromGUIDForSingleEye(guid, 1);
  clip.setMetadata(three);
  std::error_code error = FileError::tooLarge;
  EXPECT_TRUE(clip.writeToOverride(&error));
  EXPECT_EQ(error, FileError::tooLarge);
  EXPECT_EQ(getFile(overrideFile()), takeThree);
  EXPECT_TRUE(namesIn(database()).empty());
}

TEST_F(ClipFiles, KeepsAnEmptyOverrideFile) {
  putFile(overrideFile(), takeThree);
  EXPECT_TRUE(MetadataDictionary::initFromGUIDForSingleEye(guid, 1).writeToOverride());
  EXPECT_TRUE(fs::is_regular_file(overrideFile()));
  EXPECT_EQ(fs::file_size(overrideFile()), 0u);
}

// Of every allocation. The path is made before the tags are encoded, and want of memory for those
// is not told.
TEST_F(ClipFiles, OverrideWithoutMemoryStaysAndNothingIsSaid) {
  putFile(overrideFile(), takeThree);
  MetadataDictionary clip;
  clip.setMetadata(Dictionary{{"REEL", "A001"}});
  std::size_t refusals = 0;
  for (std::size_t granted = 0;; ++granted) {
    ASSERT_LT(granted, 1000u);
    host->questions.clear();
    std::error_code error = FileError::tooLarge;
    bool isWritten = false;
    bool isThrown = false;
    {
      const MemoryShortage shortage(granted);
      try {
        isWritten = clip.writeToOverride(&error);
      } catch (const std::bad_alloc&) {
        isThrown = true;
      }
    }
    EXPECT_EQ(error, FileError::tooLarge);
    if (isWritten) break;
    EXPECT_EQ(getFile(overrideFile()), takeThree);
    if (isThrown) continue;
    ++refusals;
    EXPECT_EQ(host->questions, std::vector<std::string>{"get OverridePath"});
  }
  EXPECT_GT(refusals, 0u);
  EXPECT_NE(getFile(overrideFile()), takeThree);
}

TEST_F(ClipFiles, OverrideWithoutAFolderFails) {
  fs::remove(overrideFile().parent_path());
  std::error_code error;
  EXPECT_FALSE(MetadataDictionary().writeToOverride(&error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_FALSE(MetadataDictionary().writeToOverride());
}

TEST_F(ClipFiles, OverrideFolderIsStoredWhereThereIsNone) {
  const auto isStored = [&] {
    const bool stored =
        preferences()["OverridePath"] == Value("/Library/Application Support/Ombrix");
    preferences().erase("OverridePath");
    return stored;
  };
  preferences().erase("OverridePath");
  EXPECT_EQ(MetadataDictionary::overridePath(),
            "/Library/Application Support/Ombrix/override.colr");
  EXPECT_TRUE(isStored());
  MetadataDictionary::initFromOverride();
  EXPECT_TRUE(isStored());
  MetadataDictionary::initFromLast();
  EXPECT_TRUE(isStored());
  MetadataDictionary::lastGUID();
  EXPECT_TRUE(isStored());
  EXPECT_FALSE(MetadataDictionary::initFromGUID(guid).haveMetadata());
  EXPECT_FALSE(isStored());
}

TEST_F(ClipFiles, SavingTheOverrideStoresItsFolderWhereThereIsNone) {
  if (fs::exists("/Library")) GTEST_SKIP() << "the default folder is this machine's own";
  preferences().erase("OverridePath");
  std::error_code error;
  EXPECT_FALSE(MetadataDictionary().writeToOverride(&error));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(preferences()["OverridePath"], Value("/Library/Application Support/Ombrix"));
}

// The "last" file.

TEST_F(ClipFiles, LastObjectHasGuidAndTagsOfTheLastFile) {
  Bytes content = imageOf(9);
  content.insert(content.end(), takeThree.begin(), takeThree.end());
  putFile(lastFile(), content);
  const auto object = MetadataDictionary::initFromLast();
  EXPECT_EQ(object.GUID(), guidOf(9));
  EXPECT_EQ(object.metadata(), three);
  EXPECT_FALSE(object.isSingle());
  EXPECT_EQ(object.loadError(), LoadError::none);
  EXPECT_EQ(MetadataDictionary::lastGUID(), guidOf(9));
}

TEST_F(ClipFiles, KeepsTheGuidThatTheStreamOfTheLastFileSays) {
  Bytes content = imageOf(9);
  const Bytes stream = withGuidRecord(7);
  content.insert(content.end(), stream.begin(), stream.end());
  putFile(lastFile(), content);
  EXPECT_EQ(MetadataDictionary::initFromLast().GUID(), guidOf(7));
  EXPECT_EQ(MetadataDictionary::lastGUID(), guidOf(9));
}

TEST_F(ClipFiles, LastFileOfTheGuidAloneGivesNoTags) {
  putFile(lastFile(), imageOf(9));
  const auto object = MetadataDictionary::initFromLast();
  EXPECT_EQ(object.GUID(), guidOf(9));
  expectNoTags(object, LoadError::none);
}

TEST_F(ClipFiles, KeepsReadingShortStreamsInTheLastFile) {
  // Eleven bytes: the file of a clip would not be looked at. The first record may be cut off.
  Bytes content = imageOf(9);
  content.insert(content.end(), takeThree.begin(), takeThree.end() - 1);
  putFile(lastFile(), content);
  EXPECT_EQ(MetadataDictionary::initFromLast().metadata(), three);
}

TEST_F(ClipFiles, LastFileTooShortForItsGuidGivesNoTags) {
  Bytes content = imageOf(9);
  content.pop_back();
  putFile(lastFile(), content);
  const auto object = MetadataDictionary::initFromLast();
  // The last byte is padding in a build of 64 bits, and counts all the same.
  expectNoTags(object, LoadError::tooShort);
  EXPECT_EQ(object.GUID().Data1, guidOf(9).Data1);

  putFile(lastFile(), {1, 2, 3});
  EXPECT_EQ(MetadataDictionary::initFromLast().GUID(), (myGUID{0x030201, 0, 0, {}}));
}

TEST_F(ClipFiles, LastObjectWithoutAFileIsEmpty) {
  const auto object = MetadataDictionary::initFromLast();
  expectNoTags(object, LoadError::missing);
  EXPECT_EQ(object.GUID(), myGUID());
  EXPECT_EQ(MetadataDictionary::lastGUID(), myGUID());
}

TEST_F(ClipFiles, LastFileTooLargeForMemoryKeepsItsGuid) {
  putFile(lastFile(), imageOf(9));
  fs::resize_file(lastFile(), std::uintmax_t{1} << 31);
  const auto object = MetadataDictionary::initFromLast();
  expectNoTags(object, LoadError::unreadable);
  EXPECT_EQ(object.GUID(), guidOf(9));
}

}  // namespace
}  // namespace oxmv::test
