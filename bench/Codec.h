// One format and the library that reads and writes it, measured.
//
// A codec is a structure of
//
//   name                          of the library, for people
//   comparable                    its documents own what they hold and can be edited, as ours
//   Stream                        bytes or text
//   Document                      what decoding gives
//   streamOf(dictionary)          the content in the codec's format
//   decode(stream)                the document
//   read(document, checksum)      visits every key and value
//   lookUp(document)              how many of `lookedUp` are there
//   encode(document)              a buffer of its own
//   replaceBalance(document)      WBAL becomes `newBalance`
//
// the last two only for those that can do it.

#pragma once

#include <array>
#include <map>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <benchmark/benchmark.h>

#include "Checksum.h"
#include "Corpus.h"
#include "Operation.h"

namespace bench {

// Most clips have some of them.
inline constexpr std::array<std::string_view, 8> lookedUp = {"REEL", "TIMC", "WBAL", "SATU",
                                                             "COL1", "TAG ", "KWRd", "TAKE"};

inline constexpr std::array<float, 4> newBalance = {1.15f, 1.2f, 1.05f, 1.5f};

template <class Codec>
concept Writes = requires(typename Codec::Document& document) {
  Codec::encode(document);
  Codec::replaceBalance(document);
};

// The content of one corpus in one format.
template <class Codec>
struct Holding {
  std::vector<typename Codec::Stream> streams;
  std::vector<typename Codec::Document> documents;

  static const Holding& of(const Corpus& corpus) {
    static std::map<const Corpus*, Holding> all;
    Holding& holding = all[&corpus];
    if (holding.streams.empty()) {
      for (const oxmv::Dictionary& clip : corpus.clips)
        holding.streams.push_back(Codec::streamOf(clip));
      for (const auto& stream : holding.streams) holding.documents.push_back(Codec::decode(stream));
    }
    return holding;
  }
};

// Runs `body` over `items` in turn, round and round.
template <class Items, class Body>
void overAll(const Items& items, std::size_t first, std::size_t count, Body body) {
  std::size_t i = first % items.size();
  for (; count > 0; --count) {
    body(items[i]);
    if (++i == items.size()) i = 0;
  }
}

template <class Codec>
void perform(What what, const Corpus& corpus, std::size_t first, std::size_t count) {
  const auto& [streams, documents] = Holding<Codec>::of(corpus);
  switch (what) {
    case What::decode:
      overAll(streams, first, count, [](const auto& stream) {
        auto document = Codec::decode(stream);
        benchmark::DoNotOptimize(&document);
      });
      return;
    case What::read:
      overAll(streams, first, count, [](const auto& stream) {
        const auto document = Codec::decode(stream);
        Checksum checksum;
        Codec::read(document, checksum);
        benchmark::DoNotOptimize(checksum.sum());
      });
      return;
    case What::encode:
      if constexpr (Writes<Codec>) {
        overAll(documents, first, count, [](const auto& document) {
          auto stream = Codec::encode(document);
          benchmark::DoNotOptimize(&stream);
        });
      }
      return;
    case What::edit:
      if constexpr (Writes<Codec>) {
        overAll(streams, first, count, [](const auto& stream) {
          auto document = Codec::decode(stream);
          Codec::replaceBalance(document);
          auto edited = Codec::encode(document);
          benchmark::DoNotOptimize(&edited);
        });
      }
      return;
    case What::lookUp:
      overAll(documents, first, count,
              [](const auto& document) { benchmark::DoNotOptimize(Codec::lookUp(document)); });
      return;
  }
}

// The checksum and the tags found, which are the same in every format.
struct Reading {
  std::uint64_t sum;
  std::size_t found;

  template <class Codec>
  static Reading of(const typename Codec::Document& document) {
    Checksum checksum;
    Codec::read(document, checksum);
    return {checksum.sum(), Codec::lookUp(document)};
  }

  bool operator==(const Reading&) const = default;
};

template <class Codec, class Reference>
void check(const Corpus& corpus) {
  const auto expect = [](bool holds, const char* what) {
    if (!holds) throw std::logic_error(std::string(Codec::name) + ": " + what);
  };
  const auto& expected = Holding<Reference>::of(corpus);
  const auto& holding = Holding<Codec>::of(corpus);
  for (std::size_t i = 0; i < corpus.clips.size(); ++i) {
    const Reading reading = Reading::of<Reference>(expected.documents[i]);
    auto document = Codec::decode(holding.streams[i]);
    expect(Reading::of<Codec>(document) == reading, "decodes something else");
    if constexpr (Writes<Codec>) {
      const auto decodedAgain = [](const auto& buffer) {
        return Codec::decode(typename Codec::Stream(buffer.data(), buffer.data() + buffer.size()));
      };
      const auto encoded = Codec::encode(document);
      expect(Reading::of<Codec>(decodedAgain(encoded)) == reading, "encodes something else");

      auto reference = Reference::decode(expected.streams[i]);
      Reference::replaceBalance(reference);
      Codec::replaceBalance(document);
      const auto edited = Codec::encode(document);
      const Reading editedReading = Reading::of<Codec>(decodedAgain(edited));
      expect(editedReading == Reading::of<Reference>(reference), "edits something else");
      expect(editedReading != reading, "edits nothing");
    }
  }
}

// Adds the operations of a codec, and its check against `Reference`.
template <class Codec, class Reference>
void addCodec() {
  for (const Corpus& corpus : corpora()) {
    for (const What what : everything) {
      if (!Writes<Codec> && (what == What::encode || what == What::edit)) continue;
      operations().push_back({corpus.name, nameOf(what), Codec::name, Codec::comparable,
                              corpus.clips.size(),
                              [what, &corpus](std::size_t first, std::size_t count) {
                                perform<Codec>(what, corpus, first, count);
                              }});
    }
    checks().push_back([&corpus] { check<Codec, Reference>(corpus); });
  }
}

}  // namespace bench
