// Our own path: a tag stream to a Dictionary and back.

#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "Checksum.h"
#include "Corpus.h"
#include "Operation.h"
#include "oxmv/values/Dictionary.h"

namespace bench {

struct CodecOurs {
  static constexpr std::string_view name = ours;
  static constexpr bool comparable = true;
  using Stream = Bytes;
  using Document = oxmv::Dictionary;

  static Stream streamOf(const oxmv::Dictionary& content);
  static Document decode(const Stream& stream);
  static void read(const Document& document, Checksum& checksum);
  static std::size_t lookUp(const Document& document);
  static Bytes encode(const Document& document);
  static void replaceBalance(Document& document);
};

// Each adds the operations of one codec.
void addOurs();
void addFloors();
void addMsgpack();
void addNlohmann();
void addProtobuf();
void addRapidJson();
void addSimdjson();

}  // namespace bench
