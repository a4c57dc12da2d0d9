#include "Corpus.h"

#include <random>
#include <stdexcept>
#include <string>
#include <utility>

#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/metadata/TagTable.h"
#include "oxmv/values/Array.h"

namespace bench {
namespace {

using namespace oxmv;

constexpr std::uint32_t seed = 20261121;

// Tags with one value: a number, a text or a few floats.
bool isPlain(const TagRow& row) {
  if (row.when == When::deferred) return false;
  switch (row.read) {
    case Read::text: return row.write == Write::text || row.write == Write::timecode;
    case Read::int32: return row.write != Write::none;
    case Read::uint8:
    case Read::uint16:
    case Read::float32:
    case Read::floats: return true;
    case Read::none:
    case Read::integers:
    case Read::data:
    case Read::guid:
    case Read::nested:
    case Read::texts:
    case Read::ints:
    case Read::nestedList:
    case Read::controlPoint:
    case Read::tagName:
    case Read::tagValue:
    case Read::regName:
    case Read::regValue: return false;
  }
  return false;
}

// Only the generator comes from the standard library: its distributions differ from one library to
// the next.
class ClipMaker {
 public:
  explicit ClipMaker(std::uint32_t from) : random_(from) {
    for (const TagRow& row : tagRows()) {
      if (isPlain(row)) rows_.push_back(&row);
    }
  }

  // `count` different tags in random order, WBAL among them, each with a random value of its kind.
  Dictionary tags(std::size_t count) {
    for (std::size_t i = rows_.size(); i > 1; --i) std::swap(rows_[i - 1], rows_[below(i)]);
    count = std::min(count, rows_.size());
    std::size_t balance = 0;
    while (rows_[balance]->tag != "WBAL"_tag) ++balance;
    if (balance >= count) std::swap(rows_[balance], rows_[below(count)]);

    Dictionary made;
    for (std::size_t i = 0; i < count; ++i) {
      const auto characters = charactersOf(rows_[i]->tag);
      made.set({characters.data(), characters.size()}, value(*rows_[i]));
    }
    return made;
  }

  Array controlPoints(std::size_t count) {
    std::vector<Value> points;
    for (std::size_t i = 0; i < count; ++i) {
      Dictionary point = tags(6);
      point.set("CTLPData", Array::of(integer(), integer()));
      points.emplace_back(point);
    }
    return Array(std::move(points));
  }

  // Of multiples of 4 characters: others come back with the zeros of their padding.
  Array keywords(std::size_t count) {
    std::vector<Value> words;
    for (std::size_t i = 0; i < count; ++i) words.emplace_back(text(4 + 4 * below(4)));
    return Array(std::move(words));
  }

  Dictionary group(std::size_t count) {
    Dictionary made;
    while (made.size() < count) made.set(text(4 + below(10)), text(1 + below(16)));
    return made;
  }

 private:
  std::size_t below(std::size_t bound) { return random_() % bound; }

  Value value(const TagRow& row) {
    switch (row.read) {
      case Read::text: return text(4 + below(20));
      case Read::uint8: return static_cast<std::int32_t>(below(256));
      case Read::uint16: return static_cast<std::int32_t>(below(65536));
      case Read::float32: return number();
      case Read::floats: {
        std::vector<Value> floats;
        for (int i = 0; i < row.count; ++i) floats.emplace_back(number());
        return Array(std::move(floats));
      }
      default: return integer();
    }
  }

  std::string text(std::size_t length) {
    std::string made;
    for (std::size_t i = 0; i < length; ++i) made += static_cast<char>('a' + below(26));
    return made;
  }

  // Of every magnitude: formats with numbers of variable length would otherwise always meet their
  // longest.
  std::int32_t integer() {
    const auto bits = static_cast<std::uint32_t>(random_());
    const int shift = static_cast<int>(below(32));
    return static_cast<std::int32_t>(bits) >> shift;
  }

  // With the few decimals of settings: the text formats would otherwise always meet nine digits.
  // Never whole: msgpack-cxx writes whole floats as integers, which would then come back as those.
  float number() { return static_cast<float>(static_cast<double>(2 * below(20000) + 1) / 10000.0); }

  std::mt19937 random_;
  std::vector<const TagRow*> rows_;
};

Dictionary small(ClipMaker& maker) { return maker.tags(12); }

Dictionary typical(ClipMaker& maker) {
  Dictionary made = maker.tags(60);
  made.set("COL1", maker.tags(20));
  made.set("TAG ", maker.group(15));
  made.set("KWRd", maker.keywords(5));
  return made;
}

Dictionary large(ClipMaker& maker) {
  Dictionary made = maker.tags(170);
  made.set("COL1", maker.tags(30));
  made.set("CTLp", maker.controlPoints(50));
  made.set("KWRd", maker.keywords(1000));
  return made;
}

Dictionary (*makerOf(std::string_view name))(ClipMaker&) {
  if (name == "small") return small;
  if (name == "typical") return typical;
  if (name == "large") return large;
  throw std::logic_error("no corpus of that name: " + std::string(name));
}

}  // namespace

Corpus makeCorpus(std::string_view name, std::size_t count) {
  const auto make = makerOf(name);
  ClipMaker maker(seed);
  Corpus corpus{name, {}, {}, 0};
  double total = 0;
  for (std::size_t i = 0; i < count; ++i) {
    const Dictionary made = make(maker);
    Bytes stream = encodeStream(made).value();
    Dictionary clip = decodeStream(stream, static_cast<std::int32_t>(stream.size()));
    if (clip != made) throw std::logic_error("a clip changes on its way through a stream");
    total += static_cast<double>(stream.size());
    corpus.streams.push_back(std::move(stream));
    corpus.clips.push_back(std::move(clip));
  }
  corpus.meanStreamSize = total / static_cast<double>(count);
  return corpus;
}

std::span<const Corpus> corpora() {
  static const std::vector<Corpus> made = {makeCorpus("small", 2048), makeCorpus("typical", 2048),
                                           makeCorpus("large", 128)};
  return made;
}

Dictionary clipOf(std::uint32_t from, std::size_t tagCount, std::size_t keywords,
                  std::size_t controlPoints) {
  ClipMaker maker(from);
  Dictionary made = maker.tags(tagCount);
  if (keywords > 0) made.set("KWRd", maker.keywords(keywords));
  if (controlPoints > 0) made.set("CTLp", maker.controlPoints(controlPoints));
  return made;
}

}  // namespace bench
