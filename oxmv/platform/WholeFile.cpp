#include "oxmv/platform/WholeFile.h"

#include <array>
#include <cerrno>
#include <climits>
#include <string>
#include <string_view>
#include <utility>

#include <fcntl.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include "oxmv/platform/Descriptor.h"

namespace oxmv {
namespace {

class FileCategory final : public std::error_category {
 public:
  const char* name() const noexcept override { return "oxmv.file"; }
  std::string message(int code) const override {
    switch (FileError{code}) {
      case FileError::notRegular: return "Not a regular file";
      case FileError::tooLarge: return "Larger than 256 MiB";
      case FileError::changed: return "Changed since it was read";
    }
    return "Unknown error";
  }
};
static_assert(maxFileSize == std::size_t{256} * 1024 * 1024, "the message names it");

using Content = std::vector<std::uint8_t>;

// What keeps a path from naming a file; none when nothing does.
std::error_code objectionTo(const std::filesystem::path& path) {
  if (path.native().find('\0') != std::string::npos)
    return make_error_code(std::errc::invalid_argument);
  return {};
}

struct OpenFile {
  Descriptor file;
  struct stat status;

  std::uintmax_t size() const { return static_cast<std::uintmax_t>(status.st_size); }
};

// Whether nobody has written to the file meanwhile, as far as the system tells.
bool isSame(const struct stat& before, const struct stat& after) {
  return before.st_size == after.st_size && before.st_mtim.tv_sec == after.st_mtim.tv_sec &&
         before.st_mtim.tv_nsec == after.st_mtim.tv_nsec;
}

// Opened for reading if it is a regular file; else nothing, with the cause in `error`.
std::optional<OpenFile> openFile(const std::filesystem::path& path, std::error_code& error) {
  error = objectionTo(path);
  if (error) return std::nullopt;
  Descriptor file = openToRead(nullptr, path.c_str());
  if (!file.isOpen()) return error = lastError(), std::nullopt;
  const auto status = regularStatus(file, error);
  if (!status) return std::nullopt;
  return OpenFile{std::move(file), *status};
}

// The content from where the first `start` bytes have been read.
std::optional<Content> contentBehind(std::size_t start, const OpenFile& open,
                                     std::error_code& error) {
  if (open.size() > maxFileSize) return error = FileError::tooLarge, std::nullopt;
  const auto whole = static_cast<std::size_t>(open.size());
  // One more, to meet the end in one go.
  Content content((whole > start ? whole - start : 0) + 1);
  const auto size = readToEnd(content, 0, open.file, error);
  if (!size) return std::nullopt;
  content.resize(*size);
  return content;
}

bool writeAll(int file, std::span<const std::uint8_t> content) {
  while (!content.empty()) {
    const ssize_t count = ::write(file, content.data(), content.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return false;
    content = content.subspan(static_cast<std::size_t>(count));
  }
  return true;
}

// The file that a chain of symbolic links leads to, whether it is there or not.
std::filesystem::path followLinks(std::filesystem::path path, std::error_code& error) {
  constexpr int mostLinks = 40;  // as many as Linux itself follows
  for (int links = 0;; ++links) {
    std::array<char, PATH_MAX> target;
    const ssize_t size = ::readlink(path.c_str(), target.data(), target.size());
    const bool isLink = size >= 0;
    if (!isLink && errno != EINVAL && errno != ENOENT) error = lastError();
    if (isLink && links == mostLinks)
      error = make_error_code(std::errc::too_many_symbolic_link_levels);
    if (!isLink || error) return path;
    // An absolute target stands alone.
    path = path.parent_path() / std::string_view(target.data(), static_cast<std::size_t>(size));
  }
}

std::string temporaryName(std::error_code& error) {
  std::array<std::uint8_t, 16> random{};
  ssize_t count = 0;
  do {
    count = ::getrandom(random.data(), random.size(), 0);
  } while (count < 0 && errno == EINTR);
  if (count < 0) error = lastError();  // else all of them: so few never come in parts
  std::string name = ".oxmv-";
  for (const std::uint8_t byte : random) name += "0123456789abcdef"[byte & 0xF];
  return name + ".tmp";
}

// A file of a name that was made for it, which is gone again unless it is given another.
class TemporaryFile {
 public:
  explicit TemporaryFile(const std::filesystem::path& path) : path_(path) {}
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;
  ~TemporaryFile() {
    if (isTemporary_) ::unlink(path_.c_str());
  }

  bool rename(const std::filesystem::path& path) {
    isTemporary_ = ::rename(path_.c_str(), path.c_str()) != 0;
    return !isTemporary_;
  }

 private:
  const std::filesystem::path& path_;
  bool isTemporary_ = true;
};

std::filesystem::path folderOf(const std::filesystem::path& path) {
  return path.has_parent_path() ? path.parent_path() : ".";
}

// Opened to be synchronised. A folder that may be written but not read cannot be, and that is no
// error.
Descriptor openFolder(const std::filesystem::path& folder, std::error_code& error) {
  Descriptor descriptor(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!descriptor.isOpen() && errno != EACCES) error = lastError();
  return descriptor;
}

// Brings the folder's own record of its names to the disk. Some file systems cannot do this, and
// need not.
bool syncFolder(const Descriptor& folder) {
  return !folder.isOpen() || ::fsync(folder.number()) == 0 || errno == EINVAL || errno == ENOTSUP;
}

// Gives the new file the permissions, owner and group of the old one. An owner or group that cannot
// be given leaves ours, without the bits that would let the file run as somebody else, and without
// what another group was allowed. Where the file system has no permissions to give, those that the
// new file has will do, unless they allow more.
bool takeOver(int file, const struct stat& old) {
  constexpr auto asItIs = static_cast<uid_t>(-1);
  mode_t mode = old.st_mode & 07777;
  const bool hasGroup = ::fchown(file, asItIs, old.st_gid) == 0;
  const bool hasOwner = ::fchown(file, old.st_uid, asItIs) == 0;
  if (!hasGroup) mode &= ~static_cast<mode_t>(S_IRWXG);
  if (!hasGroup || !hasOwner) mode &= 0777;
  if (::fchmod(file, mode) == 0) return true;
  const int cause = errno;
  if (cause != EPERM && cause != ENOTSUP) return false;
  struct stat made = {};
  if (::fstat(file, &made) != 0) return false;
  errno = cause;
  return (made.st_mode & 07777 & ~mode) == 0;
}

}  // namespace

std::error_code make_error_code(FileError error) noexcept {
  static const FileCategory category;
  return {static_cast<int>(error), category};
}

std::optional<std::vector<std::uint8_t>> readWholeFile(const std::filesystem::path& path,
                                                       std::error_code& error) {
  for (int attempt = 0; attempt < 2; ++attempt) {
    const auto open = openFile(path, error);
    if (!open) return std::nullopt;
    auto content = contentBehind(0, *open, error);
    if (!content) return std::nullopt;
    const auto after = regularStatus(open->file, error);
    if (!after) return std::nullopt;
    if (isSame(open->status, *after)) return content;
  }
  error = FileError::changed;
  return std::nullopt;
}

std::optional<std::vector<std::uint8_t>> readFileStart(const std::filesystem::path& path,
                                                       std::size_t count, std::error_code& error,
                                                       bool* isOpened) {
  const auto open = openFile(path, error);
  if (isOpened != nullptr) *isOpened = open.has_value();
  if (!open) return std::nullopt;
  std::vector<std::uint8_t> content(count);
  const auto size = readInto(content, open->file, error);
  if (!size) return std::nullopt;
  content.resize(*size);
  return content;
}

std::optional<std::vector<std::uint8_t>> readBehindHead(const std::filesystem::path& path,
                                                        std::span<std::uint8_t>& head,
                                                        std::error_code& error) {
  const std::size_t wanted = head.size();
  auto there = head;
  head = head.first(0);
  const auto open = openFile(path, error);
  if (!open) return std::nullopt;
  const auto headSize = readInto(there, open->file, error);
  if (!headSize) return std::nullopt;
  head = there.first(*headSize);
  if (*headSize < wanted) return std::nullopt;
  return contentBehind(wanted, *open, error);
}

namespace {

// Whether a file has that content, or is not there if there is none.
bool hasContent(const std::filesystem::path& path, const std::optional<Content>& content) {
  std::error_code error;
  const auto now = readWholeFile(path, error);
  return now == content && (now || error == std::errc::no_such_file_or_directory);
}

// Null for `old`: whatever is there is replaced.
bool write(const std::filesystem::path& path, std::span<const std::uint8_t> content,
           const std::optional<Content>* old, std::error_code& error) {
  error = objectionTo(path);
  if (!error && content.size() > maxFileSize) error = FileError::tooLarge;
  if (error) return false;
  const std::filesystem::path target = followLinks(path, error);
  if (error) return false;
  struct stat replaced = {};
  const bool isThere = ::lstat(target.c_str(), &replaced) == 0;
  if (!isThere && errno != ENOENT) return error = lastError(), false;
  if (isThere && (error = objectionToKind(replaced))) return false;

  const std::filesystem::path folder = folderOf(target);
  // Now, so that nothing but the synchronisation itself can fail once the file has its name.
  const Descriptor openedFolder = openFolder(folder, error);
  if (error) return false;
  const std::filesystem::path temporary = folder / temporaryName(error);
  if (error) return false;
  // Readable by nobody else until it has the permissions of the file that it replaces.
  const mode_t mode = isThere ? 0600 : 0666;
  Descriptor file(::open(temporary.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode));
  if (!file.isOpen()) return error = lastError(), false;
  // From here on also want of memory leaves nothing behind.
  TemporaryFile made(temporary);
  const bool isComplete = writeAll(file.number(), content) &&
                          (!isThere || takeOver(file.number(), replaced)) &&
                          ::fsync(file.number()) == 0 && file.close();
  if (!isComplete) return error = lastError(), false;
  if (old != nullptr && !hasContent(target, *old)) return error = FileError::changed, false;
  if (!made.rename(target)) return error = lastError(), false;
  if (!syncFolder(openedFolder)) return error = lastError(), false;
  return true;
}

}  // namespace

bool writeWholeFile(const std::filesystem::path& path, std::span<const std::uint8_t> content,
                    std::error_code& error) {
  return write(path, content, nullptr, error);
}

bool replaceWholeFile(const std::filesystem::path& path, const std::optional<Content>& old,
                      std::span<const std::uint8_t> content, std::error_code& error) {
  return write(path, content, &old, error);
}

bool removeFile(const std::filesystem::path& path, std::error_code& error) {
  error = objectionTo(path);
  if (error) return false;
  const Descriptor folder = openFolder(folderOf(path), error);
  if (error) return false;
  if (::unlink(path.c_str()) != 0 || !syncFolder(folder)) error = lastError();
  return !error;
}

bool writeNewFile(const std::filesystem::path& path, std::span<const std::uint8_t> content,
                  std::error_code& error) {
  error = objectionTo(path);
  if (error) return false;
  struct stat there = {};
  const bool isThere = ::lstat(path.c_str(), &there) == 0;
  if (!isThere && replaceWholeFile(path, std::nullopt, content, error)) return true;
  if (isThere || error == FileError::changed) error = make_error_code(std::errc::file_exists);
  return false;
}

}  // namespace oxmv
