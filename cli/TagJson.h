// Tags as JSON: what `show --json` writes and `encode` reads.
//
//   {"REEL":"A001",  "TAKE":2,  "SATU":1.1,        -- text, integer, float
//    "WBAL":[1.0,1.2,1.05,1.5],                    -- array
//    "FREE":{"$data":"00ff"},                      -- data
//    "ZOOM":{"$float":"0x7fc00000"},               -- float that is not finite, by its bits
//    "COL1":{"SATU":0.8},                          -- dictionary
//    "TAG ":{"$$data":"a name with a $"}}
//
// A number with `.` or `e` is a float, any other an integer. Texts are always texts. true, false
// and null have no place in a dictionary.

#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <variant>

#include "cli/JsonWriter.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"

namespace oxmv::cli {

// Why a text is no tag JSON, and where: at that character of that line, both counted from 1.
struct JsonError {
  std::string_view code;  // stable: "json-duplicate"
  std::string message;
  std::size_t line;
  std::size_t column;
};

// Refuses, beside what is no JSON: anything but an object outside, members of the same name, a
// number out of range, and more levels than a stream can have (a dictionary is a level, and so is
// an array within an array; a group stands on the level of its dictionary).
std::variant<Dictionary, JsonError> readTagJson(std::string_view text);

// The same for the value of one member of an object, of that name.
std::variant<Value, JsonError> readTagJsonValue(std::string_view name, std::string_view text);

void writeTagJson(JsonWriter& json, const Value& value);
std::string tagJsonOf(const Value& value);

// The digits of a number as tag JSON has them: the fewest that give the same number, and never
// without `.` or `e` for a float. Not for numbers that are not finite.
std::string digitsOf(float number);
std::string digitsOf(double number);

}  // namespace oxmv::cli
