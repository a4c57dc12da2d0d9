#include "cli/Run.h"

#include <algorithm>
#include <initializer_list>
#include <memory>
#include <new>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include <fmt/format.h>

#include "cli/Verb.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view introduction =
    "oxmv shows, changes, checks and makes the metadata tags of clips.\n"
    "\n"
    "  oxmv show CLIP                    the tags, with their labels\n"
    "  oxmv set CLIP REEL=A002           a tag changed, and no other byte\n"
    "  oxmv check CLIP...                what is wrong with them, if anything\n"
    "Help: oxmv help, oxmv help VERB\n";

int exitCode(Outcome outcome) { return static_cast<int>(outcome); }

void refuseTogether(const Arguments& arguments, std::initializer_list<Flag> flags) {
  std::vector<std::string_view> given;
  for (const Flag flag : flags) {
    if (arguments.has(flag)) given.push_back(rowOf(flag).name);
  }
  if (given.size() > 1)
    throw UsageError("bad-flags", fmt::format("{} do not go together", fmt::join(given, " and ")));
}

void checkFlags(const Verb& verb, const Arguments& arguments) {
  for (const FlagRow& row : flagRows()) {
    const auto takes = [&](std::span<const Flag> flags) {
      return std::find(flags.begin(), flags.end(), row.flag) != flags.end();
    };
    if (arguments.has(row.flag) && !takes(verb.flags) && !takes(commonFlags))
      throw UsageError("bad-flags", fmt::format("{} takes no {}; see oxmv help {}", verb.name,
                                                row.name, verb.name));
  }
  refuseTogether(arguments, {Flag::quiet, Flag::verbose});
  refuseTogether(arguments, {Flag::json, Flag::ndjson, Flag::csv});
}

void checkWords(const Verb& verb, std::size_t count) {
  if (count < verb.fewestWords)
    throw UsageError("missing-words", fmt::format("{} needs {}", verb.name, verb.words));
  if (count > verb.mostWords)
    throw UsageError("surplus-words",
                     verb.words.empty()
                         ? fmt::format("{} takes nothing behind it", verb.name)
                         : fmt::format("{} takes {}, not {} words", verb.name, verb.words, count));
}

// Lets the library ask us while this lives.
class InstalledHost {
 public:
  explicit InstalledHost(std::shared_ptr<CommandHost> host) : host_(std::move(host)) {
    installHost(host_);
  }
  InstalledHost(const InstalledHost&) = delete;
  InstalledHost& operator=(const InstalledHost&) = delete;
  ~InstalledHost() { installHost(nullptr); }

  CommandHost& host() const { return *host_; }

 private:
  std::shared_ptr<CommandHost> host_;
};

// The verb that --help and --version stand for, wherever they are.
const Verb& verbOf(const Arguments& arguments) {
  const auto& words = arguments.words();
  // "db --help" is good, a mistyped verb is not.
  const bool isFamily = !words.empty() && !familyOf(words.front()).empty();
  const bool isNamed = !words.empty() && !(isFamily && words.size() == 1);
  const Verb* verb = isNamed ? &verbNamed(words) : nullptr;
  if (arguments.has(Flag::help)) return helpVerb;
  if (arguments.has(Flag::version)) return versionVerb;
  if (isFamily) return verbNamed(words);  // says what is missing
  if (verb == nullptr) throw UsageError("missing-verb", "these flags need a verb; see oxmv help");
  return *verb;
}

void runVerb(const Arguments& arguments, StandardOutput& output, Messages& messages) {
  const Verb& verb = verbOf(arguments);
  std::span<const std::string> words = arguments.words();
  // "show --help" is "help show"; of what else stands there nothing counts.
  if (arguments.has(Flag::help)) {
    const std::size_t most = words.empty() || familyOf(words.front()).empty() ? 1 : 2;
    words = words.first(std::min(words.size(), most));
  } else if (arguments.has(Flag::version)) {
    words = {};
  } else {
    words = words.subspan(verb.wordsInName());
    checkFlags(verb, arguments);
    checkWords(verb, words.size());
  }
  const InstalledHost installed(std::make_shared<CommandHost>(arguments, messages));
  Call call{words,    arguments,       output, styleFor(StandardOutput::isTerminal(), arguments),
            messages, installed.host()};
  verb.run(call);
}

int runArguments(std::span<const char* const> argv, StandardOutput& output) {
  const Arguments arguments = Arguments::parse(argv);
  Messages messages(output, arguments);
  try {
    if (argv.size() <= 1) {
      output.write(introduction);
    } else {
      runVerb(arguments, output, messages);
    }
    output.flush();
  } catch (const OutputFailed& failure) {
    // Whoever closed the pipe has seen enough, and needs no message.
    messages.raise(Outcome::failed);
    if (failure.error != std::errc::broken_pipe)
      messages.error("standard output", failure.error.message(), "write-failed");
  }
  return exitCode(messages.outcome());
}

int fail(Outcome outcome, std::string_view what, std::string_view code) {
  writeStandardError(fmt::format("oxmv: error: {} ({})\n", what, code));
  return exitCode(outcome);
}

int runOrRefuse(std::span<const char* const> argv, StandardOutput& output) {
  try {
    return runArguments(argv, output);
  } catch (const UsageError& error) {
    return fail(Outcome::usage, error.what(), error.code());
  }
}

// To say so must take no memory itself.
int failShort(Outcome outcome, std::string_view line) noexcept {
  writeStandardError(line);
  return exitCode(outcome);
}

}  // namespace

int run(std::span<const char* const> argv) {
  prepareStandardStreams();
  StandardOutput output;
  try {
    return runOrRefuse(argv, output);
  } catch (const std::bad_alloc&) {
    return failShort(Outcome::failed, "oxmv: error: not enough memory (no-memory)\n");
  } catch (...) {
    return failShort(Outcome::bug,
                     "oxmv: error: a bug in oxmv; please report what you called it with (bug)\n");
  }
}

}  // namespace oxmv::cli
