// Open files of the system, for the other files of this folder.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <system_error>
#include <utility>
#include <vector>

struct stat;

namespace oxmv {

// A file descriptor that closes itself.
class Descriptor {
 public:
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
  Descriptor& operator=(Descriptor&&) = delete;
  ~Descriptor();

  bool isOpen() const { return number_ >= 0; }
  int number() const { return number_; }
  // Some file systems tell only here that what was written has not arrived.
  bool close();

 private:
  int number_;
};

// Opens a file for reading, whose name is one in `folder` or, if that is null, a path. A pipe
// without a writer never makes this wait. Not open when that fails; see lastError().
Descriptor openToRead(const Descriptor* folder, const char* name);

// Of the system call that failed last.
std::error_code lastError() noexcept;

// What keeps a file of this kind from being ours; none when nothing does.
std::error_code objectionToKind(const struct stat& status) noexcept;

// What the system says of an open file. Nothing, with the cause in `error`, when it is no regular
// file.
std::optional<struct stat> regularStatus(const Descriptor& file, std::error_code& error);

// Its size alone.
std::optional<std::uintmax_t> regularSize(const Descriptor& file, std::error_code& error);

// Reads until `content` is full or the file ends. Answers how many bytes that were; nothing, with
// the cause in `error`, when the reading fails.
std::optional<std::size_t> readInto(std::span<std::uint8_t> content, const Descriptor& file,
                                    std::error_code& error);

// The same up to the file's end, behind the first `size` bytes, which are in `buffer` already. It
// grows as it has to; more than maxFileSize is FileError::tooLarge. Answers the size of all.
std::optional<std::size_t> readToEnd(std::vector<std::uint8_t>& buffer, std::size_t size,
                                     const Descriptor& file, std::error_code& error);

}  // namespace oxmv
