// A still on a file system that does not remember when files were created.

#include <fstream>

#include <gtest/gtest.h>

#include "oxmv/import/CameraStill.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/platform/CreationTime.h"
#include "oxmv/values/Array.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/FakeHost.h"
#include "tests/support/Printing.h"
#include "tests/support/StillBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

class StillFault : public testing::TestWithParam<CreationTimes> {
 protected:
  StillFault() { setCreationTimes(GetParam()); }
  ~StillFault() override { setCreationTimes(CreationTimes::told); }

  InstalledFakeHost host_;
};

TEST_P(StillFault, WithoutItsCreationTimeAStillHasNoTimes) {
  const TempDir folder;
  const auto path = folder / "still.jpg";
  const Bytes still = exampleStill();
  std::ofstream(path, std::ios::binary)
      .write(reinterpret_cast<const char*>(still.data()),
             static_cast<std::streamsize>(still.size()));
  EXPECT_EQ(creationTime(path), std::nullopt);
  EXPECT_EQ(MetadataDictionary::metadataFromJPEGFile(path, "A001"),
            (Dictionary{{"TIMB", 30},
                        {"REEL", "A001"},
                        {"CMDL", "QX Gamma"},
                        {fieldOfViewKey, Array::of(87)},
                        {"FIRM", "QX3.01.02.00"}}));
}

INSTANTIATE_TEST_SUITE_P(CreationTimes, StillFault,
                         testing::Values(CreationTimes::hidden, CreationTimes::zero));

}  // namespace
}  // namespace oxmv::test
