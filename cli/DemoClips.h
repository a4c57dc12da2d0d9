// The examples, which the build makes part of the command.

#pragma once

#include <cstdint>
#include <span>
#include <string_view>

namespace oxmv::cli {

struct DemoClip {
  std::string_view name;  // of the file: "typical-clip.colr"
  std::string_view json;  // its tags
};

// The clips in examples/, in the order of their names. Generated; see CMakeLists.txt.
std::span<const DemoClip> demoClips() noexcept;

struct DemoLook {
  std::string_view name;  // of the file: "warm.xml"
  std::string_view xml;
};

// The look descriptions in examples/, in the order of their names. Generated, too.
std::span<const DemoLook> demoLooks() noexcept;

// The still in examples/. Generated, too.
std::span<const std::uint8_t> demoStill() noexcept;

}  // namespace oxmv::cli
