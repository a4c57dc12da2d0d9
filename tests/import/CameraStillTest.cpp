#include <cmath>
#include <fstream>
#include <limits>
#include <stdexcept>
#include <string>
#include <variant>

#include <gtest/gtest.h>

#include "oxmv/import/CameraStill.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/values/Array.h"
#include "tests/support/Decoding.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Printing.h"
#include "tests/support/SmallStack.h"
#include "tests/support/StillBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

using Exif = ExifBuilder;

constexpr CalendarTime leapDay = {2024, 2, 29, 14, 3, 9};

class CameraStill : public testing::Test {
 protected:
  std::optional<Dictionary> tagsOf(const Bytes& file, std::string_view reel = {}) {
    return tagsOfStill(file, leapDay, reel, CameraTables::builtIn());
  }
  // Without the time and its base, which are in all of them.
  Dictionary cameraTagsOf(const Bytes& file) {
    Dictionary tags = tagsOf(file).value();
    for (const char* tag : {"STIM", "SDAT", "TIMC", "TIMB"}) EXPECT_TRUE(tags.remove(tag)) << tag;
    return tags;
  }
  Dictionary cameraTagsOf(const StillBuilder& still) { return cameraTagsOf(still.bytes()); }

  // Stills of the maker, and of another.
  static StillBuilder makers() { return StillBuilder().maker("KiVex").modelText("KV-QX301"); }
  static StillBuilder anothers() { return StillBuilder().maker("Another").modelText("KV-QX301"); }

  static Value fieldOfView(int letter) { return Array::of(letter); }

  InstalledFakeHost host_;
};

TEST_F(CameraStill, OfTheMakerTellsAllItsTags) {
  const auto tags = tagsOf(exampleStill(), "A001");
  ASSERT_TRUE(tags);
  EXPECT_EQ(*tags, (Dictionary{{"STIM", "14:03:09"},
                               {"SDAT", "2024-02-29"},
                               {"TIMC", "14:03:09:00"},
                               {"TIMB", 30},
                               {"REEL", "A001"},
                               {"CMDL", "QX Gamma"},
                               {fieldOfViewKey, Array::of(87)},
                               {"FIRM", "QX3.01.02.00"}}));
  EXPECT_EQ(keys(*tags), (Names{"STIM", "SDAT", "TIMC", "TIMB", "REEL", "CMDL",
                                std::string("FOV\0", 4), "FIRM"}));
}

TEST_F(CameraStill, ThatIsNoJpegImageHasNoTags) {
  EXPECT_EQ(tagsOf({}), std::nullopt);
  EXPECT_EQ(tagsOf(bytesOf("not a picture")), std::nullopt);
  EXPECT_EQ(tagsOf(pictureThatClaims(65535, 65535)), std::nullopt);
  EXPECT_TRUE(host_->logLines.empty());
}

TEST_F(CameraStill, WithoutACreationDateHasNoTimes) {
  EXPECT_EQ(tagsOfStill(picture(), std::nullopt, "A001", CameraTables::builtIn()),
            (Dictionary{{"TIMB", 30}, {"REEL", "A001"}}));
}

TEST_F(CameraStill, TimesHaveTheirDigits) {
  const auto dateIn = [](std::int64_t year) {
    const CalendarTime time = {year, 1, 2, 3, 4, 5};
    const auto tags = tagsOfStill(picture(), time, "", CameraTables::builtIn()).value();
    EXPECT_EQ(tags["STIM"], Value("03:04:05"));
    EXPECT_EQ(tags["TIMC"], Value("03:04:05:00"));
    return tags["SDAT"].text();
  };
  EXPECT_EQ(dateIn(1970), "1970-01-02");
  EXPECT_EQ(dateIn(9999), "9999-01-02");
  EXPECT_EQ(dateIn(10000), "10000-01-02");
  EXPECT_EQ(dateIn(7), "0007-01-02");
  EXPECT_EQ(dateIn(0), "0000-01-02");
  EXPECT_EQ(dateIn(-1), "-0001-01-02");
}

TEST_F(CameraStill, AnEmptyReelNameGivesNoTag) {
  EXPECT_FALSE(tagsOf(picture(), "")->contains("REEL"));
  EXPECT_EQ((*tagsOf(picture(), "A"))["REEL"], Value("A"));
  EXPECT_EQ((*tagsOf(picture(), " "))["REEL"], Value(" "));
}

// The maker, by the texts at their places.

TEST_F(CameraStill, OfTheMakerAloneHasItsNameAsModel) {
  EXPECT_EQ(cameraTagsOf(makers()), (Dictionary{{"CMDL", "KiVex"}}));
  EXPECT_EQ(cameraTagsOf(StillBuilder().maker("Kivex")), (Dictionary{{"CMDL", "KiVex"}}));
}

TEST_F(CameraStill, OfAnotherMakerHasNoModel) {
  for (const char* maker : {"", "KIVEX", "kivex", "KiVex ", " KiVex", "KiVe", "KiVexx"}) {
    EXPECT_EQ(cameraTagsOf(StillBuilder().maker(maker).modelText("QX2")), Dictionary()) << maker;
  }
}

TEST_F(CameraStill, ModelTextThatIsTheSecondPrefixNamesItsModel) {
  const auto modelOf = [&](std::string_view text) {
    return cameraTagsOf(StillBuilder().maker("KiVex").modelText(text))["CMDL"].text();
  };
  EXPECT_EQ(modelOf("QX2"), "QX Beta");
  EXPECT_EQ(modelOf("QX1"), "KiVex");
  EXPECT_EQ(modelOf("qx2"), "KiVex");
  EXPECT_EQ(modelOf("QX2 "), "KiVex");
  EXPECT_EQ(modelOf("QX"), "KiVex");
  EXPECT_EQ(modelOf(""), "KiVex");
  EXPECT_EQ(cameraTagsOf(StillBuilder().maker("Another").modelText("QX2")), Dictionary());
}

TEST_F(CameraStill, TextsThatAreNotUtf8AreOfAnotherMaker) {
  EXPECT_EQ(cameraTagsOf(StillBuilder().maker("KiVex\xFF").modelText("QX2")), Dictionary());
  EXPECT_EQ(cameraTagsOf(StillBuilder().maker("KiVex").modelText("QX2\xFF")), Dictionary());
  EXPECT_EQ(cameraTagsOf(StillBuilder().maker("KiVex").modelText("QX2 \xC3\xA9")),
            (Dictionary{{"CMDL", "KiVex"}}));
}

TEST_F(CameraStill, EndingBeforeItsTextsDoIsOfAnotherMaker) {
  // The headers first, so that the rest may end anywhere.
  Bytes file = picture();
  file.resize(1062 + 4, 'x');
  const auto put = [&](std::size_t offset, std::string_view text) {
    std::copy(text.begin(), text.end(), file.begin() + static_cast<std::ptrdiff_t>(offset));
  };
  put(1038, {"KiVex", 6});
  put(1062, {"QX2", 4});
  EXPECT_EQ(cameraTagsOf(file), (Dictionary{{"CMDL", "QX Beta"}}));
  while (file.size() > 1030) {
    file.pop_back();
    EXPECT_EQ(cameraTagsOf(file), Dictionary()) << file.size();
  }
}

// EXIF.

TEST_F(CameraStill, ItsPropertiesAreFoundBehindOtherSegments) {
  const Bytes file = StillBuilder()
                         .segment(0xE0, bytesOf("JFIF"))
                         .segment(0xE1, bytesOf("http://example.org/"))
                         .exif(Exif().software("QX1.02"))
                         .exif(Exif().software("QX2.02"))
                         .bytes();
  EXPECT_EQ(cameraTagsOf(file), (Dictionary{{"CMDL", "QX Alpha"}, {"FIRM", "QX1.02"}}));
}

TEST_F(CameraStill, ItsPropertiesAreReadInBothByteOrders) {
  for (const ByteOrder order : {ByteOrder::little, ByteOrder::big}) {
    EXPECT_EQ(cameraTagsOf(makers().exif(Exif(order).model("KV-QX602").focalLength(24))),
              (Dictionary{{"CMDL", "QX Zeta Plus"},
                          {fieldOfViewKey, fieldOfView(77)},
                          {"FIRM", "QX6.02.00.00"}}));
  }
}

// The field of view.

TEST(FieldOfView, HasItsAngles) {
  EXPECT_NEAR(fieldOfViewDegrees(15), 110.5, 0.1);
  EXPECT_NEAR(fieldOfViewDegrees(24), 84.1, 0.1);
  EXPECT_NEAR(fieldOfViewDegrees(35), 63.4, 0.1);
}

TEST(FieldOfView, KeepsItsOwnPi) {
  EXPECT_EQ(fieldOfViewDegrees(21.635), 2 * std::atan(1.0) * 180 / 3.14159);
  EXPECT_GT(fieldOfViewDegrees(21.635), 90.00007);
}

TEST(FieldOfView, AnAngleOnTheBorderIsOfTheNarrowerClass) {
  EXPECT_EQ(fieldOfViewOf(180), FieldOfView::wide);
  EXPECT_EQ(fieldOfViewOf(std::nextafter(100.0, 180.0)), FieldOfView::wide);
  EXPECT_EQ(fieldOfViewOf(100), FieldOfView::medium);
  EXPECT_EQ(fieldOfViewOf(std::nextafter(70.0, 180.0)), FieldOfView::medium);
  EXPECT_EQ(fieldOfViewOf(70), FieldOfView::narrow);
  EXPECT_EQ(fieldOfViewOf(std::numeric_limits<double>::min()), FieldOfView::narrow);
  EXPECT_EQ(fieldOfViewOf(0), std::nullopt);
  EXPECT_EQ(fieldOfViewOf(-1), std::nullopt);
  EXPECT_EQ(fieldOfViewOf(std::numeric_limits<double>::quiet_NaN()), std::nullopt);
}

TEST(FieldOfView, ChangesItsClassAtTwoFocalLengths) {
  EXPECT_EQ(fieldOfViewOf(fieldOfViewDegrees(18.15)), FieldOfView::wide);
  EXPECT_EQ(fieldOfViewOf(fieldOfViewDegrees(18.16)), FieldOfView::medium);
  EXPECT_EQ(fieldOfViewOf(fieldOfViewDegrees(30.89)), FieldOfView::medium);
  EXPECT_EQ(fieldOfViewOf(fieldOfViewDegrees(30.90)), FieldOfView::narrow);
}

TEST_F(CameraStill, FocalLengthGivesTheFieldOfView) {
  const auto of = [&](int millimetres) {
    return cameraTagsOf(
        anothers().exif(Exif().focalLength(static_cast<std::uint16_t>(millimetres))));
  };
  for (const int wide : {1, 15, 18})
    EXPECT_EQ(of(wide), (Dictionary{{fieldOfViewKey, fieldOfView(87)}})) << wide;
  for (const int medium : {19, 24, 30})
    EXPECT_EQ(of(medium), (Dictionary{{fieldOfViewKey, fieldOfView(77)}})) << medium;
  for (const int narrow : {31, 35, 65535})
    EXPECT_EQ(of(narrow), (Dictionary{{fieldOfViewKey, fieldOfView(78)}})) << narrow;
}

// As a fraction of hundredths of a millimetre.
TEST_F(CameraStill, FractionsOfAMillimetreDecideTheFieldOfView) {
  for (const ByteOrder order : {ByteOrder::little, ByteOrder::big}) {
    const auto of = [&](std::uint32_t hundredths) {
      Exif exif(order);
      exif.exifEntry(Exif::focalLengthTag, Exif::rationalType, 1, exif.words({hundredths, 100}, 4));
      return cameraTagsOf(anothers().exif(exif));
    };
    EXPECT_EQ(of(1815), (Dictionary{{fieldOfViewKey, fieldOfView(87)}}));
    EXPECT_EQ(of(1816), (Dictionary{{fieldOfViewKey, fieldOfView(77)}}));
    EXPECT_EQ(of(3089), (Dictionary{{fieldOfViewKey, fieldOfView(77)}}));
    EXPECT_EQ(of(3090), (Dictionary{{fieldOfViewKey, fieldOfView(78)}}));
  }
}

TEST_F(CameraStill, NoFieldOfViewComesOfAFocalLengthOfNoUse) {
  const auto of = [&](std::uint16_t type, const std::vector<std::uint32_t>& words) {
    Exif exif;
    exif.exifEntry(Exif::focalLengthTag, type, 1, exif.words(words, 4));
    return cameraTagsOf(anothers().exif(exif));
  };
  EXPECT_EQ(of(Exif::longType, {15}), (Dictionary{{fieldOfViewKey, fieldOfView(87)}}));
  EXPECT_EQ(of(Exif::longType, {0}), Dictionary());
  EXPECT_EQ(of(Exif::signedLongType, {0xFFFFFFFF}), Dictionary());
  EXPECT_EQ(of(Exif::floatType, {0x7FC00000}), Dictionary());  // not a number
  EXPECT_EQ(of(Exif::floatType, {0x7F800000}), Dictionary());  // infinite: an angle of 0
  EXPECT_EQ(of(Exif::floatType, {0x80000000}), Dictionary());  // minus 0
  EXPECT_EQ(of(Exif::asciiType, {'1'}), Dictionary());
  EXPECT_TRUE(host_->logLines.size() == 1);
}

TEST_F(CameraStill, KeepsTheLineInTheLog) {
  tagsOf(makers().exif(Exif().software("QX1.02")).bytes());
  EXPECT_TRUE(host_->logLines.empty());
  tagsOf(makers().exif(Exif().focalLength(35)).bytes());
  EXPECT_EQ(host_->logLines, (Names{"FOV SET, BABY!!!!!"}));
}

TEST_F(CameraStill, ItsLineIsWrittenBeforeTheFirmwareTextIsFoundTooShort) {
  EXPECT_THROW(tagsOf(anothers().exif(Exif().software("QX").focalLength(35)).bytes()),
               std::out_of_range);
  EXPECT_EQ(host_->logLines, (Names{"FOV SET, BABY!!!!!"}));
}

TEST_F(CameraStill, ItsLineIsNotPrinted) {
  testing::internal::CaptureStdout();
  tagsOf(exampleStill());
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");
}

// The firmware text.

TEST_F(CameraStill, FirmwareNamesTheModelByItsPrefix) {
  const auto& tables = CameraTables::builtIn();
  for (const auto& row : tables.shortPrefixes()) {
    const std::string text = row.prefix + ".5";
    EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software(text))),
              (Dictionary{{"FIRM", text}, {"CMDL", row.name}}));
  }
  for (std::size_t i = 0; i < 13; ++i) {
    const auto& row = tables.longPrefixes()[i];
    EXPECT_EQ(cameraTagsOf(makers().exif(Exif().software(row.prefix))),
              (Dictionary{{"CMDL", row.name}, {"FIRM", row.prefix}}));
  }
}

TEST_F(CameraStill, KeepsTheLastPrefixForTheRowBeforeTheLast) {
  for (const char* text : {"QZ1.01", "QZ1.01.99", "qz1.01.00.00"}) {
    EXPECT_EQ(cameraTagsOf(makers().exif(Exif().software(text)))["CMDL"], Value("QZ Kappa"));
  }
}

TEST_F(CameraStill, CaseDoesNotMatterInPrefixes) {
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software("qx2 beta"))),
            (Dictionary{{"FIRM", "qx2 beta"}, {"CMDL", "QX Beta"}}));
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software("Qx3.02"))),
            (Dictionary{{"FIRM", "Qx3.02"}, {"CMDL", "QX Gamma Plus"}}));
  // A point is no letter: what stands 32 places behind it is something else.
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software("QX3N02"))),
            (Dictionary{{"FIRM", "QX3N02"}}));
}

TEST_F(CameraStill, FirmwareThatMatchesNothingLeavesTheModel) {
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software("other 1.0"))),
            (Dictionary{{"FIRM", "other 1.0"}}));
  EXPECT_EQ(cameraTagsOf(makers().exif(Exif().software("other 1.0"))),
            (Dictionary{{"CMDL", "KiVex"}, {"FIRM", "other 1.0"}}));
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software(" QX1.02"))),
            (Dictionary{{"FIRM", " QX1.02"}}));
}

TEST_F(CameraStill, VerInFirmwareBecomesTheFirstPrefix) {
  const auto firmware = [&](std::string_view text) {
    return cameraTagsOf(anothers().exif(Exif().software(text)))["FIRM"].text();
  };
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().software("Ver02.01"))),
            (Dictionary{{"FIRM", "QX1.02.01"}, {"CMDL", "QX Alpha"}}));
  EXPECT_EQ(firmware("Ver"), "QX1.");
  EXPECT_EQ(firmware("VerVer 2 Version"), "QX1.QX1. 2 QX1.sion");
  EXPECT_EQ(firmware("QX3.01 Ver"), "QX3.01 QX1.");
  EXPECT_EQ(firmware("ver02.01"), "ver02.01");
  EXPECT_EQ(firmware("VeVerr.01"), "VeQX1.r.01");
}

// Hosts have always been able to catch it.
TEST_F(CameraStill, KeepsTheRangeErrorOfAShortFirmwareText) {
  const auto of = [&](std::string_view text) {
    return cameraTagsOf(anothers().exif(Exif().software(text)));
  };
  for (const char* text : {"", "Q", "QX", "QX3", "QX3.0", "12345", "qz1.0"}) {
    EXPECT_THROW(of(text), std::out_of_range) << text;
  }
  EXPECT_EQ(of("QX1")["CMDL"], Value("QX Alpha"));
  EXPECT_EQ(of("qx2.1")["CMDL"], Value("QX Beta"));
  EXPECT_EQ(of("123456"), (Dictionary{{"FIRM", "123456"}}));
}

// Not bytes: characters as UTF-16 counts them.
TEST_F(CameraStill, FirmwareIsMeasuredInCharacters) {
  const auto of = [&](std::string_view text) {
    return cameraTagsOf(anothers().exif(Exif().software(text)));
  };
  EXPECT_THROW(of("\xC3\xA9\xC3\xA9\xC3\xA9\xC3\xA9\xC3\xA9"), std::out_of_range);
  EXPECT_EQ(of("\xC3\xA9\xC3\xA9\xC3\xA9\xC3\xA9\xC3\xA9!").size(), 1U);
  EXPECT_EQ(of("\xF0\x9F\x93\xB7\xF0\x9F\x93\xB7\xF0\x9F\x93\xB7").size(), 1U);
  EXPECT_THROW(of("\xE9\xE9\xE9\xE9\xE9"), std::out_of_range);  // five, taken as ISO-8859-1
}

// The model of the properties.

TEST_F(CameraStill, ModelNamesFirmwareAndModelWithoutAFirmwareText) {
  for (const auto& row : CameraTables::builtIn().modelTexts()) {
    EXPECT_EQ(cameraTagsOf(makers().exif(Exif().model(row.text))),
              (Dictionary{{"CMDL", row.name}, {"FIRM", row.firmware}}));
  }
}

TEST_F(CameraStill, ModelIsComparedExactly) {
  for (const char* model : {"kv-qx301", "KV-QX301 ", " KV-QX301", "KV-QX30", "KV-QX3011", ""}) {
    EXPECT_EQ(cameraTagsOf(makers().exif(Exif().model(model))), (Dictionary{{"CMDL", "KiVex"}}));
  }
}

TEST_F(CameraStill, ModelOfAnotherMakerNamesNothing) {
  EXPECT_EQ(cameraTagsOf(anothers().exif(Exif().model("KV-QX301"))), Dictionary());
}

TEST_F(CameraStill, ModelDoesNotCountBesideAFirmwareText) {
  EXPECT_EQ(cameraTagsOf(makers().exif(Exif().model("KV-QX301").software("other 1.0"))),
            (Dictionary{{"CMDL", "KiVex"}, {"FIRM", "other 1.0"}}));
}

TEST_F(CameraStill, ModelCountsBesideASoftwareThatIsNoText) {
  EXPECT_EQ(cameraTagsOf(makers().exif(
                Exif().model("KV-QX301").entry(Exif::softwareTag, Exif::longType, 2, Bytes(8)))),
            (Dictionary{{"CMDL", "QX Gamma"}, {"FIRM", "QX3.01.00.00"}}));
}

// Tables of another host.

TEST_F(CameraStill, OtherTablesTakeThePlaceOfThoseBuiltIn) {
  std::ifstream file(OXMV_SOURCE_DIR "/oxmv/import/cameras.toml");
  std::string text{std::istreambuf_iterator<char>(file), {}};
  const auto at = text.find("{prefix = \"QX1\", name = \"QX Alpha\"}");
  ASSERT_NE(at, std::string::npos);
  text.replace(at, 11 + 3, "{prefix = \"ab9");
  const auto tables = std::get<CameraTables>(CameraTables::fromText(text));
  const Bytes still = makers().exif(Exif().software("Ver02")).bytes();
  const auto tags = tagsOfStill(still, leapDay, "", tables);
  EXPECT_EQ((*tags)["FIRM"], Value("ab9.02"));
  EXPECT_EQ((*tags)["CMDL"], Value("QX Alpha"));
}

// Damage.

TEST_F(CameraStill, EveryShorterFileIsReadWithinIt) {
  const Bytes whole = exampleStill();
  const Dictionary tags = *tagsOf(whole);
  for (std::size_t size = 0; size < whole.size(); ++size) {
    const Bytes file(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
    const auto shorter = tagsOf(file);
    if (!shorter) continue;
    EXPECT_EQ(*shorter, tags) << size;  // all but pixels are there
  }
}

TEST_F(CameraStill, EveryByteMayBeAnother) {
  const Bytes whole = exampleStill();
  for (std::size_t place = 0; place < whole.size(); ++place) {
    for (const int byte : {0x00, 0x7F, 0x80, 0xFF}) {
      Bytes file = whole;
      file[place] = static_cast<std::uint8_t>(byte);
      try {
        const auto tags = tagsOf(file);
        EXPECT_TRUE(!tags || tags->contains("TIMB")) << place;
      } catch (const std::out_of_range&) {
        EXPECT_LT(place, 1038U);  // only the EXIF segment holds a text that can become too short
      }
    }
  }
}

TEST_F(CameraStill, TakesLittleStack) {
  const Bytes file = exampleStill();
  const CameraTables& tables = CameraTables::builtIn();
  const auto used = stackUsedBy([&] { tagsOfStill(file, leapDay, "A001", tables); }, 256 * 1024);
  EXPECT_LE(used, 64 * 1024U);
}

// Files.

TEST_F(CameraStill, OnDiskHasTheTimeOfItsCreation) {
  const TempDir folder;
  const Bytes still = exampleStill();
  std::ofstream(folder / "still.jpg", std::ios::binary)
      .write(reinterpret_cast<const char*>(still.data()),
             static_cast<std::streamsize>(still.size()));
  const auto created = creationTime(folder / "still.jpg");
  EXPECT_EQ(tagsOfStillFile(folder / "still.jpg", "A001", CameraTables::builtIn()),
            tagsOfStill(still, created, "A001", CameraTables::builtIn()));
}

TEST_F(CameraStill, ThatCannotBeReadHasNoTags) {
  const TempDir folder;
  EXPECT_EQ(tagsOfStillFile(folder / "missing.jpg", "A001", CameraTables::builtIn()), std::nullopt);
  EXPECT_EQ(tagsOfStillFile(folder.path(), "A001", CameraTables::builtIn()), std::nullopt);
  EXPECT_EQ(tagsOfStillFile("/dev/null", "A001", CameraTables::builtIn()), std::nullopt);
}

TEST_F(CameraStill, StreamsCarryAllItsTagsButTheFieldOfView) {
  const auto losses = findLosses(*tagsOf(exampleStill(), "A001"), Layout::exact);
  ASSERT_EQ(losses.size(), 1U);
  EXPECT_EQ(losses[0].path, fieldOfViewKey);
}

}  // namespace
}  // namespace oxmv::test
