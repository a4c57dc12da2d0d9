// Prints the words that tag streams are made of, from the tag table, as libFuzzer takes a
// dictionary: the fuzzer puts them in where it tries something.

#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/metadata/TagTable.h"

namespace {

// Every byte by its number: no character has to be thought about.
void print(std::string_view word) {
  std::string line;
  for (const char c : word) {
    constexpr std::string_view digits = "0123456789ABCDEF";
    const auto byte = static_cast<std::uint8_t>(c);
    line.append("\\x").append(1, digits[byte >> 4]).append(1, digits[byte & 0xF]);
  }
  std::printf("\"%s\"\n", line.c_str());
}

}  // namespace

int main() {
  for (const oxmv::TagRow& row : oxmv::tagRows()) {
    const auto characters = oxmv::charactersOf(row.tag);
    print({characters.data(), characters.size()});
  }
  print(oxmv::controlPointKey);
  const auto marker = oxmv::markerBytes;
  print({reinterpret_cast<const char*>(marker.data()), marker.size()});
}
