// Builds tag streams record by record, where a test can see the damage that it then does to them.

#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace oxmv::test {

using Bytes = std::vector<std::uint8_t>;

// The characters of a text, as they stand.
Bytes bytesOf(std::string_view text);

// A stream of so many bytes, all of them part of copies of `pattern`; the last copy may be cut.
Bytes repeated(const Bytes& pattern, std::size_t size);

// Shares no code with the library: a mistake in its byte order would otherwise be made twice.
class StreamBuilder {
 public:
  // A record of its true size, then zeros up to a multiple of 4. `tag` has four characters.
  StreamBuilder& record(std::string_view tag, char type, const Bytes& payload);
  StreamBuilder& record(std::string_view tag, char type, std::string_view payload);
  StreamBuilder& record(std::string_view tag, char type, std::int32_t payload);
  StreamBuilder& record(std::string_view tag, char type, float payload);

  // A header alone. What follows need not be of that size.
  StreamBuilder& header(std::string_view tag, std::uint32_t size, char type);

  StreamBuilder& marker(std::uint16_t count);
  StreamBuilder& raw(const Bytes& bytes);
  StreamBuilder& dropLast(std::size_t count);

  const Bytes& bytes() const { return bytes_; }

 private:
  Bytes bytes_;
};

}  // namespace oxmv::test
