#include "oxmv/values/Array.h"

#include <algorithm>
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

constexpr std::size_t wordSize = 4;  // of a float or integer in a block

const std::vector<Value>& boxed(const detail::Shared& owner) {
  return static_cast<const detail::ArrayBox&>(owner).elements;
}

}  // namespace

Array::Array(std::vector<Value> elements) {
  if (elements.empty()) return;
  value_ = Value(Slot::scalar(Form::arrayBox, 0), new detail::ArrayBox(std::move(elements)));
}

std::size_t Array::size() const noexcept {
  const Slot slot = value_.slot_;
  if (value_.owner() == nullptr) return 0;
  if (slot.form() == Form::arrayBox) return boxed(*value_.owner()).size();
  if (slot.form() == Form::list) return value_.block().header(slot.body).count;
  return slot.size() / wordSize;
}

Value Array::operator[](std::size_t index) const {
  const Slot slot = value_.slot_;
  if (slot.form() == Form::arrayBox) return boxed(*value_.owner())[index];
  const detail::Block& block = value_.block();
  if (slot.form() == Form::list) return Value::in(block, block.items(slot.body)[index]);
  const std::uint32_t word = loadLe32(block.bytes(slot).data() + index * wordSize);
  const Form form = slot.form() == Form::floats ? Form::float32 : Form::integer;
  return Value::in(block, detail::Slot::scalar(form, word));
}

bool operator==(const Array& a, const Array& b) { return Value(a) == Value(b); }

}  // namespace oxmv
