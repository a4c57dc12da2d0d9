// XML documents: a walk through one, told event by event.

#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

namespace oxmv {

// Elements nested deeper than this only hostile input has; what is open takes memory.
constexpr std::size_t maxXmlDepth = 4096;

// Entities of a document, parameter entities among them, whose text refers to entities. Each may
// stand in the next, and their expansion takes stack for each.
constexpr std::size_t maxXmlNestedEntities = 16;

// Attributes that a document declares. The parser goes through those of an element's name each time
// that such an element begins, so many declarations and many elements would take the product of
// both.
constexpr std::size_t maxXmlDeclaredAttributes = 64;

// Bytes that the parser may hold on its way through a document of `size` bytes. Without entities it
// takes at most 28 times the document, where each element has a name of its own (measured with release
// 2.5); they can make a text of a hundred times the document.
constexpr std::uint64_t maxXmlMemory(std::size_t size) {
  constexpr std::uint64_t mebi = 1 << 20;
  return std::min(64 * mebi + 64 * std::uint64_t{size}, 1024 * mebi);
}

// Hears what a document holds, in its order. Texts are UTF-8, with line ends as single line feeds;
// they are valid during the call. `offset` is where in the document, in bytes, the event begins;
// within an entity, where the reference to it begins. Answering false ends the walk.
class XmlVisitor {
 public:
  virtual ~XmlVisitor() = default;

  // The encoding that the document declares; empty when it names none.
  virtual bool onDeclaration(std::string_view /*encoding*/) { return true; }
  virtual bool onDoctype() { return true; }
  // Names come as they are written, prefix and all.
  virtual bool onElementStart(std::string_view /*name*/, std::size_t /*offset*/) { return true; }
  virtual bool onElementEnd() { return true; }
  // A piece of text: one text may come in many. Character references and entities are resolved, and
  // come as pieces of their own.
  virtual bool onText(std::string_view /*piece*/, std::size_t /*offset*/) { return true; }
  // A CDATA section; its text comes between the two.
  virtual bool onCdataStart(std::size_t /*offset*/) { return true; }
  virtual bool onCdataEnd() { return true; }
  virtual bool onComment(std::string_view /*text*/, std::size_t /*offset*/) { return true; }
  virtual bool onProcessingInstruction(std::string_view /*data*/, std::size_t /*offset*/) {
    return true;
  }

 protected:
  XmlVisitor() = default;
  XmlVisitor(const XmlVisitor&) = default;
  XmlVisitor& operator=(const XmlVisitor&) = default;
};

// How a walk ended.
struct XmlEnd {
  enum class Kind {
    wellFormed,  // with the document, which is well-formed
    malformed,   // it is not, or passes one of the limits
    stopped,     // the visitor had enough
  };
  Kind kind = Kind::wellFormed;
  std::size_t offset = 0;  // where, unless wellFormed
  std::string_view what;   // what is wrong in a few words, unless wellFormed or stopped
};

// Walks through a document in UTF-8, UTF-16, ISO-8859-1 or US-ASCII. A document type is accepted,
// and the entities that it defines in itself are expanded as far as they stay in proportion to the
// document. Nothing outside is ever loaded: references to it have no text. The visitor has heard of
// everything before the place where a document turns out to be malformed. What it throws reaches
// the caller.
XmlEnd walkXml(std::span<const std::uint8_t> document, XmlVisitor& visitor);

// Line and column, both from 1. Columns count characters; a tabulator is one.
struct XmlPosition {
  std::size_t line = 1;
  std::size_t column = 1;
};

// Where the bytes of a document stand for its readers. Quick as long as it is asked in ascending
// order. The document must outlive it.
class XmlPositions {
 public:
  explicit XmlPositions(std::span<const std::uint8_t> document);

  // The position of the character at an offset; past the end, the end's.
  XmlPosition of(std::size_t offset);

 private:
  std::uint32_t unitAt(std::size_t offset) const;
  bool isCounted(std::size_t offset) const;

  std::span<const std::uint8_t> document_;
  std::size_t width_;  // bytes of a code unit: 1 or 2
  bool isBigEndian_;
  bool isUtf8_;
  std::size_t next_ = 0;  // the first byte that position_ does not count
  XmlPosition position_;
};

}  // namespace oxmv
