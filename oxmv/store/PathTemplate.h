// Path templates: text with places for arguments.

#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <variant>

namespace oxmv {

// A text, or a 32-bit number.
using PathArgument = std::variant<std::string_view, std::uint32_t>;

// The widest a conversion may ask for; no file name has more characters.
constexpr int widestConversion = 255;

// The template with its conversions replaced by the arguments, the first by the first and so on:
//
//   conversion := '%' [POSITION '$'] flag* [WIDTH] length? kind  |  "%%"
//   flag       := '-' | '0' | '+' | ' ' | '#'
//   length     := 'h' | "hh" | 'l' | "ll"
//   kind       := '@' a text | 'd', 'i' signed | 'u' unsigned | 'x', 'X' hexadecimal
//
// Flags and width mean what they mean to printf; a width counts characters as UTF-16 does. A length
// is read and means nothing: the arguments know how long they are. A position, counted from 1,
// picks an argument and leaves the order of the other conversions alone.
//
// Templates come from outside (a message catalogue, a host), so nothing in them is trusted:
// whatever is no such conversion, asks for an argument that is not there or of the other kind, or
// is wider than widestConversion stands for itself, and takes no argument. Arguments left over are
// ignored.
std::string formatPath(std::string_view pathTemplate, std::span<const PathArgument> arguments);

}  // namespace oxmv
