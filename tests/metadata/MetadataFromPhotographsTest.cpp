// Photographs that people took with some fifty cameras and phones, as Debian's package
// golang-github-rwcarlsen-goexif-dev brings them. Most are cut off behind their EXIF segment; these
// are no images, and tell their tags in front of a picture of ours.

#include <algorithm>
#include <fstream>
#include <iterator>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/import/CameraStill.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/values/Array.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Printing.h"
#include "tests/support/StillBuilder.h"
#include "tests/support/TempDir.h"
#include "tests/support/TestData.h"

namespace oxmv::test {
namespace {

const std::filesystem::path photographs = OXMV_PHOTOGRAPHS;

// What a photograph tells, as read from its bytes by another program.
struct Photograph {
  std::string begin;                    // of its name
  std::optional<std::string> software;  // its Software text, "Ver" already replaced
  int fieldOfView;                      // 0: it tells no focal length
  bool isAlpha = false;  // its software text is that of the first camera of the tables
};

const Photograph cutOff[] = {
    {"2004-01-11", "M5011S-1031", 0},
    {"2006-08-03", std::nullopt, 0},
    {"2006-11-11", "E3200v1.1", 78},
    {"2006-12-10", std::nullopt, 0},
    {"2006-12-17", "Optio S6 QX1. 1.00", 78},
    {"2006-12-21", std::nullopt, 0},
    {"2007-01-01", "KODAK EASYSHARE C713 ZOOM DIGITAL CAMERA", 78},
    {"2007-01-17", "1.00.018PR         ", 0},
    {"2007-02-02", "Optio S5z QX1. 1.00 ", 78},
    {"2007-05-02", std::nullopt, 0},
    {"2007-05-12", "1.00             ", 78},
    {"2007-05-26", "COOLPIX L3v1.2", 78},
    {"2007-05-30", "COOLPIX S6V1.0", 78},
    {"2007-06-06", "E3700v1.2", 78},
    {"2007-06-26", "DVWare 1.0", 0},
    {"2007-07-13", "QX1. 1.00    ", 78, true},
    {"2007-08-15", std::nullopt, 0},  // a focal length, but beside the directory for them
    {"2007-08-24", std::nullopt, 0},
    {"2007-11-07", "Digital Camera FinePix Z1      QX1.1.00", 0},
    {"2008-06-02", "00.00.1240a", 0},
    {"2008-06-06", std::nullopt, 0},
    {"2008-06-17", "A520_CT019", 0},
    {"2008-09-02", "R6GA004     prgCXC1250583_GENERIC_M 2.0", 0},
    {"2009-03-26", std::nullopt, 0},
    {"2009-04-11", "COOLPIX L18 V1.1", 78},
    {"2009-04-23", "Optio S50 QX1. 1.00", 78},
    {"2009-06-11", "Adobe Photoshop CS3 Macintosh", 0},
    {"2009-06-20", std::nullopt, 78},
    {"2009-08-05", "Digital Camera FinePix E550    QX1.1.00", 0},
    {"2010-06-08", std::nullopt, 0},
    {"2010-06-20", "QuickTime 7.6.6", 0},
    {"2010-09-02", "QX1.sion 1.0                    ", 0, true},
    {"2011-01-24", "V 12.40", 0},
    {"2011-03-07", "GU295-MSM1530032L-V10i-APR-22-2010-ATT-US", 0},
    {"2011-05-07", "M7500BSAAAAAAD3050", 0},
    {"2011-08-07", "QX1..1.00", 78, true},
    {"2011-10-28-17", "Adobe Photoshop CS4 Macintosh", 0},
    {"2011-10-28-18", "QX1..1.11 ", 78, true},
    {"2011-11-18", "M6290A-KPVMZL-2.6.0140T", 0},
    {"2012-06-02", "QX1..1.0  ", 77, true},
    {"2012-09-21", std::nullopt, 0},
    {"2012-12-19", std::nullopt, 0},
    {"2012-12-21", std::nullopt, 0},
    {"2099-08-12", "QX1..1.00 ", 77, true},
    {"2216-11-15", "KODAK EASYSHARE C813 ZOOM DIGITAL CAMERA", 78},
    {"FailedHash", "Apple Image Capture", 0},
};

const Photograph whole[] = {
    {"f1-", std::nullopt, 0}, {"f2-", std::nullopt, 0}, {"f3-", std::nullopt, 0},
    {"f4-", std::nullopt, 0}, {"f5-", std::nullopt, 0}, {"f6-", std::nullopt, 0},
    {"f7-", std::nullopt, 0}, {"f8-", std::nullopt, 0}, {"geodegrees", std::nullopt, 0},
};

// The one file in `folder` whose name begins so.
std::filesystem::path pathOf(const std::string& begin, const std::filesystem::path& folder) {
  std::vector<std::filesystem::path> found;
  for (const auto& file : std::filesystem::directory_iterator(folder)) {
    const std::string name = file.path().filename();
    if (name.starts_with(begin)) found.push_back(file.path());
  }
  if (found.size() != 1) throw std::runtime_error(begin + ": not one photograph");
  return found[0];
}

// The photograph's whole segments up to the first that belongs to its picture, and a picture of
// ours.
Bytes withPicture(const Bytes& photograph) {
  std::size_t at = 2;
  while (at + 4 <= photograph.size()) {
    const std::size_t end = at + 2u + photograph[at + 2] * 256u + photograph[at + 3];
    const bool isHeader = photograph[at + 1] >= 0xE0;  // of an application, or a comment
    if (!isHeader || end > photograph.size()) break;
    at = end;
  }
  Bytes still(photograph.begin(), photograph.begin() + static_cast<std::ptrdiff_t>(at));
  const Bytes image = picture();  // which begins with a mark of two bytes, as the photograph does
  std::copy(image.begin() + 2, image.end(), std::back_inserter(still));
  return still;
}

Dictionary expectedFrom(const Photograph& photograph) {
  Dictionary tags{{"TIMB", 30}};
  if (photograph.fieldOfView != 0) {
    tags.set(fieldOfViewKey, Array::of(static_cast<std::uint8_t>(photograph.fieldOfView)));
  }
  if (photograph.software) tags.set("FIRM", *photograph.software);
  if (photograph.isAlpha) tags.set("CMDL", "QX Alpha");
  return tags;
}

// The tags of a file without its times, which are those of its copy here.
std::optional<Dictionary> tagsOf(const std::filesystem::path& path) {
  auto tags = MetadataDictionary::metadataFromJPEGFile(path, "");
  if (!tags) return std::nullopt;
  for (const char* time : {"STIM", "SDAT", "TIMC"}) tags->remove(time);
  return tags;
}

class MetadataFromPhotographs : public testing::Test {
 protected:
  // A file of that content.
  std::filesystem::path still(const Bytes& content) const {
    const auto path = folder_ / "still.jpg";
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char*>(content.data()),
               static_cast<std::streamsize>(content.size()));
    return path;
  }

  InstalledFakeHost host_;
  TempDir folder_;
};

TEST_F(MetadataFromPhotographs, WholeOnesTellTheirTags) {
  for (const Photograph& photograph : whole) {
    SCOPED_TRACE(photograph.begin);
    EXPECT_EQ(tagsOf(pathOf(photograph.begin, photographs / "samples")), expectedFrom(photograph));
  }
  EXPECT_EQ(tagsOf(photographs / "sample1.jpg"),
            (Dictionary{{"TIMB", 30},
                        {fieldOfViewKey, Array::of(std::uint8_t{78})},
                        {"FIRM", "Opanda PowerExif"}}));
}

TEST_F(MetadataFromPhotographs, CutOffBeforeTheirPictureTheyAreNoImages) {
  for (const Photograph& photograph : cutOff) {
    SCOPED_TRACE(photograph.begin);
    EXPECT_EQ(tagsOf(pathOf(photograph.begin, photographs / "samples")), std::nullopt);
  }
}

TEST_F(MetadataFromPhotographs, WithAPictureTheCutOffOnesTellTheirTags) {
  for (const Photograph& photograph : cutOff) {
    SCOPED_TRACE(photograph.begin);
    const Bytes content = testData(pathOf(photograph.begin, photographs / "samples"));
    EXPECT_EQ(tagsOf(still(withPicture(content))), expectedFrom(photograph));
  }
}

// "7.1.1" and "  1.0" are no firmware texts that a prefix of six characters could be taken from.
TEST_F(MetadataFromPhotographs, KeepsTheRangeErrorForShortSoftwareTexts) {
  EXPECT_THROW(tagsOf(photographs / "samples" / "has-lens-info.jpg"), std::out_of_range);
  const Bytes content = testData(pathOf("2013-02-05", photographs / "samples"));
  EXPECT_THROW(tagsOf(still(withPicture(content))), std::out_of_range);
}

TEST_F(MetadataFromPhotographs, DamagedOnesEndAndTellWhatIsLeft) {
  EXPECT_EQ(tagsOf(photographs / "corrupt" / "infinite_loop_exif.jpg"),
            (Dictionary{{"TIMB", 30}, {"FIRM", "Adobe Photoshop CS2 Macintosh"}}));
  for (const char* cut : {"huge_tag_exif.jpg", "max_uint32_exif.jpg"}) {
    SCOPED_TRACE(cut);
    const auto path = photographs / "corrupt" / cut;
    EXPECT_EQ(tagsOf(path), std::nullopt);
    EXPECT_EQ(tagsOf(still(withPicture(testData(path)))), (Dictionary{{"TIMB", 30}}));
  }
}

}  // namespace
}  // namespace oxmv::test
