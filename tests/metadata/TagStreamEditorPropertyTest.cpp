// What holds for every edit of every stream, tried on many.

#include <algorithm>
#include <array>
#include <cstdint>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/values/Array.h"
#include "tests/support/Printing.h"
#include "tests/support/StreamBuilder.h"
#include "tests/support/StreamParts.h"

namespace oxmv {
namespace {

using test::Bytes;
using test::bytesWithout;
using test::partsOf;
using test::StreamBuilder;

class Random {
 public:
  explicit Random(std::uint32_t seed) : engine_(seed) {}
  std::size_t below(std::size_t end) { return engine_() % end; }
  bool oneIn(std::size_t count) { return below(count) == 0; }
  template <class Items>
  const auto& one(const Items& items) {
    return items[below(items.size())];
  }

 private:
  std::mt19937 engine_;
};

constexpr auto names = std::to_array<std::string_view>({"a", "ISO", "Lens", "a name"});

std::string padded(std::string text) {
  text.resize((text.size() + 4) / 4 * 4);  // at least one NUL
  return text;
}

void addRecord(StreamBuilder& stream, Random& random, int depth);

Bytes streamOf(Random& random, int depth) {
  StreamBuilder stream;
  const std::size_t count = random.below(8);
  for (std::size_t i = 0; i < count; ++i) {
    if (i > 0 && depth == 2 && random.oneIn(8))
      stream.marker(static_cast<std::uint16_t>(random.below(20)));
    addRecord(stream, random, depth);
  }
  return stream.bytes();
}

void addRecord(StreamBuilder& stream, Random& random, int depth) {
  const auto number = static_cast<std::int32_t>(random.below(100));
  const std::string text = padded(std::string(random.below(9), 'x'));
  switch (random.below(14)) {
    case 0: stream.record("PRCS", 'L', number); break;
    case 1: stream.record("TIMC", 'c', text); break;
    case 2: stream.record("REEL", 'c', text); break;
    case 3: stream.record("TAKE", 'B', number); break;
    case 4: stream.record("WBAL", 'f', Bytes(random.oneIn(3) ? 12 : 16)); break;
    case 5: stream.record("KWRd", 'c', text); break;
    case 6: stream.record("FREE", 'c', Bytes(1 + random.below(12), 0x41)); break;
    case 7: stream.record("ZZZZ", '?', text); break;
    case 8: stream.record("TAGN", 'c', padded(std::string(random.one(names)))); break;
    case 9:
      random.oneIn(2) ? stream.record("TAGV", 'L', number) : stream.record("TAGV", 'c', text);
      break;
    case 10: stream.record("REGN", 'c', padded(std::string(random.one(names)))); break;
    case 11: stream.record("REGV", 'L', number); break;
    case 12:
      if (depth > 0)
        stream.record(random.oneIn(2) ? "COL1" : "COL2", 0, streamOf(random, depth - 1));
      break;
    default: stream.record("DTIN", 'L', number); break;
  }
}

// Cuts, flips and overlong sizes.
Bytes damaged(Bytes stream, Random& random) {
  if (stream.empty()) return stream;
  if (random.oneIn(2)) stream.resize(random.below(stream.size()) + 1);
  if (random.oneIn(2))
    stream[random.below(stream.size())] = static_cast<std::uint8_t>(random.below(256));
  return stream;
}

Dictionary loaded(const Bytes& stream) {
  if (stream.size() < 12) return {};
  return decodeStream(stream, static_cast<std::int32_t>(stream.size()));
}

enum class Operation { set, append, remove };

struct Edit {
  Operation operation;
  std::string path;
  Value value;
};

Value valueFor(const std::string& tag, Random& random) {
  const auto number = static_cast<std::int32_t>(random.below(100));
  if (tag == "TIMC" || tag == "REEL") return std::string(1 + random.below(9), 'n');
  if (tag == "WBAL") return Array::of(0.5f, 1.0f, 1.5f, 2.0f);
  if (tag == "KWRd") return Array::of("four", "eight888");
  if (tag == "FREE") return Value::data(Bytes(4 + random.below(12), 0x42));
  if (tag == "COL1" || tag == "COL2") return Dictionary{{"TAKE", number}, {"SATU", 0.5f}};
  if (tag == "TAG ") return Dictionary{{"ISO", number}, {"new", "text"}};
  return number;
}

Edit editOf(Random& random) {
  static const std::vector<std::string> tags = {"PRCS", "TIMC", "REEL", "TAKE", "WBAL", "KWRd",
                                                "FREE", "COL1", "COL2", "TAG ", "DTIN", "DTDR"};
  const std::string tag = random.one(tags);
  if (random.oneIn(6)) return {Operation::append, "KWRd", "more"};
  const Operation operation = random.oneIn(3) ? Operation::remove : Operation::set;
  if (tag == "TAG " && random.oneIn(2)) {
    return {operation, "TAG /" + std::string(random.one(names)),
            static_cast<std::int32_t>(random.below(50))};
  }
  if (tag.starts_with("COL") && random.oneIn(2)) {
    const std::string inner = random.one(tags);
    return {operation, tag + '/' + inner, valueFor(inner, random)};
  }
  return {operation, tag, valueFor(tag, random)};
}

// What the edit does to a dictionary.
Dictionary applied(Dictionary tags, const Edit& edit) {
  const std::string key = edit.path.substr(0, 4);
  if (edit.operation == Operation::remove && !tags.contains(key)) return tags;
  if (edit.path.size() > 4) {
    Dictionary inner = tags[key].dictionary();
    const std::string rest = edit.path.substr(5);
    if (key == "TAG ") {
      edit.operation == Operation::remove ? static_cast<void>(inner.remove(rest))
                                          : static_cast<void>(inner.set(rest, edit.value));
      inner.empty() ? static_cast<void>(tags.remove(key)) : static_cast<void>(tags.set(key, inner));
      return tags;
    }
    tags.set(key, applied(inner, {edit.operation, rest, edit.value}));
    return tags;
  }
  if (edit.operation == Operation::remove) {
    tags.remove(key);
  } else if (edit.operation == Operation::set) {
    tags.set(key, edit.value);
  } else {
    std::vector<Value> elements;
    for (const Value& element : tags[key].array()) elements.push_back(element);
    elements.push_back(edit.value);
    tags.set(key, Array(std::move(elements)));
  }
  return tags;
}

std::vector<Tag> namedBy(const std::string& path) {
  const std::string key = path.substr(0, 4);
  if (key == "TAG ") return {"TAGN"_tag, "TAGV"_tag};
  return {tagOf({static_cast<std::uint8_t>(key[0]), static_cast<std::uint8_t>(key[1]),
                 static_cast<std::uint8_t>(key[2]), static_cast<std::uint8_t>(key[3])})};
}

std::optional<EditError> perform(TagStreamEditor& editor, const Edit& edit) {
  switch (edit.operation) {
    case Operation::set: return editor.set(edit.path, edit.value);
    case Operation::append: return editor.append(edit.path, edit.value);
    case Operation::remove: break;
  }
  return editor.remove(edit.path);
}

// Tries the edit, and holds it to its promise. Answers whether it was made.
bool holdsFor(const Bytes& stream, const Edit& edit, int round) {
  TagStreamEditor editor(stream);
  const auto error = perform(editor, edit);
  if (error) {
    EXPECT_EQ(editor.stream(), stream) << round << ' ' << edit.path;
    return false;
  }
  const Dictionary before = loaded(stream);
  Dictionary expected = applied(before, edit);
  const Dictionary after = loaded(editor.stream());
  // Emptied, a nested stream leaves nothing behind it, unless records of tags unknown are still in
  // it.
  const std::string key = edit.path.substr(0, 4);
  if (edit.path.size() > 4 && expected[key].dictionary().empty() && !after.contains(key))
    expected.remove(key);
  EXPECT_EQ(after, expected) << round << ' ' << edit.path;
  if (stream.size() < 12) {  // no stream to those who load it, so nothing in it is named
    EXPECT_TRUE(std::search(editor.stream().begin(), editor.stream().end(), stream.begin(),
                            stream.end()) != editor.stream().end())
        << round;
    return true;
  }
  const std::vector<Tag> named = namedBy(edit.path);
  EXPECT_EQ(bytesWithout(named, partsOf(editor.stream())), bytesWithout(named, partsOf(stream)))
      << round << ' ' << edit.path;
  return true;
}

bool hasMarker(const Bytes& stream) {
  const Bytes marker = {0xBF, 0xFE};
  return std::search(stream.begin(), stream.end(), marker.begin(), marker.end()) != stream.end();
}

bool editTakesRecordsOut(const Edit& edit) {
  return edit.operation == Operation::remove || edit.path == "KWRd" || edit.path == "TAG ";
}

TEST(TagStreamEditorProperty, WholeStreamsTakeEveryEditThatMakesSense) {
  Random random(20261121);
  std::size_t made = 0;
  std::size_t held = 0;
  for (int round = 0; round < 30000 && !testing::Test::HasFailure(); ++round) {
    const Bytes stream = streamOf(random, 2);
    const Edit edit = editOf(random);
    const bool isMade = holdsFor(stream, edit, round);
    made += isMade;
    if (isMade) continue;
    TagStreamEditor editor(stream);
    const auto refusal = perform(editor, edit)->refusal;
    if (refusal == EditRefusal::absent) {
      EXPECT_EQ(edit.operation, Operation::remove) << round;
      EXPECT_EQ(applied(loaded(stream), edit), loaded(stream)) << round << ' ' << edit.path;
    } else if (hasMarker(stream) && editTakesRecordsOut(edit)) {
      // What was first is gone, and the marker behind it would be read as a tag; or two markers
      // would meet, of which readers look for one.
      EXPECT_TRUE(refusal == EditRefusal::markerFirst || refusal == EditRefusal::damagedStream)
          << round;
      ++held;
    } else {
      ADD_FAILURE() << round << ": " << codeOf(refusal) << ' ' << edit.path;
    }
  }
  EXPECT_GT(made, 20000u);
  EXPECT_LT(held, 300u);
}

TEST(TagStreamEditorProperty, DamagedStreamsAreEditedRightOrNotAtAll) {
  Random random(7);
  std::size_t made = 0;
  std::size_t refused = 0;
  for (int round = 0; round < 30000 && !testing::Test::HasFailure(); ++round) {
    const Bytes stream = damaged(streamOf(random, 2), random);
    (holdsFor(stream, editOf(random), round) ? made : refused) += 1;
  }
  EXPECT_GT(made, 5000u);
  EXPECT_GT(refused, 1000u);
}

}  // namespace
}  // namespace oxmv
