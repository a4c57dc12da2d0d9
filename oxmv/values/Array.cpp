#include "oxmv/values/Array.h"

#include <algorithm>
#include <utility>

namespace oxmv {

using detail::Form;
using detail::Slot;

namespace detail {

class [[gnu::visibility("hidden")]] ArrayBox final : public Shared {
 public:
  explicit ArrayBox(std::vector<Value> values) : elements(std::move(values)) {}
  const std::vector<Value> elements;
};

}  // namespace detail

namespace {

const std::vector<Value>& boxed(const detail::Shared& owner) {
  return static_cast<const detail::ArrayBox&>(owner).elements;
}

}  // namespace

Array::Array(std::vector<Value> elements) {
  if (elements.empty()) return;
  value_ = Value(Slot::scalar(Form::arrayBox, 0), new detail::ArrayBox(std::move(elements)));
}

Array Array::ofFloats(std::span<const std::uint8_t> words) {
  const Slot slot = Slot::place(Form::floats, static_cast<std::uint32_t>(words.size()), 0);
  return Array(Value(slot, detail::Block::make(words, {}, {}, {}).detach()));
}

std::size_t Array::sizeOfValues() const noexcept {
  const Slot slot = value_.slot_;
  if (value_.owner() == nullptr) return 0;
  if (slot.form() == Form::arrayBox) return boxed(*value_.owner()).size();
  return value_.block().header(slot.body()).count;
}

void Array::borrowFromBox(Value& element, std::size_t index) const noexcept {
  element.borrow(boxed(*value_.owner())[index]);
}

bool operator==(const Array& a, const Array& b) { return Value(a) == Value(b); }

}  // namespace oxmv
