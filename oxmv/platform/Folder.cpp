#include "oxmv/platform/Folder.h"

#include <cerrno>
#include <cstddef>
#include <memory>
#include <utility>

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include "oxmv/platform/WholeFile.h"

namespace oxmv {
namespace {

// What most files fit into at once.
constexpr std::size_t ordinaryBuffer = std::size_t{64} << 10;

EntryKind kindOf(unsigned char type) {
  switch (type) {
    case DT_REG: return EntryKind::regular;
    case DT_DIR: return EntryKind::folder;
    case DT_LNK:
    case DT_UNKNOWN: return EntryKind::unknown;
    default: return EntryKind::other;
  }
}

struct CloseFolder {
  void operator()(DIR* folder) const { ::closedir(folder); }
};

}  // namespace

std::optional<Folder> Folder::open(const std::filesystem::path& path, std::error_code& error) {
  if (path.native().find('\0') != std::string::npos)
    return error = make_error_code(std::errc::invalid_argument), std::nullopt;
  Descriptor folder(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!folder.isOpen()) return error = lastError(), std::nullopt;
  error.clear();
  return Folder(std::move(folder));
}

bool Folder::forEachEntry(const std::function<void(std::string_view, EntryKind)>& each,
                          std::error_code& error) const {
  // A descriptor of its own: how far this one has been read is shared by all its copies.
  const int own = ::openat(folder_.number(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (own < 0) return error = lastError(), false;
  const std::unique_ptr<DIR, CloseFolder> entries(::fdopendir(own));
  if (entries == nullptr) {
    error = lastError();
    ::close(own);
    return false;
  }
  for (;;) {
    errno = 0;
    const dirent* entry = ::readdir(entries.get());
    if (entry == nullptr) break;
    const std::string_view name = entry->d_name;
    if (name != "." && name != "..") each(name, kindOf(entry->d_type));
  }
  if (errno != 0) return error = lastError(), false;
  error.clear();
  return true;
}

std::optional<std::span<const std::uint8_t>> Folder::read(const std::string& name, EntryKind kind,
                                                          std::vector<std::uint8_t>& buffer,
                                                          std::error_code& error) const {
  error.clear();
  const Descriptor file = openToRead(&folder_, name.c_str());
  if (!file.isOpen()) return error = lastError(), std::nullopt;
  if (kind != EntryKind::regular && !regularSize(file, error)) return std::nullopt;
  if (buffer.size() < ordinaryBuffer) buffer.resize(ordinaryBuffer);
  auto size = readInto(buffer, file, error);
  if (size == buffer.size()) {
    const auto whole = regularSize(file, error);
    if (whole && *whole > maxFileSize) error = FileError::tooLarge;
    size = error ? std::nullopt : readToEnd(buffer, *size, file, error);
  }
  if (!size) return std::nullopt;
  // What has taken the place of a file since the folder was read may answer with no bytes, as a
  // pipe does.
  if (*size == 0 && !regularSize(file, error)) return std::nullopt;
  return std::span(buffer).first(*size);
}

}  // namespace oxmv
