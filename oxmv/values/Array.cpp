#include "oxmv/values/Array.h"

#include <algorithm>
#include <bit>
#include <utility>

#include "oxmv/values/LittleEndian.h"

namespace oxmv {

using detail::Form;
using detail::Slot;

namespace detail {

class ArrayBox final : public Shared {
 public:
  explicit ArrayBox(std::vector<Value> values) : elements(std::move(values)) {}
  const std::vector<Value> elements;
};

}  // namespace detail

namespace {

constexpr std::size_t wordSize = 4;

}  // namespace

Array::Array(std::vector<Value> elements) {
  if (elements.empty()) return;
  value_ = Value(Slot::scalar(Form::arrayBox, 0), new detail::ArrayBox(std::move(elements)));
}

std::size_t Array::size() const noexcept {
  const Slot slot = value_.slot_;
  switch (slot.form()) {
    case Form::floats:
    case Form::integers: return slot.size() / wordSize;
    case Form::list: return value_.block().header(slot.body).count;
    case Form::arrayBox:
      return value_.owner() == nullptr
                 ? 0
                 : static_cast<const detail::ArrayBox*>(value_.owner())->elements.size();
    default: return 0;
  }
}

Value Array::operator[](std::size_t index) const {
  const Slot slot = value_.slot_;
  const auto word = [&] { return loadLe32(value_.block().bytes(slot).data() + index * wordSize); };
  switch (slot.form()) {
    case Form::floats: return Value(std::bit_cast<float>(word()));
    case Form::integers: return Value(std::bit_cast<std::int32_t>(word()));
    case Form::list: return Value::in(value_.block(), value_.block().items(slot.body)[index]);
    case Form::arrayBox:
      return static_cast<const detail::ArrayBox*>(value_.owner())->elements[index];
    default: return {};
  }
}

bool operator==(const Array& a, const Array& b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end());
}

}  // namespace oxmv
