// Names chosen by somebody who wants a hash table to be slow.

#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace oxmv::test {

// Different names of 16 ASCII characters, the last no NUL, that all have one and the same std::hash
// in GNU's standard library of a 64-bit build, where that is not seeded. Elsewhere they are just
// names.
std::vector<std::string> collidingNames(std::size_t count);

}  // namespace oxmv::test
