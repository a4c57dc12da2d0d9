// Any bytes as a path template, as the name of a clip's file, and as choices of conversions and of
// settings. What must hold for all of them:
//
// - conversions add digits, signs and blanks, and the texts that they are given: no slash, no dot
//   and no NUL of their own, so that no path leaves the folder that its template and texts name;
//   nor does it get longer than all of them with the widest padding;
// - a text with its percent signs doubled comes out as it was;
// - a number is written as printf writes it, and a text is padded to its width;
// - the built-in templates give the name of a clip's file in the folder of the database, whatever
//   that is, and that name is the clip's again; no other name is taken for one.

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <span>
#include <string>
#include <string_view>

#include "fuzz/FuzzInput.h"
#include "fuzz/Require.h"
#include "oxmv/store/ClipFileName.h"
#include "oxmv/store/Locations.h"
#include "oxmv/store/PathTemplate.h"
#include "oxmv/values/Text.h"
#include "tests/support/FakeHost.h"

namespace {

using namespace oxmv;
using fuzz::FuzzInput;
using fuzz::require;

void checkTemplate(const std::string& pathTemplate) {
  constexpr std::string_view text = "Looks";
  constexpr std::array<PathArgument, 4> arguments = {text, 0x2Au, 0xFFFFFFFEu, text};
  const std::string path = formatPath(pathTemplate, arguments);
  for (const char c : {'/', '.', '\0'})
    require(std::count(path.begin(), path.end(), c) <=
            std::count(pathTemplate.begin(), pathTemplate.end(), c));
  require(std::count(path.begin(), path.end(), '/') ==
          std::count(pathTemplate.begin(), pathTemplate.end(), '/'));
  // The shortest conversion has two characters.
  require(path.size() <= pathTemplate.size() + pathTemplate.size() / 2 * widestConversion);

  std::string doubled;
  for (const char c : pathTemplate) doubled += c == '%' ? std::string("%%") : std::string(1, c);
  require(formatPath(doubled, arguments) == pathTemplate);
}

void checkNumber(FuzzInput& input) {
  std::string conversion = "%";
  for (const char flag : {'-', '0', '+', ' ', '#'}) {
    if (input.below(4) == 3) conversion += flag;
  }
  if (const std::size_t width = input.below(256); width > 0) conversion += std::to_string(width);
  conversion += "diuxX"[input.below(5)];
  const auto number = static_cast<std::uint32_t>(input.word(4));
  const std::array<PathArgument, 1> argument = {number};
  std::array<char, 512> expected{};
  // printf leaves open what some flags mean to some kinds; what those give is our own.
  const bool isSigned = conversion.back() == 'd' || conversion.back() == 'i';
  const bool isPrefixed = conversion.find('#') != std::string::npos;
  if (isPrefixed && (isSigned || conversion.back() == 'u')) return;
  if (isSigned) {
    std::snprintf(expected.data(), expected.size(), conversion.c_str(), static_cast<int>(number));
  } else {
    std::snprintf(expected.data(), expected.size(), conversion.c_str(), number);
  }
  require(formatPath(conversion, argument) == expected.data());
}

void checkText(FuzzInput& input) {
  std::string text = input.text();
  if (!isUtf8(text)) text = utf8FromLatin1(text);
  const std::size_t width = input.below(256);
  const bool isLeft = input.below(2) == 1;
  const std::array<PathArgument, 1> argument = {text};
  const std::string padded =
      formatPath((isLeft ? "%-" : "%") + (width > 0 ? std::to_string(width) : "") + '@', argument);
  require(utf16Length(padded) == std::max(width, utf16Length(text)));
  const std::string blanks(padded.size() - text.size(), ' ');
  require(padded == (isLeft ? text + blanks : blanks + text));
}

void checkClip(FuzzInput& input) {
  static const test::InstalledFakeHost host;
  host->questions.clear();
  const std::string luts = Value(input.text()).text();
  const std::string database = Value(input.text()).text();
  host->preferences[std::string("clips")] = {{"LUTsPath", luts}, {"CurrentDBPath", database}};

  myGUID guid;
  guid.Data1 = static_cast<std::uint32_t>(input.word(4));
  guid.Data2 = static_cast<std::uint16_t>(input.word(2));
  guid.Data3 = static_cast<std::uint16_t>(input.word(2));
  for (std::uint8_t& byte : guid.Data4) byte = static_cast<std::uint8_t>(input.below(256));
  const std::size_t eye = static_cast<std::size_t>(input.word(4)) % (ClipFileName::lastEye + 1);
  const std::string folder = luts + '/' + database + '/';
  require(databaseFolderPath("clips") + '/' == folder);
  for (const ClipFileName& name : {ClipFileName{guid, std::nullopt}, ClipFileName{guid, eye}}) {
    const std::string path =
        name.eye ? eyeFilePath(guid, eye, "clips") : clipFilePath(guid, "clips");
    require(path == folder + name.text());
    require(ClipFileName::from(std::string_view(path).substr(folder.size())) == name);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(data, data + size);
  checkTemplate(text);
  if (const auto name = ClipFileName::from(text)) require(name->text() == text);

  FuzzInput input({data, size});
  checkNumber(input);
  checkText(input);
  checkClip(input);
  return 0;
}
