#include "oxmv/platform/Unicode.h"

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <new>

#include <utf8proc.h>

namespace oxmv {
namespace {

struct Free {
  void operator()(utf8proc_uint8_t* text) const { std::free(text); }
};

std::optional<std::string> mapped(std::string_view utf8, int options) {
  utf8proc_uint8_t* result = nullptr;
  const utf8proc_ssize_t length = utf8proc_map(
      reinterpret_cast<const utf8proc_uint8_t*>(utf8.data()),
      static_cast<utf8proc_ssize_t>(utf8.size()), &result, static_cast<utf8proc_option_t>(options));
  const std::unique_ptr<utf8proc_uint8_t, Free> owner(result);
  if (length == UTF8PROC_ERROR_NOMEM) throw std::bad_alloc();
  if (length < 0) return std::nullopt;
  return std::string(reinterpret_cast<const char*>(result), static_cast<std::size_t>(length));
}

bool isPunctuation(utf8proc_int32_t character) {
  const utf8proc_category_t category = utf8proc_category(character);
  return category >= UTF8PROC_CATEGORY_PC && category <= UTF8PROC_CATEGORY_PO;
}
// The categories stand together: Pc, Pd, Ps, Pe, Pi, Pf, Po.
static_assert(UTF8PROC_CATEGORY_PO - UTF8PROC_CATEGORY_PC == 6);

utf8proc_int32_t characterAt(std::string_view utf8, utf8proc_ssize_t& length) {
  utf8proc_int32_t character = 0;
  length = utf8proc_iterate(reinterpret_cast<const utf8proc_uint8_t*>(utf8.data()),
                            static_cast<utf8proc_ssize_t>(utf8.size()), &character);
  return length > 0 ? character : -1;
}

bool continues(char c) { return (static_cast<std::uint8_t>(c) & 0xC0) == 0x80; }

}  // namespace

std::optional<std::string> caseFolded(std::string_view utf8) {
  if (utf8.empty()) return "";
  // Decomposed first: a few characters fold to others that sort differently among the accents.
  const auto decomposed = mapped(utf8, UTF8PROC_STABLE | UTF8PROC_DECOMPOSE);
  if (!decomposed) return std::nullopt;
  return mapped(*decomposed, UTF8PROC_STABLE | UTF8PROC_COMPOSE | UTF8PROC_CASEFOLD);
}

std::string_view trimmedOfPunctuation(std::string_view utf8) noexcept {
  utf8proc_ssize_t length = 0;
  while (!utf8.empty() && isPunctuation(characterAt(utf8, length))) {
    utf8.remove_prefix(static_cast<std::size_t>(length));
  }
  while (!utf8.empty()) {
    std::size_t last = utf8.size() - 1;
    while (last > 0 && continues(utf8[last])) --last;
    if (!isPunctuation(characterAt(utf8.substr(last), length))) break;
    utf8.remove_suffix(utf8.size() - last);
  }
  return utf8;
}

}  // namespace oxmv
