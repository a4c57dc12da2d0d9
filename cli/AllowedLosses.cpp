#include "cli/AllowedLosses.h"

#include <algorithm>
#include <array>
#include <string_view>

#include <fmt/format.h>

#include "cli/TagNames.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

// More lines than this hide what they say.
constexpr std::size_t lossesSaid = 20;

std::string inWords(const Loss& loss) {
  const std::string words = visible(fmt::format("{} {}", loss.path, loss.message));
  if (loss.code != LossCode::unknownTag && loss.code != LossCode::badKey) return words;
  // A key that is none of the tags is most likely a slip of the hand.
  const std::string_view key = std::string_view(loss.path).substr(loss.path.rfind('/') + 1);
  return findTagRow(key) != nullptr ? words : words + tagsMeantBy(key);
}

}  // namespace

Layout layoutOf(const Arguments& arguments) {
  constexpr auto choices = std::to_array<std::string_view>({"exact", "readable"});
  return arguments.choice(Flag::layout, choices) == 0 ? Layout::exact : Layout::readable;
}

std::vector<LossCode> allowedLosses(const Arguments& arguments) {
  std::vector<LossCode> allowed;
  for (const std::string& text : arguments.values(Flag::allow)) {
    const auto code = lossCodeOf(text);
    if (!code)
      throw UsageError("bad-value", fmt::format("--allow knows no code \"{}\"; a refusal names it",
                                                visible(text)));
    allowed.push_back(*code);
  }
  return allowed;
}

std::string wayOut(const Loss& loss) {
  if (loss.avoidedBy == Layout::readable) return "--layout readable avoids it";
  return fmt::format("--allow {} lets it through", codeOf(loss.code));
}

bool passes(Call& call, const std::string& file, const std::vector<Loss>& losses,
            const std::vector<LossCode>& allowed,
            const std::function<std::string(const Loss&)>& wayOutOf) {
  std::size_t refused = 0;
  for (const Loss& loss : losses) {
    if (std::find(allowed.begin(), allowed.end(), loss.code) != allowed.end()) {
      call.messages.warning(file, inWords(loss), codeOf(loss.code));
    } else if (++refused <= lossesSaid) {
      call.messages.refused(file, inWords(loss), codeOf(loss.code), nothingWritten(wayOutOf(loss)));
    }
  }
  if (refused > lossesSaid)
    call.messages.refused(file, fmt::format("{} losses more", refused - lossesSaid));
  return refused == 0;
}

std::string nothingWritten(const std::string& wayOut) {
  return wayOut.empty() ? "nothing written" : fmt::format("nothing written; {}", wayOut);
}

}  // namespace oxmv::cli
