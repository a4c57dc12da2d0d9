#include "oxmv/metadata/StreamObserver.h"

#include <array>

namespace oxmv {
namespace {

struct ReasonText {
  SkipReason reason;
  std::string_view code;
  std::string_view words;
};

constexpr auto reasons = std::to_array<ReasonText>({
    {SkipReason::unknownTag, "unknown-tag", "no such tag"},
    {SkipReason::wrongSize, "wrong-size", "its size does not fit its tag"},
    {SkipReason::shortPayload, "short-payload", "too few bytes left for its number"},
    {SkipReason::emptyNested, "empty-nested", "its nested stream is empty"},
    {SkipReason::valueWithoutName, "value-without-name", "no name stands before it"},
    {SkipReason::nameWithoutValue, "name-without-value", "no value follows it"},
    {SkipReason::tooDeep, "too-deep", "its stream is nested too deep"},
    {SkipReason::incompleteRecord, "incomplete-record", "its payload passes the last byte"},
    {SkipReason::truncatedRecord, "truncated-record", "the next record passes the end"},
    {SkipReason::cutHeader, "cut-header", "too few bytes left for a record"},
    {SkipReason::cutMarker, "cut-marker", "too few bytes left for a marker"},
    {SkipReason::lengthZero, "length-zero", "the record's length wraps to 0"},
    {SkipReason::overlappingRecord, "overlapping-record", "too many bytes read twice"},
});

constexpr bool standsInOrder() {
  for (std::size_t i = 0; i < reasons.size(); ++i) {
    if (static_cast<std::size_t>(reasons[i].reason) != i) return false;
  }
  return static_cast<std::size_t>(SkipReason::overlappingRecord) + 1 == reasons.size();
}
static_assert(standsInOrder(), "every reason, in the order of the enumeration");

}  // namespace

std::string_view codeOf(SkipReason reason) noexcept {
  return reasons[static_cast<std::size_t>(reason)].code;
}

std::string_view describe(SkipReason reason) noexcept {
  return reasons[static_cast<std::size_t>(reason)].words;
}

}  // namespace oxmv
