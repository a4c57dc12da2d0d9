// Writes the stills that the tests build, as files: the example, and what the fuzzer begins with.
//
//   writeStills examples/still.jpg fuzz/corpus/StillFuzz

#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tests/support/StillBuilder.h"

namespace {

using oxmv::test::Bytes;

void write(const std::filesystem::path& path, const Bytes& content) {
  std::ofstream file(path, std::ios::binary);
  file.exceptions(std::ios::failbit | std::ios::badbit);
  file.write(reinterpret_cast<const char*>(content.data()),
             static_cast<std::streamsize>(content.size()));
}

}  // namespace

int main(int argc, char** argv) try {
  if (argc != 3) {
    std::cerr << "usage: writeStills EXAMPLE-FILE CORPUS-FOLDER\n";
    return 2;
  }
  write(argv[1], oxmv::test::exampleStill());
  for (const auto& [name, content] : oxmv::test::namedStills())
    write(std::filesystem::path(argv[2]) / name, content);
  return 0;
} catch (const std::exception& error) {
  std::cerr << "writeStills: " << error.what() << '\n';
  return 1;
}
