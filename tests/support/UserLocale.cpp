// Every test program takes its user's locale, as applications do: none of our results may depend on
// it. Where the environment names one that is not there, the program stays with "C"; unless
// OXMV_TEST_LOCALE names the locale that the tests are about, in which they run or not at all.

#include <clocale>
#include <cstdlib>
#include <iostream>
#include <locale>
#include <stdexcept>
#include <string_view>

namespace {

const bool isTaken = [] {
  try {
    std::locale::global(std::locale(""));  // of the C library, too
  } catch (const std::runtime_error&) {
    // Looked at below.
  }
  const char* const wanted = std::getenv("OXMV_TEST_LOCALE");
  const std::string_view taken = std::setlocale(LC_NUMERIC, nullptr);
  if (wanted == nullptr || taken == wanted) return true;
  std::cerr << "the locale " << wanted << " is not there\n";
  std::exit(1);
}();

}  // namespace
