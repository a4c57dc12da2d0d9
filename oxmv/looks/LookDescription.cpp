#include "oxmv/looks/LookDescription.h"

#include <algorithm>
#include <limits>

#include "oxmv/looks/LongRuns.h"
#include "oxmv/platform/Unicode.h"
#include "oxmv/platform/Xml.h"
#include "oxmv/values/Numbers.h"

namespace oxmv {

// Makes the nodes of what the walk through a document tells.
class LookDescription::Builder final : public XmlVisitor {
 public:
  Builder(LookDescription& description, std::size_t mostText)
      : to_(description), mostText_(std::min(mostText, maxFileSize)) {}

  // Why it ended the walk; empty if it did not.
  std::string_view objection() const { return objection_; }

  bool onElementStart(std::string_view name, std::size_t offset) override {
    ++depth_;
    if (depth_ == lutDepth && name == "LUT") {
      isInLut_ = true;
      return add(LookNode::Kind::lut, LookNode::Form::element, offset);
    }
    if (!isInLut_ || depth_ != nodeDepth) return true;
    return add(name == "size" ? LookNode::Kind::size : LookNode::Kind::table,
               LookNode::Form::element, offset);
  }

  bool onElementEnd() override {
    if (depth_ == lutDepth) isInLut_ = false;
    --depth_;
    isText_ = false;
    return true;
  }

  bool onText(std::string_view piece, std::size_t offset) override {
    if (!isInLut_) return true;
    // Pieces that follow each other are one node; within a section the section is the node.
    if (isChildOfLut() && !isText_ && !isCdata_) {
      if (!add(LookNode::Kind::table, LookNode::Form::text, offset)) return false;
      isText_ = true;
    }
    return append(piece, offset);
  }

  bool onCdataStart(std::size_t offset) override {
    isCdata_ = true;
    return addChild(LookNode::Form::cdata, offset, {}, offset);
  }

  bool onCdataEnd() override {
    isCdata_ = false;
    return true;
  }

  bool onComment(std::string_view text, std::size_t offset) override {
    constexpr std::size_t start = std::string_view("<!--").size();
    return addChild(LookNode::Form::comment, offset, text, offset + start);
  }

  bool onProcessingInstruction(std::string_view data, std::size_t offset) override {
    // Where the data stands is not told.
    return addChild(LookNode::Form::instruction, offset, data, to_.file_.size());
  }

 private:
  static constexpr std::size_t lutDepth = 2;  // the root has 1
  static constexpr std::size_t nodeDepth = 3;

  bool isChildOfLut() const { return isInLut_ && depth_ == lutDepth; }

  // Begins a node, and so ends a text before it. Without entities no file has as many nodes as
  // bytes.
  bool add(LookNode::Kind kind, LookNode::Form form, std::size_t offset) {
    constexpr std::size_t always = std::size_t{1} << 20;
    if (to_.nodes_.size() >= std::max(to_.file_.size(), always)) {
      objection_ = "its entities make too many nodes of it";
      return false;
    }
    to_.nodes_.push_back({static_cast<std::uint32_t>(offset), 0, 0, kind, form, false});
    isText_ = false;
    return true;
  }

  // What is no element; deeper down it is a part of one, and comments and instructions have no text
  // there.
  bool addChild(LookNode::Form form, std::size_t offset, std::string_view text,
                std::size_t textOffset) {
    if (!isChildOfLut()) return true;
    return add(LookNode::Kind::table, form, offset) && append(text, textOffset);
  }

  // Whether the piece stands there in the file, as it is.
  bool isInFile(std::string_view piece, std::size_t offset) const {
    const std::string_view file = to_.file_;
    if (offset > file.size() || piece.size() > file.size() - offset) return false;
    return piece.data() == file.data() + offset || piece == file.substr(offset, piece.size());
  }

  // Adds to the text of the last node. That is a part of the file, as long as it can be one.
  bool append(std::string_view piece, std::size_t offset) {
    if (piece.empty()) return true;
    Entry& node = to_.nodes_.back();
    const bool isFirst = node.textLength == 0;
    const bool goesOn = isFirst || (node.isInFile && offset == node.textStart + node.textLength);
    if (goesOn && isInFile(piece, offset)) {
      if (isFirst) node.textStart = static_cast<std::uint32_t>(offset);
      node.isInFile = true;
    } else {
      const std::size_t takenAlong = node.isInFile ? node.textLength : 0;
      if (to_.text_.size() + takenAlong + piece.size() > mostText_) {
        objection_ = "its nodes have too much text";
        return false;
      }
      if (isFirst || node.isInFile) takeOut(node);
      to_.text_ += piece;
    }
    node.textLength += static_cast<std::uint32_t>(piece.size());
    return true;
  }

  void takeOut(Entry& node) {
    // Room for all that may follow, unless entities make more of it: text is taken out of files
    // whose lines end in carriage returns, and then nearly all of it.
    if (to_.text_.empty()) to_.text_.reserve(to_.file_.size() - node.offset);
    const auto start = static_cast<std::uint32_t>(to_.text_.size());
    if (node.isInFile) to_.text_ += to_.file_.substr(node.textStart, node.textLength);
    node.textStart = start;
    node.isInFile = false;
  }

  LookDescription& to_;
  const std::size_t mostText_;
  std::string_view objection_;
  std::size_t depth_ = 0;
  bool isInLut_ = false;
  bool isText_ = false;   // the last node is a text that may go on
  bool isCdata_ = false;  // within a section
};

// Stands between the walk through a skeleton and the builder: puts the runs back.
//
// A document whose skeleton is well-formed, and whose runs all turn up as character data, is
// well-formed itself and has the same nodes. Everything else (runs in comments or attributes,
// documents with a type, whose entities have no place of their own, or in another encoding) ends
// the walk, or leaves runs over, and is parsed as it is.
class LookDescription::Restorer final : public XmlVisitor {
 public:
  Restorer(const Skeleton& skeleton, Builder& builder) : skeleton_(skeleton), builder_(builder) {}

  // Whether the builder has heard of the whole document.
  bool isComplete() const { return next_ == skeleton_.runs.size(); }

  bool onDeclaration(std::string_view encoding) override {
    constexpr std::string_view utf8 = "utf-8";
    return encoding.empty() ||
           std::equal(encoding.begin(), encoding.end(), utf8.begin(), utf8.end(),
                      [](char a, char b) { return (a >= 'A' && a <= 'Z' ? a + 32 : a) == b; });
  }

  bool onDoctype() override { return false; }

  bool onElementStart(std::string_view name, std::size_t offset) override {
    return builder_.onElementStart(name, restored(offset));
  }
  bool onElementEnd() override { return builder_.onElementEnd(); }

  bool onText(std::string_view piece, std::size_t offset) override {
    while (!isComplete() && skeleton_.places[next_] < offset + piece.size()) {
      const std::size_t place = skeleton_.places[next_];
      if (place < offset) return false;  // passed over
      const LongRun& run = skeleton_.runs[next_];
      if (place > offset && !builder_.onText(piece.substr(0, place - offset), restored(offset))) {
        return false;
      }
      ++next_;
      added_ += run.text.size() - 1;
      if (!putBack(run)) return false;
      piece.remove_prefix(place - offset + 1);
      offset = place + 1;
    }
    return piece.empty() || builder_.onText(piece, restored(offset));
  }

  bool onCdataStart(std::size_t offset) override { return builder_.onCdataStart(restored(offset)); }
  bool onCdataEnd() override { return builder_.onCdataEnd(); }
  bool onComment(std::string_view text, std::size_t offset) override {
    return builder_.onComment(text, restored(offset));
  }
  bool onProcessingInstruction(std::string_view data, std::size_t offset) override {
    return builder_.onProcessingInstruction(data, restored(offset));
  }

 private:
  // Tells the builder of a run as the parser would: each line end is a line feed.
  bool putBack(const LongRun& run) {
    std::string_view text = run.text;
    std::size_t offset = run.offset;
    for (std::size_t end; (end = text.find('\r')) != std::string_view::npos;) {
      if (!builder_.onText(text.substr(0, end), offset)) return false;
      if (!builder_.onText("\n", offset + end)) return false;
      end += text.substr(end).starts_with("\r\n") ? 2 : 1;
      text.remove_prefix(end);
      offset += end;
    }
    return text.empty() || builder_.onText(text, offset);
  }

  // The place in the document; right once every run before it has been put back, and if one was not
  // the whole result is dropped.
  std::size_t restored(std::size_t offset) const { return offset + added_; }

  const Skeleton& skeleton_;
  Builder& builder_;
  std::size_t next_ = 0;   // the first run not put back
  std::size_t added_ = 0;  // bytes that the document has more than the skeleton up to there
};

std::optional<LookDescription> LookDescription::parse(std::span<const std::uint8_t> file,
                                                      LookProblem* problem, LookParsing parsing,
                                                      std::size_t mostText) {
  const std::string_view text(reinterpret_cast<const char*>(file.data()), file.size());
  // In UTF-16 the bytes of a run need not be what they seem. Such a document begins with a byte
  // order mark, or has a zero in its first character.
  const bool isUtf16 = text.size() < 2 || file[0] >= 0xFE || file[0] == 0 || file[1] == 0;
  const bool isTooLarge = text.size() > maxFileSize;  // also if the rest of it is not
  if (parsing == LookParsing::quick && !isUtf16 && !isTooLarge) {
    const Skeleton skeleton = withoutLongRuns(text);
    if (!skeleton.runs.empty()) {
      LookDescription description(text);
      Builder builder(description, mostText);
      Restorer restorer(skeleton, builder);
      const std::span bytes(reinterpret_cast<const std::uint8_t*>(skeleton.text.data()),
                            skeleton.text.size());
      const XmlEnd end = walkXml(bytes, restorer);
      if (end.kind == XmlEnd::Kind::wellFormed && restorer.isComplete()) return description;
      // Else the document is parsed as it is, which also says where it is malformed.
    }
  }

  LookDescription description(text);
  Builder builder(description, mostText);
  const XmlEnd end = walkXml(file, builder);
  if (end.kind == XmlEnd::Kind::wellFormed) return description;
  if (problem != nullptr) {
    const bool isStopped = end.kind == XmlEnd::Kind::stopped;
    *problem = {end.offset, std::string(isStopped ? builder.objection() : end.what)};
  }
  return std::nullopt;
}

LookNode LookDescription::node(std::size_t index) const {
  const Entry& entry = nodes_[index];
  const std::string_view whole = entry.isInFile ? file_ : text_;
  LookNode node = {
      entry.kind, entry.form, whole.substr(entry.textStart, entry.textLength), entry.offset, {}};
  if (entry.isInFile) node.textOffset = entry.textStart;
  return node;
}

std::int32_t lookSizeFrom(std::string_view text) noexcept {
  const std::int64_t number = leadingInteger(trimmedOfPunctuation(text));
  return static_cast<std::int32_t>(std::clamp<std::int64_t>(
      number, std::numeric_limits<std::int32_t>::min(), std::numeric_limits<std::int32_t>::max()));
}

}  // namespace oxmv
