// What the values of TOML that are neither text nor made of others look like.

#pragma once

#include <string_view>

namespace oxmv {

// Whether a text is a boolean, a number, a date or a time as TOML 1.0 writes it: true, +1_000,
// 0xFF,
// -0.5e3, nan, 1979-05-27T07:32:00.5-07:00, 1979-05-27, 07:32:00. Says nothing about ranges: the 99th
// of May looks like a date.
bool isTomlScalar(std::string_view text) noexcept;

}  // namespace oxmv
