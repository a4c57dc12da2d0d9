#include "cli/LookFindings.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <set>
#include <utility>

#include <fmt/format.h>

#include "cli/TagNames.h"
#include "cli/ValueText.h"
#include "oxmv/looks/Crc32.h"
#include "oxmv/looks/LookImport.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/values/Characters.h"
#include "oxmv/values/LittleEndian.h"
#include "oxmv/values/Text.h"

namespace oxmv::cli {
namespace {

constexpr std::string_view whiteSpace = " \t\r\n";

bool isWhiteSpace(std::string_view text) {
  return !text.empty() && text.find_first_not_of(whiteSpace) == std::string_view::npos;
}

bool isSameIgnoringCase(std::string_view one, std::string_view other) {
  return one.size() == other.size() && containsIgnoringCase(one, other);
}

std::string_view asText(std::span<const std::uint8_t> file) {
  return {reinterpret_cast<const char*>(file.data()), file.size()};
}

// A text of the user's in a message: its start, visible.
std::string quoted(std::string_view text) {
  constexpr std::size_t most = 20;
  const std::string_view start = firstCharacters(text, most);
  return fmt::format("\"{}{}\"", visible(start), start.size() < text.size() ? "..." : "");
}

// Finds elements that somebody meant to be "LUT" or "size", and that are not taken for it.
class NameJudge final : public XmlVisitor {
 public:
  explicit NameJudge(std::vector<LookFinding>& findings) : findings_(findings) {}

  // The root, if it is one of them. It may have any name where a "LUT" stands below it.
  std::optional<LookFinding> root;

  bool onElementStart(std::string_view name, std::size_t offset) override {
    ++depth_;
    const std::string_view bare = name.substr(name.rfind(':') + 1);
    if (depth_ == 2 && name == "LUT") {
      isInLut_ = true;
    } else if (!isInLut_ && isSameIgnoringCase(bare, "LUT")) {
      judgeLut(name, offset);
    } else if (isInLut_ && depth_ == 3 && name != "size" && isSameIgnoringCase(bare, "size")) {
      add("misspelt-size",
          fmt::format("<{}> is taken for a table: the size is in an element <size>, in small "
                      "letters",
                      visible(name)),
          offset);
    }
    return findings_.size() < mostLookTables;
  }

  bool onElementEnd() override {
    if (depth_ == 2) isInLut_ = false;
    --depth_;
    return true;
  }

 private:
  void judgeLut(std::string_view name, std::size_t offset) {
    const std::string shown = visible(name);
    if (depth_ == 1) {
      root = {"misplaced-lut",
              fmt::format("<{}> is the root: put another element around it, as in "
                          "<look><LUT>...</LUT></look>",
                          shown),
              offset};
    } else if (depth_ == 2) {
      add("misspelt-lut",
          fmt::format("<{}> is passed over: tables are in elements <LUT>, in capitals", shown),
          offset);
    } else {
      add("misplaced-lut",
          fmt::format("<{}> is passed over: it must stand right below the root", shown), offset);
    }
  }

  void add(std::string_view code, std::string message, std::size_t offset) {
    findings_.push_back({code, std::move(message), offset});
  }

  std::vector<LookFinding>& findings_;
  std::size_t depth_ = 0;
  bool isInLut_ = false;
};

class Lint {
 public:
  Lint(std::span<const std::uint8_t> file, std::string_view fileName)
      : file_(file), fileName_(fileName) {}

  std::vector<LookFinding> run() {
    LookProblem problem;
    const auto description = LookDescription::parse(file_, &problem);
    if (!description) {
      stop("not-well-formed",
           fmt::format("this is no well-formed XML: {}; nothing of it is imported", problem.what),
           problem.offset);
      return std::move(findings_);
    }
    if (hasTooManyTables(*description)) return std::move(findings_);
    NameJudge names(findings_);
    walkXml(file_, names);
    const bool isMisnamed =
        names.root ||
        std::any_of(findings_.begin(), findings_.end(), [](const LookFinding& finding) {
          return finding.code == "misspelt-lut" || finding.code == "misplaced-lut";
        });
    bool hasLut = false;
    judgeFileName();
    for (std::size_t i = 0; i < description->nodeCount(); ++i) {
      const LookNode node = description->node(i);
      hasLut |= node.kind == LookNode::Kind::lut;
      take(node);
    }
    endLut();
    if (!hasLut && names.root) findings_.push_back(*std::move(names.root));
    if (!hasLut && !isMisnamed)
      add("no-table", "no element <LUT> right below the root: there is nothing to import");
    if (second_)
      add("several-tables",
          fmt::format("{} tables in one description: their looks have one name; a description for "
                      "each tells them apart",
                      filled_),
          *second_);
    std::stable_sort(
        findings_.begin(), findings_.end(),
        [](const LookFinding& a, const LookFinding& b) { return a.offset < b.offset; });
    return std::move(findings_);
  }

 private:
  using Form = LookNode::Form;

  void add(std::string_view code, std::string message, std::optional<std::size_t> offset = {}) {
    findings_.push_back({code, std::move(message), offset});
  }

  void stop(std::string_view code, std::string message, std::size_t offset) {
    findings_.push_back({code, std::move(message), offset, true});
  }

  bool hasTooManyTables(const LookDescription& description) {
    if (description.nodeCount() <= mostLookTables) return false;
    stop("too-many-tables",
         fmt::format("{} elements and tables: {} are the most; divide the description",
                     description.nodeCount(), mostLookTables),
         description.node(mostLookTables).offset);
    return true;
  }

  void judgeFileName() {
    constexpr std::size_t most = 38;  // see lookNameField()
    const std::string_view name = withoutExtension(fileName_);
    if (!isAscii(name)) {
      add("name-not-ascii",
          fmt::format("the name {} is not ASCII and is not stored: menus show the look without a "
                      "name; rename the file",
                      quoted(name)));
    } else if (name.size() > most) {
      add("long-name", fmt::format("a name of {} characters is not stored, {} are the most: menus "
                                   "show the look without a name; rename the file",
                                   name.size(), most));
    }
  }

  void take(const LookNode& node) {
    switch (node.kind) {
      case LookNode::Kind::lut:
        endLut();
        lut_ = node.offset;
        size_ = 0;
        hasSize_ = false;
        hasTable_ = false;
        return;
      case LookNode::Kind::size: return takeSize(node);
      case LookNode::Kind::table: break;
    }
    hasTable_ |= !isSpace(node);
    if (size_ > maxLookSize) return;  // that is said
    if (size_ < 1) return takeBeforeSize(node);
    if (lookFileSize(size_) > bytesLeft_)
      return stop("too-much",
                  fmt::format("the tables up to here take more than {} MiB: divide the description",
                              maxImportedBytes >> 20),
                  node.offset);
    takeTable(node);
  }

  void endLut() {
    if (lut_ && !hasTable_) add("no-table", "this <LUT> has no table in it", *lut_);
    lut_.reset();
  }

  static bool isSpace(const LookNode& node) {
    return node.form == Form::text && isWhiteSpace(node.text);
  }

  void takeSize(const LookNode& node) {
    hasSize_ = true;
    size_ = lookSizeFrom(node.text);
    if (size_ > maxLookSize)
      return stop("size-too-large",
                  fmt::format("a size of {}: {} points per axis are the most", size_, maxLookSize),
                  node.offset);
    constexpr std::string_view around = " \t\r\n\"'";
    const std::size_t start = std::min(node.text.find_first_not_of(around), node.text.size());
    const std::size_t end = node.text.find_last_not_of(around) + 1;
    const std::string plain = fmt::format("{}", size_);
    if (size_ >= 1 && node.text.substr(start, std::max(start, end) - start) == plain) return;
    add("odd-size",
        fmt::format("the size {} is read as {}: write the points per axis in digits, as in "
                    "<size>{}</size>",
                    quoted(node.text), size_, size_ < 1 ? 17 : size_),
        node.offset);
  }

  // The import ends at such a table.
  void takeBeforeSize(const LookNode& node) {
    const std::string where =
        hasSize_ ? fmt::format("behind a size of {}", size_) : std::string("before its <size>");
    if (isSpace(node))
      return stop("space-before-size",
                  fmt::format("white space {} counts as a table without a size: remove it, or "
                              "import with --strip-space",
                              hasSize_ ? where : "before <size>"),
                  node.offset);
    if (node.form == Form::comment || node.form == Form::instruction)
      return stop("comment-before-size",
                  fmt::format("{} in a <LUT> counts as a table, here without a size: move it out "
                              "of the <LUT>",
                              nameOf(node.form)),
                  node.offset);
    stop(
        "table-before-size",
        fmt::format("a table {}: put <size>N</size>, N points per axis, right behind <LUT>", where),
        node.offset);
  }

  static std::string_view nameOf(Form form) {
    switch (form) {
      case Form::element: return "an element";
      case Form::text: return "a text";
      case Form::cdata: return "a CDATA section";
      case Form::comment: return "a comment";
      case Form::instruction: return "a processing instruction";
    }
    return {};
  }

  void takeTable(const LookNode& node) {
    record_.reset(size_);
    const HexTable values = record_.readTable(node.text);
    const auto table = record_.table().first(values.stored * 4);
    const std::uint32_t crc = calccrc(table.data(), static_cast<std::ptrdiff_t>(table.size()));
    const bool isNew = crcs_.insert(crc).second;
    if (isNew) bytesLeft_ -= lookFileSize(size_);

    if (isSpace(node))
      return add("space-as-table",
                 fmt::format("white space counts as a table without values, which makes {}: remove "
                             "it, or import with --strip-space",
                             lookFileNameOf(crc)),
                 node.offset);
    // What else is odd about its text is the oddity of prose.
    if (node.form == Form::comment || node.form == Form::instruction)
      return add("comment-as-table",
                 fmt::format("{} in a <LUT> counts as a table, here of {}: move it out of the "
                             "<LUT>, or the table into an element",
                             nameOf(node.form), counted(values.groups, "value")),
                 node.offset);
    if (values.groups == 0)
      return add("empty-table",
                 fmt::format("{} without hexadecimal digits is a table without values, which makes "
                             "{}: remove it",
                             nameOf(node.form), lookFileNameOf(crc)),
                 node.offset);
    ++filled_;
    if (filled_ == 2) second_ = node.offset;
    judgeText(node, values);
    judgeCount(node, values);
    judgeValues(node, table);
    if (!isNew)
      add("same-values", "these are the values of a table before, and make no look of their own",
          node.offset);
  }

  void judgeText(const LookNode& node, const HexTable& values) {
    if (values.leading > maxLeading)
      add("long-start",
          fmt::format("{} stand before the first digit, {} are the most in a table in order: "
                      "begin with the values, or import with --strip-space",
                      counted(values.leading, "character"), maxLeading),
          node.offset);
    if (!values.isAscii)
      add("not-ascii", "the table has characters in it that are not ASCII: remove them",
          node.offset);
    if (values.malformed > 0)
      add("malformed-group",
          fmt::format("{} not of eight hexadecimal digits, this one first, and read as 0: write "
                      "eight digits for each value",
                      values.malformed == 1 ? std::string("1 group is")
                                            : fmt::format("{} groups are", values.malformed)),
          place(node, values, values.firstMalformed));
  }

  void judgeCount(const LookNode& node, const HexTable& values) {
    const std::size_t needed = lookValueCount(size_);
    if (values.stored < needed)
      add("too-few-values",
          fmt::format("{}, and a size of {} takes {}: the missing {} become 0; correct the size "
                      "or the table",
                      counted(values.stored, "value"), size_, needed, needed - values.stored),
          node.offset);
    if (values.groups > values.stored)
      add("too-many-values",
          fmt::format("{}, and a size of {} takes {}: those from here on are dropped; correct the "
                      "size or the table",
                      counted(values.groups, "value"), size_, needed),
          place(node, values, values.firstSurplus));
  }

  void judgeValues(const LookNode& node, std::span<const std::uint8_t> table) {
    std::size_t count = 0;
    std::size_t first = 0;
    float value = 0;
    for (std::size_t i = 0; i < table.size(); i += 4) {
      const float number = std::bit_cast<float>(loadLe32(&table[i]));
      if (std::isfinite(number)) continue;
      if (count++ == 0) {
        first = i / 4 + 1;
        value = number;
      }
    }
    if (count == 0) return;
    add("not-finite",
        fmt::format("{} not finite, value {} first, which is {}: the bytes of each float are "
                    "written lowest first, 1.0 is 0000803F",
                    count == 1 ? std::string("1 value is") : fmt::format("{} values are", count),
                    first,
                    std::isnan(value) ? "NaN"
                    : value > 0       ? "infinite"
                                      : "-infinite"),
        node.offset);
  }

  // Where in the file a character of a table's text is; where the node is if that cannot be told.
  std::size_t place(const LookNode& node, const HexTable& values, std::size_t at) const {
    if (!values.isAscii) return node.offset;
    if (node.textOffset) return *node.textOffset + at;
    const auto start = contentOffset(file_, node);
    if (!start) return node.offset;
    // Line ends of two characters are one in the text.
    const std::string_view rest = asText(file_).substr(*start);
    std::size_t i = 0;
    for (std::size_t count = 0; i < rest.size() && count < at; ++i) {
      if (rest[i] == '<' || rest[i] == '&') return node.offset;
      count += !(rest[i] == '\r' && rest.substr(i + 1).starts_with('\n'));
    }
    return *start + i;
  }

  const std::span<const std::uint8_t> file_;
  const std::string_view fileName_;
  std::vector<LookFinding> findings_;

  std::int32_t size_ = 0;  // in force
  bool hasSize_ = false;   // the "LUT" has said one
  bool hasTable_ = false;
  std::optional<std::size_t> lut_;  // where the "LUT" at hand begins

  OXLookFileRecord record_;
  std::set<std::uint32_t> crcs_;
  std::uint64_t bytesLeft_ = maxImportedBytes;
  std::size_t filled_ = 0;  // tables with values
  std::optional<std::size_t> second_;
};

}  // namespace

std::vector<LookFinding> findingsInLook(std::span<const std::uint8_t> file,
                                        std::string_view fileName) {
  return Lint(file, fileName).run();
}

std::optional<std::size_t> contentOffset(std::span<const std::uint8_t> file, const LookNode& node) {
  const std::string_view text = asText(file);
  if (isUtf16(file) || node.offset >= text.size() || text[node.offset] == '&') return std::nullopt;
  if (node.form == LookNode::Form::text) return node.offset;
  if (node.form != LookNode::Form::element) return std::nullopt;
  // Attributes may have a '>' in them.
  char quote = 0;
  for (std::size_t i = node.offset; i < text.size(); ++i) {
    const char c = text[i];
    if (quote != 0) {
      if (c == quote) quote = 0;
    } else if (c == '"' || c == '\'') {
      quote = c;
    } else if (c == '>') {
      return text[i - 1] == '/' ? std::nullopt : std::optional(i + 1);
    }
  }
  return std::nullopt;
}

bool isUtf16(std::span<const std::uint8_t> file) noexcept {
  // It begins with a byte order mark, or has a zero in its first character.
  return file.size() >= 2 && (file[0] >= 0xFE || file[0] == 0 || file[1] == 0);
}

std::string positionText(const XmlPosition& position) {
  return fmt::format("line {}, column {}", position.line, position.column);
}

}  // namespace oxmv::cli
