#include "oxmv/platform/Exif.h"

#include <algorithm>
#include <bit>
#include <cstdlib>
#include <memory>
#include <new>
#include <string_view>

#include <libexif/exif-data.h>

#include "oxmv/platform/ExifDirectories.h"
#include "oxmv/values/Text.h"

namespace oxmv {
namespace {

struct Unref {
  void operator()(ExifData* data) const { ::exif_data_unref(data); }
  void operator()(ExifMem* memory) const { ::exif_mem_unref(memory); }
};

// Where the library gets no memory it leaves out what it wanted that for, and says nothing. So
// those it asks remember whether they had none.
thread_local bool isMemoryShort = false;

void* remembering(void* memory) {
  if (memory == nullptr) isMemoryShort = true;
  return memory;
}

// Throws std::bad_alloc.
std::unique_ptr<ExifData, Unref> load(std::span<const std::uint8_t> segment) {
  isMemoryShort = false;
  const std::unique_ptr<ExifMem, Unref> memory(
      ::exif_mem_new([](ExifLong size) { return remembering(std::calloc(size, 1)); },
                     [](void* old, ExifLong size) { return remembering(std::realloc(old, size)); },
                     [](void* old) { std::free(old); }));
  if (memory == nullptr) throw std::bad_alloc();
  std::unique_ptr<ExifData, Unref> data(::exif_data_new_mem(memory.get()));
  if (data == nullptr) throw std::bad_alloc();
  // A segment is shorter than 64 KiB; of more bytes the library would not look at the rest either.
  constexpr std::size_t most = 0xFFFF;
  ::exif_data_load_data(data.get(), segment.data(),
                        static_cast<unsigned>(std::min(segment.size(), most)));
  if (isMemoryShort) throw std::bad_alloc();
  return data;
}

template <class Fraction>
std::optional<double> quotient(const Fraction& fraction) {
  if (fraction.denominator == 0) return std::nullopt;
  return static_cast<double>(fraction.numerator) / fraction.denominator;
}

double asFloat(const unsigned char* bytes, ExifByteOrder order) {
  return std::bit_cast<float>(std::uint32_t{::exif_get_long(bytes, order)});
}

double asDouble(const unsigned char* bytes, ExifByteOrder order) {
  std::uint64_t high = ::exif_get_long(bytes, order);
  std::uint64_t low = ::exif_get_long(bytes + 4, order);
  if (order == EXIF_BYTE_ORDER_INTEL) std::swap(high, low);
  return std::bit_cast<double>(high << 32 | low);
}

// Null if there is none.
const ExifEntry* find(const ExifData& data, ExifIfd directory, ExifTagNumber tag) {
  const ExifEntry* entry = ::exif_content_get_entry(data.ifd[directory], static_cast<ExifTag>(tag));
  return entry == nullptr || entry->data == nullptr ? nullptr : entry;
}

std::optional<double> numberOf(const ExifEntry* entry, ExifByteOrder order) {
  if (entry == nullptr || entry->components != 1) return std::nullopt;
  if (entry->size < ::exif_format_get_size(entry->format)) return std::nullopt;
  const unsigned char* bytes = entry->data;
  switch (entry->format) {
    case EXIF_FORMAT_BYTE: return bytes[0];
    case EXIF_FORMAT_SBYTE: return static_cast<std::int8_t>(bytes[0]);
    case EXIF_FORMAT_SHORT: return ::exif_get_short(bytes, order);
    case EXIF_FORMAT_SSHORT: return ::exif_get_sshort(bytes, order);
    case EXIF_FORMAT_LONG: return ::exif_get_long(bytes, order);
    case EXIF_FORMAT_SLONG: return ::exif_get_slong(bytes, order);
    case EXIF_FORMAT_RATIONAL: return quotient(::exif_get_rational(bytes, order));
    case EXIF_FORMAT_SRATIONAL: return quotient(::exif_get_srational(bytes, order));
    case EXIF_FORMAT_FLOAT: return asFloat(bytes, order);
    case EXIF_FORMAT_DOUBLE: return asDouble(bytes, order);
    case EXIF_FORMAT_ASCII:
    case EXIF_FORMAT_UNDEFINED: break;
  }
  return std::nullopt;
}

std::optional<std::string> textOf(const ExifEntry* entry) {
  if (entry == nullptr || entry->format != EXIF_FORMAT_ASCII) return std::nullopt;
  const std::string_view bytes(reinterpret_cast<const char*>(entry->data), entry->size);
  const std::string_view text = bytes.substr(0, bytes.find('\0'));
  return isUtf8(text) ? std::string(text) : utf8FromLatin1(text);
}

}  // namespace

ExifProperties readExif(std::span<const std::uint8_t> segment) {
  const auto reduced = reducedExif(segment);
  if (!reduced) return {};
  const auto data = load(*reduced);
  const ExifByteOrder order = ::exif_data_get_byte_order(data.get());
  return {
      .focalLength = numberOf(find(*data, EXIF_IFD_EXIF, ExifTagNumber::focalLength), order),
      .software = textOf(find(*data, EXIF_IFD_0, ExifTagNumber::software)),
      .model = textOf(find(*data, EXIF_IFD_0, ExifTagNumber::model)),
  };
}

}  // namespace oxmv
