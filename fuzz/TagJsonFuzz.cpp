// Any bytes as tag JSON, as the JSON of one value, as a tag stream and as choices of keys and
// values. What must hold for all of them:
//
// - a text is read, or refused with a code, words that can be shown, and a place that is in it;
// - a dictionary read from JSON, decoded from a stream or made by hand goes through JSON unchanged,
//   in its order; and what was written once is written the same again.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include "cli/TagJson.h"
#include "fuzz/FuzzInput.h"
#include "fuzz/Require.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/values/Characters.h"

namespace {

using namespace oxmv;
using namespace oxmv::cli;
using fuzz::FuzzInput;
using fuzz::require;

void check(const JsonError& error, std::string_view text) {
  require(!error.code.empty() && !error.message.empty() && visible(error.message) == error.message);
  require(error.line >= 1 && error.column >= 1);
  for (std::size_t line = 1; line < error.line; ++line) {
    require(text.find('\n') != std::string_view::npos);
    text.remove_prefix(text.find('\n') + 1);
  }
  require(error.column <= columns(text.substr(0, text.find('\n'))) + 1);
}

void checkRoundTrip(const Dictionary& tags) {
  const std::string json = tagJsonOf(tags);
  const auto read = readTagJson(json);
  const auto* back = std::get_if<Dictionary>(&read);
  require(back != nullptr && *back == tags && tagJsonOf(*back) == json);
}

// A value may be nested one level less than the dictionary around it.
void checkValue(std::string_view text, const std::variant<Dictionary, JsonError>& whole) {
  const auto read = readTagJsonValue("COL1", text);
  if (const auto* error = std::get_if<JsonError>(&read)) {
    check(*error, text);
    require(std::holds_alternative<JsonError>(whole) || error->code == "json-depth");
    return;
  }
  const Value& value = std::get<Value>(read);
  require(!value.isNothing());
  if (const auto* tags = std::get_if<Dictionary>(&whole)) require(value == Value(*tags));
  checkRoundTrip({{"COL1", value}});
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(data, data + size);
  const auto read = readTagJson(text);
  if (const auto* error = std::get_if<JsonError>(&read)) {
    check(*error, text);
  } else {
    checkRoundTrip(std::get<Dictionary>(read));
  }
  checkValue(text, read);

  const std::span bytes(data, size);
  checkRoundTrip(decodeStream(bytes, static_cast<std::int32_t>(size)));
  checkRoundTrip(FuzzInput(bytes, FuzzInput::Doubles::none).dictionary(3));
  return 0;
}
