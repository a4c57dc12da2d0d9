#include "oxmv/platform/Xml.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <exception>
#include <limits>
#include <memory>
#include <new>
#include <utility>

#include <expat.h>

#include "oxmv/platform/WholeFile.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

static_assert(maxFileSize <= std::numeric_limits<int>::max(), "the parser counts in int");

struct ParserFree {
  void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
};
using Parser = std::unique_ptr<XML_ParserStruct, ParserFree>;

// What the parser of this thread holds and may hold; not every release of it has a limit of its own.
// Its functions are not told which parser they work for.
struct Memory {
  std::size_t held = 0;
  std::size_t most = 0;
  bool isShort = false;  // the system had no more
};
thread_local Memory memory;

// For the life of a parser.
class MemoryLimit {
 public:
  explicit MemoryLimit(std::uint64_t most)
      : outer_(std::exchange(memory, {.most = static_cast<std::size_t>(
                                          std::min<std::uint64_t>(most, PTRDIFF_MAX))})) {}
  MemoryLimit(const MemoryLimit&) = delete;
  MemoryLimit& operator=(const MemoryLimit&) = delete;
  ~MemoryLimit() { memory = outer_; }

 private:
  Memory outer_;
};

// Stands before each block; its size is that of both.
struct alignas(std::max_align_t) BlockHead {
  std::size_t size;
};

BlockHead* headOf(void* block) {
  return block != nullptr ? static_cast<BlockHead*>(block) - 1 : nullptr;
}

// A new block where there is none. The parser takes it for a lack of memory, too, when it may hold no
// more.
void* resize(void* block, std::size_t contentSize) {
  BlockHead* head = headOf(block);
  const std::size_t others = memory.held - (head != nullptr ? head->size : 0);
  const std::size_t mayTake = memory.most - others;
  if (mayTake < sizeof(BlockHead) || contentSize > mayTake - sizeof(BlockHead)) return nullptr;
  const std::size_t size = sizeof(BlockHead) + contentSize;
  head = static_cast<BlockHead*>(std::realloc(head, size));
  if (head == nullptr) {
    memory.isShort = true;
    return nullptr;
  }
  head->size = size;
  memory.held = others + size;
  return head + 1;
}

void release(void* block) {
  BlockHead* const head = headOf(block);
  if (head == nullptr) return;
  memory.held -= head->size;
  std::free(head);
}

constexpr XML_Memory_Handling_Suite memoryFunctions = {
    [](std::size_t size) { return resize(nullptr, size); }, &resize, &release};

std::string_view viewOf(const XML_Char* text) { return text != nullptr ? text : ""; }

// Between the parser's functions, which are C, and a visitor, which may throw.
class Walk {
 public:
  Walk(XML_Parser parser, XmlVisitor& visitor) : parser_(parser), visitor_(visitor) {
    XML_SetUserData(parser, this);
    XML_SetXmlDeclHandler(parser, &Walk::onDeclaration);
    XML_SetStartDoctypeDeclHandler(parser, &Walk::onDoctype);
    XML_SetEntityDeclHandler(parser, &Walk::onEntity);
    XML_SetAttlistDeclHandler(parser, &Walk::onAttributeDeclaration);
    XML_SetElementHandler(parser, &Walk::onElementStart, &Walk::onElementEnd);
    XML_SetCharacterDataHandler(parser, &Walk::onText);
    XML_SetCdataSectionHandler(parser, &Walk::onCdataStart, &Walk::onCdataEnd);
    XML_SetCommentHandler(parser, &Walk::onComment);
    XML_SetProcessingInstructionHandler(parser, &Walk::onProcessingInstruction);
    // No handler for external entities: none is loaded. None for unknown encodings: they are
    // errors. Parameter entities of the document itself are expanded: a parser that passes one over
    // must pass over the declarations behind it, too, and the limits would not see what it did with
    // them.
    XML_SetParamEntityParsing(parser, XML_PARAM_ENTITY_PARSING_ALWAYS);
  }
  Walk(const Walk&) = delete;
  Walk& operator=(const Walk&) = delete;

  XmlEnd run(std::span<const std::uint8_t> document) {
    const auto* const text = reinterpret_cast<const char*>(document.data());
    const XML_Status status = XML_Parse(parser_, document.empty() ? "" : text,
                                        static_cast<int>(document.size()), XML_TRUE);
    if (thrown_ != nullptr) std::rethrow_exception(thrown_);
    if (status == XML_STATUS_OK) return {};
    const XML_Error error = XML_GetErrorCode(parser_);
    if (error == XML_ERROR_NO_MEMORY && memory.isShort) throw std::bad_alloc();
    if (!objection_.empty()) return {XmlEnd::Kind::malformed, stoppedAt_, objection_};
    if (isStopped_) return {XmlEnd::Kind::stopped, stoppedAt_, {}};
    if (error == XML_ERROR_NO_MEMORY) {
      return {XmlEnd::Kind::malformed, offset(), "takes too much memory"};
    }
    return {XmlEnd::Kind::malformed, offset(), viewOf(XML_ErrorString(error))};
  }

 private:
  static Walk& of(void* self) { return *static_cast<Walk*>(self); }

  // No exception may pass through the parser.
  template <class Event>
  void tell(Event event) noexcept {
    if (isStopped_) return;  // some events still come after the parser was stopped
    try {
      if (event(visitor_)) return;
    } catch (...) {
      thrown_ = std::current_exception();
    }
    stop();
  }

  void stop() {
    isStopped_ = true;
    stoppedAt_ = offset();
    XML_StopParser(parser_, XML_FALSE);
  }

  void object(std::string_view what) {
    objection_ = what;
    stop();
  }

  // What the parser calls.

  // It takes any version; XML 1.0 has "1." and digits.
  static void onDeclaration(void* self, const XML_Char* versionText, const XML_Char* encoding,
                            int) {
    const std::string_view version = viewOf(versionText);
    const bool isOne = version.size() > 2 && version.starts_with("1.") &&
                       version.find_first_not_of("0123456789", 2) == std::string_view::npos;
    if (!isOne) return of(self).object("not a version of XML 1");
    of(self).tell([&](XmlVisitor& to) { return to.onDeclaration(viewOf(encoding)); });
  }

  static void onDoctype(void* self, const XML_Char*, const XML_Char*, const XML_Char*, int) {
    of(self).tell([](XmlVisitor& to) { return to.onDoctype(); });
  }

  static void onEntity(void* self, const XML_Char*, int, const XML_Char* text, int length,
                       const XML_Char*, const XML_Char*, const XML_Char*, const XML_Char*) {
    const std::string_view value(text, text != nullptr ? static_cast<std::size_t>(length) : 0);
    if (value.find_first_of("&%") == std::string_view::npos) return;
    if (++of(self).nestedEntities_ > maxXmlNestedEntities)
      of(self).object("too many entities within entities");
  }

  static void onAttributeDeclaration(void* self, const XML_Char*, const XML_Char*, const XML_Char*,
                                     const XML_Char*, int) {
    if (++of(self).declaredAttributes_ > maxXmlDeclaredAttributes)
      of(self).object("too many attributes declared");
  }

  static void onElementStart(void* self, const XML_Char* name, const XML_Char**) {
    if (++of(self).depth_ > maxXmlDepth) return of(self).object("elements nested too deep");
    const std::size_t offset = of(self).offset();
    of(self).tell([&](XmlVisitor& to) { return to.onElementStart(viewOf(name), offset); });
  }

  static void onElementEnd(void* self, const XML_Char*) {
    --of(self).depth_;
    of(self).tell([](XmlVisitor& to) { return to.onElementEnd(); });
  }

  static void onText(void* self, const XML_Char* text, int length) {
    const std::string_view piece(text, static_cast<std::size_t>(length));
    const std::size_t offset = of(self).offset();
    of(self).tell([&](XmlVisitor& to) { return to.onText(piece, offset); });
  }

  static void onCdataStart(void* self) {
    const std::size_t offset = of(self).offset();
    of(self).tell([&](XmlVisitor& to) { return to.onCdataStart(offset); });
  }

  static void onCdataEnd(void* self) {
    of(self).tell([](XmlVisitor& to) { return to.onCdataEnd(); });
  }

  static void onComment(void* self, const XML_Char* text) {
    const std::size_t offset = of(self).offset();
    of(self).tell([&](XmlVisitor& to) { return to.onComment(viewOf(text), offset); });
  }

  static void onProcessingInstruction(void* self, const XML_Char*, const XML_Char* data) {
    const std::size_t offset = of(self).offset();
    of(self).tell([&](XmlVisitor& to) { return to.onProcessingInstruction(viewOf(data), offset); });
  }

  std::size_t offset() const {
    return static_cast<std::size_t>(std::max<XML_Index>(XML_GetCurrentByteIndex(parser_), 0));
  }

  XML_Parser parser_;
  XmlVisitor& visitor_;
  std::size_t depth_ = 0;
  std::size_t nestedEntities_ = 0;
  std::size_t declaredAttributes_ = 0;
  bool isStopped_ = false;
  std::size_t stoppedAt_ = 0;
  std::string_view objection_;
  std::exception_ptr thrown_;
};

}  // namespace

XmlEnd walkXml(std::span<const std::uint8_t> document, XmlVisitor& visitor) {
  if (document.size() > maxFileSize) {
    return {XmlEnd::Kind::malformed, maxFileSize, "larger than 256 MiB"};
  }
  const MemoryLimit limit(maxXmlMemory(document.size()));
  const Parser parser(XML_ParserCreate_MM(nullptr, &memoryFunctions, nullptr));
  if (parser == nullptr) throw std::bad_alloc();
  return Walk(parser.get(), visitor).run(document);
}

XmlPositions::XmlPositions(std::span<const std::uint8_t> document) : document_(document) {
  const std::uint8_t first = !document.empty() ? document[0] : 0xFF;
  const std::uint8_t second = document.size() > 1 ? document[1] : 0xFF;
  // UTF-16 has a byte order mark, or shows by the '<' that a document without one begins with.
  isBigEndian_ = first == 0 || (first == 0xFE && second == 0xFF);
  width_ = isBigEndian_ || second == 0 || (first == 0xFF && second == 0xFE) ? 2 : 1;
  // Else UTF-8, unless it cannot be: then each byte is a character.
  isUtf8_ =
      width_ == 1 && isUtf8({reinterpret_cast<const char*>(document.data()), document.size()});
}

XmlPosition XmlPositions::of(std::size_t offset) {
  const std::size_t end = std::min(offset, document_.size());
  if (end < next_) {
    next_ = 0;
    position_ = {};
  }
  for (; next_ < end; next_ += width_) {
    const std::uint32_t unit = unitAt(next_);
    const std::size_t following = next_ + width_;
    const bool isFirstOfTwo =
        unit == '\r' && following < document_.size() && unitAt(following) == '\n';
    if ((unit == '\n' || unit == '\r') && !isFirstOfTwo) {
      ++position_.line;
      position_.column = 1;
    } else if (isCounted(next_)) {
      ++position_.column;
    }
  }
  return position_;
}

std::uint32_t XmlPositions::unitAt(std::size_t offset) const {
  const std::uint32_t first = document_[offset];
  if (width_ == 1 || document_.size() - offset < 2) return first;
  const std::uint32_t second = document_[offset + 1];
  return isBigEndian_ ? first << 8 | second : second << 8 | first;
}

// Whether a character begins there, which is not the byte order mark.
bool XmlPositions::isCounted(std::size_t offset) const {
  const std::uint32_t unit = unitAt(offset);
  if (width_ == 2) return !(unit >= 0xDC00 && unit <= 0xDFFF) && !(offset == 0 && unit == 0xFEFF);
  if (!isUtf8_) return true;
  const bool isMark = offset == 0 && document_.size() >= 3 && unit == 0xEF &&
                      document_[1] == 0xBB && document_[2] == 0xBF;
  return (unit & 0xC0) != 0x80 && !isMark;
}

}  // namespace oxmv
