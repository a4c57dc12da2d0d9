// The example clips, which the build makes part of the command.

#pragma once

#include <span>
#include <string_view>

namespace oxmv::cli {

struct DemoClip {
  std::string_view name;  // of the file: "typical-clip.colr"
  std::string_view json;  // its tags
};

// The clips in examples/, in the order of their names. Generated; see CMakeLists.txt.
std::span<const DemoClip> demoClips() noexcept;

}  // namespace oxmv::cli
