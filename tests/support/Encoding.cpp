#include "tests/support/Encoding.h"

#include <gtest/gtest.h>

namespace oxmv::test {

Bytes encoded(const Dictionary& tags, Layout layout) {
  const auto stream = encodeStream(tags, layout);
  EXPECT_TRUE(stream.has_value());
  return stream.value_or(Bytes());
}

std::vector<std::string> tagsIn(const Bytes& stream) {
  std::vector<std::string> tags;
  for (std::size_t at = 0; at + 8 <= stream.size();) {
    const auto start = stream.begin() + static_cast<std::ptrdiff_t>(at);
    tags.emplace_back(start, start + 4);
    const std::size_t size = stream[at + 4] + stream[at + 5] * 256u + stream[at + 6] * 65536u;
    at += 8 + (size + 3) / 4 * 4;
  }
  return tags;
}

}  // namespace oxmv::test
