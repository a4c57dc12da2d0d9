// Stands in for the fuzzer where there is none: runs a target over saved inputs.
//
//   TARGET FILE-OR-FOLDER...        folders are searched through, in the order of their names
//
// Fails when there was nothing to run: a test that lost its inputs must not pass.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <stdexcept>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size);

namespace {

namespace fs = std::filesystem;

std::vector<fs::path> filesUnder(const fs::path& start) {
  if (!fs::is_directory(start)) return {start};
  std::vector<fs::path> files;
  for (const auto& entry : fs::recursive_directory_iterator(start)) {
    if (entry.is_regular_file()) files.push_back(entry.path());
  }
  std::sort(files.begin(), files.end());
  return files;
}

void replay(const fs::path& file) {
  std::ifstream in(file, std::ios::binary);
  const std::vector<char> content{std::istreambuf_iterator<char>(in), {}};
  if (!in) throw std::runtime_error("cannot read " + file.string());

  // A copy of exactly the input's size, so that a sanitizer sees the first byte read past its end.
  const std::vector<std::uint8_t> bytes(content.begin(), content.end());
  LLVMFuzzerTestOneInput(bytes.data(), bytes.size());
}

}  // namespace

int main(int argc, char** argv) try {
  std::size_t count = 0;
  for (int i = 1; i < argc; ++i) {
    for (const fs::path& file : filesUnder(argv[i])) {
      // Said beforehand and flushed: after a crash the last line names the input.
      std::cout << file.string() << std::endl;
      replay(file);
      ++count;
    }
  }
  std::cout << count << " inputs replayed\n";
  return count > 0 ? 0 : 1;
} catch (const std::exception& error) {
  std::cerr << "replay: " << error.what() << '\n';
  return 1;
}
