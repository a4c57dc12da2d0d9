// The sum that reading everything adds up. It does not depend on the order of entries, which is not
// the same in all formats, and takes something of every key and value, so that none can be left
// out.

#pragma once

#include <bit>
#include <cstdint>
#include <string_view>

namespace bench {

class Checksum {
 public:
  void key(std::string_view key) { sum_ += 3 * ends(key); }
  void text(std::string_view text) { sum_ += 5 * ends(text); }
  void integer(std::int64_t number) { sum_ += 7 * static_cast<std::uint64_t>(number); }
  // The formats that hold doubles hold those of floats.
  void number(double number) { this->number(static_cast<float>(number)); }
  void number(float number) { sum_ += 11 * std::uint64_t{std::bit_cast<std::uint32_t>(number)}; }

  std::uint64_t sum() const { return sum_; }

 private:
  static std::uint64_t byte(char c) { return static_cast<unsigned char>(c); }
  static std::uint64_t ends(std::string_view text) {
    return text.empty() ? 1 : text.size() + (byte(text.front()) << 8) + (byte(text.back()) << 16);
  }

  std::uint64_t sum_ = 0;
};

}  // namespace bench
