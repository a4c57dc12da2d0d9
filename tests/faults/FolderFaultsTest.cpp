// Folders and files that the system fails to open and to read.

#include <cerrno>
#include <string>
#include <system_error>
#include <vector>

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "oxmv/platform/Folder.h"
#include "oxmv/platform/WholeFile.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/Files.h"
#include "tests/support/LeasedFile.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

Fault failing(const std::string& function, int error) {
  return {.kind = Fault::Kind::fail, .error = error, .function = function};
}

class FolderFaults : public testing::Test {
 protected:
  FolderFaults() { putFile(root / "file", {1, 2, 3}); }

  // How many entries there are, as far as they can be told.
  std::size_t entriesWith(const Fault& fault, std::size_t nth = 1) {
    const Folder folder = Folder::open(root.path(), error).value();
    std::size_t count = 0;
    armFault(nth, fault);
    const bool isDone = folder.forEachEntry([&](std::string_view, EntryKind) { ++count; }, error);
    disarmFault();
    EXPECT_FALSE(faultyFunction().empty());
    EXPECT_EQ(isDone, !error);
    return count;
  }

  Bytes readWith(const std::string& name, const Fault& fault, std::size_t nth = 1) {
    const Folder folder = Folder::open(root.path(), error).value();
    armFault(nth, fault);
    const auto content = folder.read(name, EntryKind::unknown, buffer, error);
    disarmFault();
    EXPECT_FALSE(faultyFunction().empty());
    EXPECT_EQ(content.has_value(), !error);
    return content ? Bytes(content->begin(), content->end()) : Bytes();
  }

  const TempDir root;
  std::vector<std::uint8_t> buffer;
  std::error_code error;
};

TEST_F(FolderFaults, EntriesThatCannotBeReadAreTold) {
  for (const char* function : {"openat", "fdopendir", "readdir"}) {
    EXPECT_EQ(entriesWith(failing(function, EMFILE)), 0u) << function;
    EXPECT_EQ(error, std::errc::too_many_files_open) << function;
  }
}

TEST_F(FolderFaults, EntriesBeforeTheFailureAreGiven) {
  putFile(root / "another", {});
  EXPECT_EQ(entriesWith(failing("readdir", EIO), 5), 2u);  // "." and ".." are the others
  EXPECT_EQ(error, std::errc::io_error);
}

TEST_F(FolderFaults, FailureLeavesNoFileOpen) {
  entriesWith(failing("fdopendir", ENOMEM));
  std::vector<std::string> last;
  for (const SystemCall& call : systemCalls()) last.push_back(call.function);
  EXPECT_EQ(last, (std::vector<std::string>{"openat", "fdopendir", "close"}));
}

TEST_F(FolderFaults, InterruptedReadIsTakenUpAgain) {
  EXPECT_EQ(readWith("file", failing("read", EINTR)), (Bytes{1, 2, 3}));
}

TEST_F(FolderFaults, FileThatCannotBeReadIsTold) {
  for (const char* function : {"openat", "fstat", "read"}) {
    EXPECT_EQ(readWith("file", failing(function, EIO)), Bytes()) << function;
    EXPECT_EQ(error, std::errc::io_error) << function;
  }
}

TEST_F(FolderFaults, LongFileWhoseSizeCannotBeAskedForIsTold) {
  putFile(root / "long", Bytes(100'000, 7));
  EXPECT_EQ(readWith("long", failing("fstat", EIO), 2), Bytes());
  EXPECT_EQ(error, std::errc::io_error);
}

// A regular file answers so only while another process has it for itself; to wait for a device
// could take forever.
TEST_F(FolderFaults, BusyDeviceIsNotWaitedFor) {
  ASSERT_EQ(::mkfifo((root / "device").c_str(), 0600), 0);
  readWith("device", failing("openat", EWOULDBLOCK));
  EXPECT_EQ(error, std::errc::operation_would_block);
  EXPECT_EQ(systemCalls().size(), 1u);
}

TEST_F(FolderFaults, BusyFileThatGoesIsTold) {
  readWith("gone", failing("openat", EWOULDBLOCK));
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
}

TEST_F(FolderFaults, InterruptedWaitForABusyFileIsTakenUpAgain) {
  const LeasedFile lease(root / "file");
  if (!lease.isHeld()) GTEST_SKIP() << "no leases here";
  EXPECT_EQ(readWith("file", failing("openat", EINTR), 2), (Bytes{1, 2, 3}));
}

}  // namespace
}  // namespace oxmv::test
