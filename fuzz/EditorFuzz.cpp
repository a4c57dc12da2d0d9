// Any bytes as edits and, behind them, the stream that is edited. What must hold for all of them:
//
// - an edit that is refused says why, and changes nothing;
// - one that is made gives a stream that reads like the old one but for what the edit names, which
//   is as the edit says; and setting a value in a stream once more changes nothing;
// - every byte of every other record stays, in its order, those of markers and of trailing bytes,
//   too, and so do earlier records of the same tag;
// - what was read as a record is still read as one, and what as a marker as that;
// - an edit that leads from a dictionary that streams can carry to another one is made.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "fuzz/FuzzInput.h"
#include "fuzz/Require.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/values/LittleEndian.h"
#include "tests/support/StreamParts.h"

namespace {

using namespace oxmv;
using fuzz::FuzzInput;
using fuzz::require;
using test::bytesWithout;
using test::partsOf;
using test::StreamPart;

using Bytes = std::vector<std::uint8_t>;
using BytesView = std::span<const std::uint8_t>;

enum class Operation : std::uint8_t { set, append, remove };

struct Edit {
  Operation operation;
  std::string path;
  Value value;
  Fidelity fidelity;
  Layout layout;
};

bool isGroup(const TagRow& row) {
  return row.write == Write::tagGroup || row.write == Write::regGroup;
}

bool isRepeated(const TagRow& row) {
  return row.write == Write::integerEach || row.write == Write::textEach ||
         row.write == Write::nestedEach || row.write == Write::controlPoint;
}

Edit editFrom(FuzzInput& input) {
  constexpr Operation operations[] = {Operation::set, Operation::set, Operation::append,
                                      Operation::remove};
  Edit edit{};
  edit.operation = operations[input.below(4)];
  edit.fidelity = input.below(4) == 3 ? Fidelity::lossy : Fidelity::strict;
  edit.layout = input.below(4) == 3 ? Layout::exact : Layout::readable;
  const TagRow* row = &input.row();
  edit.path = fuzz::keyOf(*row);
  for (int depth = 0; row->write == Write::nested && input.below(2) == 1 && depth < 3; ++depth) {
    row = &input.row();
    edit.path += '/' + fuzz::keyOf(*row);
  }
  if (isGroup(*row) && input.below(2) == 1) {
    edit.path += '/' + input.text();
    edit.value = input.below(2) == 1 ? Value(input.text()) : Value(static_cast<int>(input.word(4)));
  } else if (edit.operation == Operation::append) {
    edit.value = input.elementFor(*row, 2);
  } else if (edit.operation == Operation::set) {
    edit.value = input.valueFor(*row, 2);
  }
  if (input.below(16) == 15) edit.path = input.text();
  return edit;
}

std::optional<EditError> perform(TagStreamEditor& editor, const Edit& edit) {
  switch (edit.operation) {
    case Operation::set: return editor.set(edit.path, edit.value, edit.fidelity);
    case Operation::append: return editor.append(edit.path, edit.value, edit.fidelity);
    case Operation::remove: break;
  }
  return editor.remove(edit.path);
}

Dictionary decoded(BytesView stream) {
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

// One that stands for itself; fewer than 12 bytes are not taken for a stream.
Dictionary loaded(BytesView stream) {
  return stream.size() < shortestData ? Dictionary() : decoded(stream);
}

std::string_view headOf(std::string_view path) { return path.substr(0, 4); }
std::string_view restOf(std::string_view path) { return path.substr(5); }
bool isInside(std::string_view path) { return path.size() > 4; }

void requireSameBut(std::string_view key, const Dictionary& before, const Dictionary& after) {
  Dictionary others = before;
  Dictionary othersAfter = after;
  others.remove(key);
  othersAfter.remove(key);
  require(others == othersAfter);
}

// The name in a group that is meant by the one in a path: those in "REG " end in NULs.
std::string nameIn(const Dictionary& group, std::string_view typed) {
  if (group.contains(typed)) return std::string(typed);
  for (const auto& [name, value] : group) {
    if (name.substr(0, name.find_last_not_of('\0') + 1) == typed) return std::string(name);
  }
  return std::string(typed);
}

void requireValue(const Edit& edit, std::string_view key, const Value& before, const Value& after) {
  if (edit.operation == Operation::remove) return require(after.isNothing());
  require(!after.isNothing());
  if (edit.operation == Operation::append) {
    const Array list = before.array();
    const Array longer = after.array();
    require(longer.size() == list.size() + 1);
    for (std::size_t i = 0; i < list.size(); ++i) require(longer[i] == list[i]);
    if (edit.fidelity == Fidelity::strict) require(longer[list.size()] == edit.value);
  } else if (edit.fidelity == Fidelity::strict) {
    require(after == edit.value);
  } else {
    const auto stream = encodeStream({{key, edit.value}}, edit.layout);
    require(stream && after == decoded(*stream)[key]);
  }
}

// What the edit makes of a dictionary in which `path` names what is edited.
void requireReads(const Edit& edit, std::string_view path, const Dictionary& before,
                  const Dictionary& after) {
  const std::string_view key = headOf(path);
  requireSameBut(key, before, after);
  if (!isInside(path)) return requireValue(edit, key, before[key], after[key]);
  const Dictionary inner = before[key].dictionary();
  const Dictionary innerAfter = after[key].dictionary();
  const TagRow* row = findTagRow(key);
  require(row != nullptr);
  if (!isGroup(*row)) return requireReads(edit, restOf(path), inner, innerAfter);
  if (edit.fidelity == Fidelity::lossy) return;  // the name may be another one, too
  const std::string name =
      row->write == Write::regGroup ? nameIn(inner, restOf(path)) : std::string(restOf(path));
  requireSameBut(name, inner, innerAfter);
  requireValue(edit, name, inner[name], innerAfter[name]);
}

// The bytes that no edit of the row may take, put in or change.
Bytes otherBytes(const TagRow& row, const std::vector<StreamPart>& parts) {
  if (row.write == Write::tagGroup) return bytesWithout({{"TAGN"_tag, "TAGV"_tag}}, parts);
  if (row.write == Write::regGroup) return bytesWithout({{"REGN"_tag, "REGV"_tag}}, parts);
  Bytes bytes = bytesWithout({{row.tag}}, parts);
  if (row.write == Write::controlPoint) std::erase(bytes, 0);  // with zeros a list of them ends
  return bytes;
}

// Whether it is what the edit of the row leaves: a marker, or a record of another tag.
bool isOther(const TagRow& row, const StreamPart& part) {
  if (!part.tag) return part.isMarker;
  const Tag tag = *part.tag;
  if (row.write == Write::tagGroup) return tag != "TAGN"_tag && tag != "TAGV"_tag;
  if (row.write == Write::regGroup) return tag != "REGN"_tag && tag != "REGV"_tag;
  return tag != row.tag && (row.write != Write::controlPoint || tag != Tag{});
}

// Each of those is still there, as what it was, and in its order. What trailed may be read as well.
void requireOthers(const TagRow& row, const std::vector<StreamPart>& parts,
                   const std::vector<StreamPart>& partsAfter) {
  auto after = partsAfter.begin();
  for (const StreamPart& part : parts) {
    if (!isOther(row, part)) continue;
    const auto isSame = [&](const StreamPart& other) {
      return other.tag == part.tag && other.isMarker == part.isMarker && other.bytes == part.bytes;
    };
    after = std::find_if(after, partsAfter.end(), isSame);
    require(after != partsAfter.end());
    ++after;
  }
}

std::vector<StreamPart> recordsOf(Tag tag, const std::vector<StreamPart>& parts) {
  std::vector<StreamPart> records;
  for (const StreamPart& part : parts) {
    if (part.tag == tag) records.push_back(part);
  }
  return records;
}

// The nested stream that counts: the last one that is all there and has a byte.
std::optional<BytesView> nestedIn(const std::vector<StreamPart>& records) {
  for (auto record = records.rbegin(); record != records.rend(); ++record) {
    const std::size_t size = loadLe32(record->bytes.data() + 4) & maxRecordSize;
    if (size > 0 && size <= record->there - recordHeaderSize)
      return BytesView(record->bytes).subspan(recordHeaderSize, size);
  }
  return std::nullopt;
}

// Whether a record is read that is not all there.
bool hasCutRecord(const std::vector<StreamPart>& parts) {
  return std::any_of(parts.begin(), parts.end(), [](const StreamPart& part) {
    if (!part.tag) return false;
    const std::size_t size = loadLe32(part.bytes.data() + 4) & maxRecordSize;
    return size > part.there - recordHeaderSize;
  });
}

void requireOtherBytes(const Edit& edit, std::string_view path, BytesView before, BytesView after) {
  const TagRow* row = findTagRow(headOf(path));
  require(row != nullptr);
  const auto parts = partsOf(before);
  const auto partsAfter = partsOf(after);
  // Fewer bytes have no marker in them, and are no stream to those who load it.
  if (after.size() >= shortestData) requireOthers(*row, parts, partsAfter);
  // What trails may be read as a record of the tag, without a value.
  if (hasCutRecord(parts) || hasCutRecord(partsAfter)) return;
  require(otherBytes(*row, parts) == otherBytes(*row, partsAfter));
  if (isGroup(*row) || isRepeated(*row)) return;
  if (!isInside(path) && edit.operation == Operation::remove) return;

  const auto own = recordsOf(row->tag, parts);
  const auto ownAfter = recordsOf(row->tag, partsAfter);
  require(ownAfter.size() == std::max<std::size_t>(own.size(), 1) ||
          ownAfter.size() == own.size() + 1);
  if (own.size() == ownAfter.size()) {
    std::size_t changed = 0;
    for (std::size_t i = 0; i < own.size(); ++i) changed += own[i].bytes != ownAfter[i].bytes;
    require(changed <= 1);
  }
  const auto nested = nestedIn(own);
  const auto nestedAfter = nestedIn(ownAfter);
  if (isInside(path) && nested && nestedAfter)
    requireOtherBytes(edit, restOf(path), *nested, *nestedAfter);
}

// Makes the edit and holds it to its promise. Answers whether it was made.
bool edits(Bytes& stream, const Edit& edit) {
  const Bytes before = stream;
  TagStreamEditor editor(stream, edit.layout);
  if (const auto error = perform(editor, edit)) {
    require(editor.stream() == before);
    require(!error->message.empty() && error->offset <= before.size());
    return false;
  }
  stream = editor.stream();
  requireReads(edit, edit.path, loaded(before), loaded(stream));
  if (before.size() < shortestData) {
    // No stream to those who load it, so nothing in it is named.
    require(std::search(stream.begin(), stream.end(), before.begin(), before.end()) !=
                stream.end() ||
            before.empty());
  } else {
    requireOtherBytes(edit, edit.path, before, stream);
  }
  // Beside what is set for the first time bytes become a stream that were none, with values of the
  // same tag perhaps.
  if (edit.operation == Operation::set && edit.fidelity == Fidelity::strict &&
      before.size() >= shortestData) {
    require(!perform(editor, edit));
    require(editor.stream() == stream);
  }
  return true;
}

bool canBeCarried(const Dictionary& tags) { return findLosses(tags, Layout::readable).empty(); }

// Of a stream that carries all of `tags`.
void requireSensibleEdit(const Dictionary& tags, Edit edit) {
  if (edit.path.size() != 4 || edit.operation == Operation::append || !canBeCarried(tags)) return;
  Dictionary wanted = tags;
  if (edit.operation == Operation::set) {
    wanted.set(edit.path, edit.value);
  } else if (!wanted.remove(edit.path)) {
    return;
  }
  if (!canBeCarried(wanted)) return;
  auto stream = encodeStream(tags, Layout::readable);
  edit.layout = Layout::readable;
  edit.fidelity = Fidelity::strict;
  require(stream && edits(*stream, edit));
  require(loaded(*stream) == wanted);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  FuzzInput input({data, size});
  std::vector<Edit> some;
  for (std::size_t count = 1 + input.below(3); count > 0; --count) some.push_back(editFrom(input));

  const BytesView rest = input.rest();
  Bytes stream(rest.begin(), rest.end());
  for (const Edit& edit : some) {
    edits(stream, edit);
    requireSensibleEdit(loaded(stream), edit);
  }
  const Dictionary tags = input.dictionary(2);
  for (const Edit& edit : some) requireSensibleEdit(tags, edit);
  return 0;
}
