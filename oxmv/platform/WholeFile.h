// Whole files in, whole files out. A path that has a NUL in it names no file: the system would cut
// it there, and with that reach another one. It is std::errc::invalid_argument.

#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <optional>
#include <span>
#include <system_error>
#include <vector>

namespace oxmv {

// The largest file that is read or written. Clips take kilobytes and the largest looks some
// megabytes; what is larger is no file of ours, and must not fill the host's memory.
constexpr std::size_t maxFileSize = std::size_t{256} << 20;

// Why a file is none of ours to read or replace. Everything else comes as the
// system's own error.
enum class FileError {
  notRegular = 1,  // a pipe, a device ... (a folder gives std::errc::is_a_directory)
  tooLarge,        // more than maxFileSize
  changed,         // it is not any more what its reader found, or is not while it is read
};
std::error_code make_error_code(FileError error) noexcept;

// The content of a regular file. Answers nothing, with the cause in `error`, when there is no such
// file, it cannot be read to its end, is not a regular file (a pipe never makes this wait) or is
// larger than maxFileSize. A read that fails is never taken for the end of the file. A file that is
// written to in its place meanwhile is read once more; if that goes on, it is FileError::changed,
// for what has been read may be a mixture. (Those that writeWholeFile() replaces never are.)
std::optional<std::vector<std::uint8_t>> readWholeFile(const std::filesystem::path& path,
                                                       std::error_code& error);

// The first `count` bytes of such a file, or all of them if it has fewer; it may be of any size.
// `isOpened`, unless null, tells a file that could be opened and not read from one that could not
// be opened.
std::optional<std::vector<std::uint8_t>> readFileStart(const std::filesystem::path& path,
                                                       std::size_t count, std::error_code& error,
                                                       bool* isOpened = nullptr);

// The content of such a file behind a head of fixed size, which is read first and cut to the bytes
// of it that are there: they are in `head` whatever becomes of the rest, also when std::bad_alloc
// leaves. Answers nothing, without an error, when the file ends within the head.
std::optional<std::vector<std::uint8_t>> readBehindHead(const std::filesystem::path& path,
                                                        std::span<std::uint8_t>& head,
                                                        std::error_code& error);

// Puts a file with this content at `path`, in place of the regular file that may be there: whoever
// opens it finds the old content or the new, whole, also after a crash. The content goes to a
// temporary file of random name in the same folder (".oxmv-<16 digits>.tmp"), which then takes the
// place of the old one and has its permissions and, where the system allows, its owner. A symbolic
// link is followed: the file it leads to is replaced. Folders are not made. Content of more than
// maxFileSize, which could not be read again, is FileError::tooLarge.
//
// Answers false with the cause in `error` when that fails; then what was there is there still, and
// nothing else. In one case the new file is there already: when the system fails to say that its
// name has reached the disk.
[[nodiscard]] bool writeWholeFile(const std::filesystem::path& path,
                                  std::span<const std::uint8_t> content, std::error_code& error);

// The same, for content that was made of what stood there before: `old`, or none if there was no
// file. When the file has another content by now, somebody else's change would be lost; that is
// FileError::changed. Looks right before the new file takes its place.
[[nodiscard]] bool replaceWholeFile(const std::filesystem::path& path,
                                    const std::optional<std::vector<std::uint8_t>>& old,
                                    std::span<const std::uint8_t> content, std::error_code& error);

// Removes the file, or the symbolic link, of that name; never a folder. Answers false with the
// cause in `error` when that fails, also when there is none. In one case it is gone already: when
// the system fails to say that this has reached the disk.
[[nodiscard]] bool removeFile(const std::filesystem::path& path, std::error_code& error);

// writeWholeFile() where nothing has that name, neither file nor folder nor a symbolic link,
// wherever it leads; std::errc::file_exists where something has.
[[nodiscard]] bool writeNewFile(const std::filesystem::path& path,
                                std::span<const std::uint8_t> content, std::error_code& error);

}  // namespace oxmv

template <>
struct std::is_error_code_enum<oxmv::FileError> : std::true_type {};
