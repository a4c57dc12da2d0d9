#include "oxmv/platform/JpegImage.h"

#include <memory>
#include <new>
#include <string_view>

#include <turbojpeg.h>

namespace oxmv {
namespace {

struct Destroy {
  void operator()(void* decompressor) const { ::tjDestroy(decompressor); }
};

}  // namespace

bool isJpegImage(std::span<const std::uint8_t> bytes) {
  const std::unique_ptr<void, Destroy> decompressor(::tjInitDecompress());
  if (decompressor == nullptr) throw std::bad_alloc();
  // What is not set is not there: headers without an image are no error to the library. The other
  // way round it calls an error what is an image, if an unusual one: other ways to sample or to mix
  // colours than it has names for.
  int width = 0;
  int height = 0;
  int sampling = 0;
  int colours = 0;
  ::tjDecompressHeader3(decompressor.get(), bytes.data(), bytes.size(), &width, &height, &sampling,
                        &colours);
  const bool hasSize = width > 0 && height > 0;
  // Want of memory has no code of its own, only these words, which are never translated.
  const std::string_view problem = ::tjGetErrorStr2(decompressor.get());
  if (!hasSize && problem.find("Insufficient memory") != problem.npos) throw std::bad_alloc();
  return hasSize;
}

}  // namespace oxmv
