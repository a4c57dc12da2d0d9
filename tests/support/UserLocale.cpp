// Every test program takes its user's locale, as applications do: none of our results may depend on
// it. Where the environment names one that is not there, the program stays with "C".

#include <locale>
#include <stdexcept>

namespace {

const bool isTaken = [] {
  try {
    std::locale::global(std::locale(""));  // of the C library, too
    return true;
  } catch (const std::runtime_error&) {
    return false;
  }
}();

}  // namespace
