// One of our operations, for a tool that counts instructions while measured() runs.
//
//   oxmv_hot_path OPERATION CORPUS COUNT     does it to COUNT different clips: "decode", "typical", 64
//   oxmv_hot_path                            lists the operations and corpora, a pair a line
//
// Everything before is prepared outside measured(), and no clip comes twice.

#include <charconv>
#include <cstdio>
#include <exception>
#include <stdexcept>
#include <string_view>

#include "Codec.h"
#include "CodecOurs.h"

// A plain name, so that a tool finds it. It has the operation to itself.
extern "C" __attribute__((noinline, visibility("default"))) void measured(
    bench::What what, const bench::Corpus& corpus) {
  bench::perform<bench::CodecOurs>(what, corpus, 0, corpus.clips.size());
}

namespace {

using namespace bench;

constexpr std::string_view corpusNames[] = {"small", "typical", "large"};

void list() {
  for (const What what : everything) {
    for (const std::string_view corpus : corpusNames)
      std::printf("%s %s\n", nameOf(what).data(), corpus.data());
  }
}

What whatOf(std::string_view name) {
  for (const What what : everything) {
    if (nameOf(what) == name) return what;
  }
  throw std::logic_error("no operation of that name");
}

int run(int argc, char** argv) {
  if (argc == 1) {
    list();
    return 0;
  }
  if (argc != 4) throw std::logic_error("wants an operation, a corpus and a count");
  const std::string_view digits = argv[3];
  std::size_t count = 0;
  std::from_chars(digits.data(), digits.data() + digits.size(), count);
  if (count == 0) throw std::logic_error("the count is a number above 0");

  const What what = whatOf(argv[1]);
  const Corpus corpus = makeCorpus(argv[2], count);
  Holding<CodecOurs>::of(corpus);
  measured(what, corpus);
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return run(argc, argv);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "oxmv_hot_path: %s\n", error.what());
    return 1;
  }
}
