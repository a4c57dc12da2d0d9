// Editing a stream record by record.

#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Value.h"

namespace oxmv {

// Why an edit was refused. The stream is as it was.
enum class EditRefusal : std::uint8_t {
  badPath,           // no path of tags, or of a tag that cannot be edited so
  absent,            // nothing there to remove
  notStored,         // the encoder would write nothing for the value
  wouldNotReadBack,  // the value would come back changed
  tooShort,          // fewer than 12 bytes would be left, which nobody takes for a stream
  markerFirst,       // a marker would come first, where it is none
  damagedStream,  // the edit would change what readers make of the rest, or they would not find it
  tooDeep,        // a path into streams nested deeper than they are read
};

// The stable code: "damaged-stream".
std::string_view codeOf(EditRefusal refusal) noexcept;

struct EditError {
  EditRefusal refusal;
  std::string message;     // in a few words
  std::size_t offset = 0;  // in the stream: where the edit would have been made
};

// What is done with a value that a stream cannot carry as it is.
enum class Fidelity : std::uint8_t {
  strict,  // the edit is refused
  lossy,   // it is made, with what the encoder makes of the value; in pieces not even so
};

// Sets, appends and removes tags in a stream. Every byte of every record that an edit does not name
// stays as it was, in its order: unknown tags, earlier records of a tag, markers, padding, trailing
// bytes.
//
// A path names what is edited:
//
//   WBAL           a tag of the stream
//   COL1/WBAL      a tag of the stream nested in it under COL1 or COL2 (made if it is not there)
//   TAG /ISO       an entry of the group "TAG " or "REG "; all behind the '/' is its name
//
// A new record stands where the encoder would put it: PRCS, UFRM and TIMC first, then all others,
// then COL1, COL2, DTIN, DTDR, DTFI, DTFO and CTLp. A replaced one keeps its place; of several
// records of one tag it is the one that counts, the last. Setting a list or a whole group puts all
// its records where the first one stood. Records are padded to 4 bytes in both layouts, so that
// readers find what follows.
//
// After each edit the stream is decoded. An edit is made only if that gives what the stream gave
// before with nothing changed but what the edit names, and if every other record and marker is
// found again as what it was, unknown tags included; else it is refused, and the stream stays as it
// was.
class TagStreamEditor {
 public:
  // The layout in which new records are encoded.
  explicit TagStreamEditor(std::vector<std::uint8_t> stream, Layout layout = Layout::exact)
      : stream_(std::move(stream)), layout_(layout) {}

  std::optional<EditError> set(std::string_view path, const Value& value,
                               Fidelity fidelity = Fidelity::strict);
  // Adds an element to the list of a repeated tag, behind the last one.
  std::optional<EditError> append(std::string_view path, const Value& element,
                                  Fidelity fidelity = Fidelity::strict);
  // Removes all records of a tag, or of a group's entry.
  std::optional<EditError> remove(std::string_view path);

  const std::vector<std::uint8_t>& stream() const { return stream_; }

 private:
  std::vector<std::uint8_t> stream_;
  Layout layout_;
};

}  // namespace oxmv
