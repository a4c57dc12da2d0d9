// Writes JSON as it comes: nothing is gathered first.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

#include "cli/Sink.h"

namespace oxmv::cli {

// Puts the commas; everything else is the caller's: what is begun must be ended, and every value
// in an object needs its key.
class JsonWriter {
 public:
  explicit JsonWriter(Sink& sink) : sink_(sink) {}

  void beginObject() { begin("{"); }
  void endObject() { end("}"); }
  void beginArray() { begin("["); }
  void endArray() { end("]"); }
  void key(std::string_view name);

  // Control characters and those that change the direction of writing are escaped; so is, as
  // "\xNN", a byte that is not UTF-8.
  void text(std::string_view text);
  void integer(std::int64_t number);
  void boolean(bool truth) { raw(truth ? "true" : "false"); }
  void null() { raw("null"); }
  // A number that is already in digits.
  void raw(std::string_view number);

  // Without a text, null.
  void member(std::string_view name, const std::optional<std::string_view>& text);
  void member(std::string_view name, std::size_t number);

 private:
  void begin(std::string_view bracket);
  void end(std::string_view bracket);
  void separate();
  void quoted(std::string_view text);

  Sink& sink_;
  bool needsComma_ = false;
};

}  // namespace oxmv::cli
