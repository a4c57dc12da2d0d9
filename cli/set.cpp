#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/AllowedLosses.h"
#include "cli/ClipEdit.h"
#include "cli/TagPaths.h"
#include "cli/TypedValues.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

struct Assignment {
  enum class Kind : std::uint8_t { set, append, json };
  TagPath path;
  Kind kind;
  std::string_view text;
};

Assignment assignmentFrom(std::string_view word) {
  const std::size_t equals = word.find('=');
  if (equals == std::string_view::npos)
    throw UsageError("bad-assignment",
                     fmt::format("\"{}\" assigns nothing; write TAG=VALUE", visible(word)));
  std::string_view path = word.substr(0, equals);
  auto kind = Assignment::Kind::set;
  if (path.ends_with('+')) kind = Assignment::Kind::append;
  if (path.ends_with(':')) kind = Assignment::Kind::json;
  if (kind != Assignment::Kind::set) path.remove_suffix(1);
  Assignment assignment{tagPathFrom(path), kind, word.substr(equals + 1)};
  if (kind == Assignment::Kind::append && !isAppendable(assignment.path)) {
    const std::string text = visible(assignment.path.text());
    throw UsageError("bad-assignment",
                     fmt::format("{} is no list to append to; write {}=VALUE", text, text));
  }
  return assignment;
}

// Of a path, what stands before its last part.
std::string_view folderOf(std::string_view path) {
  const std::size_t slash = path.rfind('/');
  return slash == std::string_view::npos ? std::string_view() : path.substr(0, slash);
}

// What would not read back. Of a value alone that also names what is no loss in a clip: the other
// one of a pair, which an edit does not add; too few bytes, which stand beside others; and the NULs
// behind the name of an entry in "REG ", for names are looked up without them.
std::vector<Loss> lossesOf(const TagPath& path, const Value& value, Layout layout) {
  std::vector<Loss> losses = findLosses(holding(value, path), layout);
  const std::string text = path.text();
  std::erase_if(losses, [&](const Loss& loss) {
    return loss.code == LossCode::shortStream ||
           // Around what is set there may be more in the clip.
           (loss.code == LossCode::emptyNested && loss.path != text) ||
           (loss.code == LossCode::pairAdded && folderOf(loss.path) == folderOf(text)) ||
           (loss.code == LossCode::nameGrows && path.isEntry && loss.path == text);
  });
  return losses;
}

// Numbers and lists of numbers are the tags that look at what they are given. Texts under DTAG and
// data, which nothing can be stored under by key, are edited as records nevertheless.
bool isAccepted(const TagPath& path, const Value& value) {
  const Accept rule = path.row->accept;
  const bool isTested = rule == Accept::number || rule == Accept::array;
  if (path.isEntry || !isTested || path.row->write == Write::fourCC) return true;
  return MetadataDictionary().addObject(value, path.keys.back());
}

// Where nothing would be written even if the loss were allowed.
std::string otherWay(LossCode code) {
  if (code == LossCode::regText) return "entries of \"TAG \" take texts";
  return "oxmv tags says what is stored, and how";
}

// Makes the assignments of one call, as long as none is refused.
class Assigner {
 public:
  Assigner(Call& call, ClipEdit& edit)
      : call_(call),
        edit_(edit),
        layout_(layoutOf(call.arguments)),
        allowed_(allowedLosses(call.arguments)) {}

  bool assign(const Assignment& assignment) {
    const TagPath& path = assignment.path;
    const Value old = valueAt(edit_.tags(), path);
    const auto read = assignment.kind == Assignment::Kind::json
                          ? jsonValue(path, assignment.text)
                          : typedValue(path, assignment.text, old);
    if (const auto* problem = std::get_if<ValueProblem>(&read)) {
      sayProblem(path, problem->message, problem->code);
      return false;
    }
    const Value& value = std::get<Value>(read);
    if (!isAccepted(path, value)) {
      const bool isList = path.row->accept == Accept::array;
      sayProblem(path,
                 fmt::format("takes {} {}, got {}", isList ? "an" : "a", acceptsAs(*path.row),
                             inLine(value, Extent::abbreviated)),
                 "not-accepted");
      return false;
    }
    const bool isAppended = assignment.kind == Assignment::Kind::append;
    return (!isAppended && value == old) || change(path, value, isAppended);
  }

 private:
  void sayProblem(const TagPath& path, std::string_view message, std::string_view code) {
    call_.messages.error(edit_.name(), fmt::format("{} {}", visible(path.text()), message), code,
                         Outcome::refused);
  }

  bool change(const TagPath& path, const Value& value, bool isAppended) {
    const std::vector<Loss> losses = lossesOf(path, value, layout_);
    const auto wayOutOf = [&](const Loss& loss) {
      return wayOutFor(path, value, isAppended, loss);
    };
    if (!passes(call_, edit_.name(), losses, allowed_, wayOutOf)) return false;
    // Names in "REG " always gain NULs, which are left out above.
    const bool isExact = losses.empty() && path.row->write != Write::regGroup;
    const Fidelity fidelity = isExact ? Fidelity::strict : Fidelity::lossy;
    if (const auto error = edit(edit_.editor(), path, value, isAppended, fidelity)) {
      edit_.sayRefused(path.text(), *error);
      return false;
    }
    return true;
  }

  static std::optional<EditError> edit(TagStreamEditor& editor, const TagPath& path,
                                       const Value& value, bool isAppended, Fidelity fidelity) {
    if (!isAppended) return editor.set(path.text(), value, fidelity);
    for (const Value& element : value.elements()) {
      if (auto error = editor.append(path.text(), element, fidelity)) return error;
    }
    return std::nullopt;
  }

  std::string wayOutFor(const TagPath& path, const Value& value, bool isAppended,
                        const Loss& loss) const {
    const bool isEmpty = loss.code == LossCode::textEmpty || loss.code == LossCode::listEmpty ||
                         loss.code == LossCode::emptyNested;
    if (isEmpty && isAppended) return "";
    if (isEmpty && loss.path == path.text()) return "oxmv unset removes it";
    TagStreamEditor trial = edit_.editor();
    // There are losses that leave nothing to be written.
    const bool isPossible =
        loss.avoidedBy || !edit(trial, path, value, isAppended, Fidelity::lossy);
    return isPossible ? wayOut(loss) : otherWay(loss.code);
  }

  Call& call_;
  ClipEdit& edit_;
  const Layout layout_;
  const std::vector<LossCode> allowed_;
};

void run(Call& call) {
  std::vector<Assignment> assignments;
  for (const std::string& word : call.words.subspan(1)) assignments.push_back(assignmentFrom(word));
  allowedLosses(call.arguments);  // refuses a wrong code before anything is read
  auto edit = ClipEdit::begin(call, "--create makes it");
  if (!edit) return;
  Assigner assigner(call, *edit);
  // All of them, so that everything that is wrong is said at once.
  const auto refused = std::count_if(assignments.begin(), assignments.end(),
                                     [&](const Assignment& one) { return !assigner.assign(one); });
  if (refused == 0) edit->finish();
}

constexpr auto flags =
    std::to_array({Flag::dryRun, Flag::backup, Flag::create, Flag::allow, Flag::layout});

}  // namespace

const Verb setVerb = {
    .name = "set",
    .words = "CLIP TAG=VALUE...",
    .summary = "change tags, and no other byte of the clip",
    .examples =
        "oxmv set clip.colr REEL=A002 TAKE=4\n"
        "oxmv set --dry-run clip.colr \"White balance=1,1.2,1,1.5\" LCRC=0x1A2B3C4D\n"
        "oxmv set --backup clip.colr KWRd+=day COL1/SATU=0.8 TAG/ISO=400\n"
        "oxmv set clip.colr 'COL1:={\"SATU\":0.8,\"WBAL\":[1.0,1.2,1.0,1.5]}'\n"
        "oxmv set --create 0A1B2C3D-4E5F-0607-0809-AABBCCDDEE0F/left REEL=A002\n"
        "oxmv set - REEL=A002 < clip.colr > copy.colr\n",
    .details =
        "CLIP is what it is in oxmv help show, but for @last.\n"
        "TAG=VALUE   the value as the tag has it: text as it is, a number (0x for\n"
        "            hexadecimal), numbers with commas or blanks between them, hexadecimal\n"
        "            digits for data, JSON for what holds tags; a list of texts becomes\n"
        "            that one text\n"
        "TAG+=VALUE  appends to a list, as in KWRd+=day KWRd+=night\n"
        "TAG:=JSON   the value in JSON, as show --json has it, of exactly that kind\n"
        "A TAG is its four letters or its label; one that stands in another is COL1/TAG, and\n"
        "an entry of a group TAG/NAME or REG/NAME. All assignments are made or none. A value\n"
        "that would not read back is refused with a code, and nothing is written; --allow CODE\n"
        "lets losses of that code through. NULs that fill the records of list texts and of\n"
        "names in REG are put by themselves. Hexadecimal from 0x80000000 to 0xFFFFFFFF means\n"
        "the 32 bits of a negative integer. Every other record keeps its bytes. The file is\n"
        "replaced whole, keeps its permissions, and a symbolic link stays one. CLIP - reads\n"
        "standard input and writes standard output. With --create a clip that is not there is\n"
        "made, but no folder: oxmv db init makes that. --dry-run shows old -> new.\n",
    .flags = flags,
    .fewestWords = 2,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
