#include "oxmv/values/Dictionary.h"

#include <algorithm>
#include <new>
#include <string>
#include <utility>

#include "oxmv/values/Table.h"
#include "oxmv/values/Text.h"

namespace oxmv {

using detail::Form;
using detail::Slot;

namespace {

// Places that a table has for further entries from the beginning.
constexpr std::size_t fewMore = 8;

// A key as it is kept: its own characters, or where they are not UTF-8, those of their ISO-8859-1
// reading.
class KeyText {
 public:
  explicit KeyText(std::string_view key) : text_(key) {
    if (isUtf8(key)) return;
    converted_ = utf8FromLatin1(key);
    text_ = converted_;
  }
  KeyText(const KeyText&) = delete;
  KeyText& operator=(const KeyText&) = delete;

  std::string_view text() const { return text_; }

 private:
  std::string converted_;
  std::string_view text_;
};

}  // namespace

Dictionary::Dictionary(std::initializer_list<std::pair<std::string_view, Value>> entries) {
  for (const auto& [key, value] : entries) set(key, value);
}

const detail::Table* Dictionary::table() const noexcept {
  return static_cast<const detail::Table*>(value_.owner());
}

bool Dictionary::ownsTable() const noexcept {
  return isTable() && table() != nullptr && table()->isUnique();
}

// The table to change: this dictionary's alone. Only for one that owns it.
detail::Table& Dictionary::ownTable() noexcept {
  return const_cast<detail::Table&>(*table());  // made below without const, and shared with nobody
}

// Makes a table of this dictionary's own, and answers what it had before.
Value Dictionary::renewTable(std::size_t more) {
  auto table = detail::Table::make(entriesOf(value_), more);
  return std::exchange(value_, Value(Slot::scalar(Form::dictionaryBox, 0), table.detach()));
}

// Without memory for it the table stays as it is; the next change tries again.
void Dictionary::compact() noexcept {
  if (!ownTable().isWasteful()) return;
  try {
    renewTable(fewMore);
  } catch (const std::bad_alloc&) {
  }
}

detail::HeldEntries Dictionary::entriesOf(const Value& value) noexcept {
  const Form form = value.slot_.form();
  if (form == Form::dictionary) return detail::HeldEntries::of(value.block(), value.slot_.body());
  const bool isTable = form == Form::dictionaryBox && value.owner() != nullptr;
  return isTable ? static_cast<const detail::Table*>(value.owner())->held() : detail::HeldEntries();
}

std::size_t Dictionary::size() const noexcept {
  if (isTable()) return table() == nullptr ? 0 : table()->size();
  return places();
}

std::size_t Dictionary::placesOfTable() const noexcept {
  return table() == nullptr ? 0 : table()->held().count;
}

void Dictionary::Iterator::arriveInTable() {
  const detail::HeldEntries entries = dictionary_->table()->held();
  while (place_ < end_ && entries.isVacant(place_)) ++place_;
  if (place_ == end_) return;
  entry_.key = entries.name(place_);
  entries.lend(entry_.value, place_);
}

std::optional<std::size_t> Dictionary::placeOf(std::string_view key) const {
  if (isTable()) return table() == nullptr ? std::nullopt : table()->find(key);
  if (value_.isNothing()) return std::nullopt;
  const std::uint32_t header = value_.slot_.body();
  const Slot* slot = value_.block().find(header, key);
  if (slot == nullptr) return std::nullopt;
  return static_cast<std::size_t>(slot - value_.block().items(header));
}

bool Dictionary::lend(Value& value, std::string_view key) const {
  const auto place = placeOf(key);
  if (place) entries().lend(value, *place);
  return place.has_value();
}

bool Dictionary::contains(std::string_view key) const {
  return placeOf(KeyText(key).text()).has_value();
}

Value Dictionary::operator[](std::string_view key) const {
  const KeyText wanted(key);
  if (isTable()) {
    const auto place = table() == nullptr ? std::nullopt : table()->find(wanted.text());
    return place ? table()->held().value(*place) : Value();
  }
  if (value_.isNothing()) return {};
  const Slot* slot = value_.block().find(value_.slot_.body(), wanted.text());
  return slot == nullptr ? Value() : Value::in(value_.block(), *slot);
}

bool Dictionary::set(std::string_view key, Value value) {
  if (value.isNothing()) return false;
  const KeyText wanted(key);
  Value before;  // whose own key this may be
  if (!ownsTable()) {
    before = renewTable(fewMore);
  } else if (!ownTable().hasRoom()) {
    before = renewTable(std::max(fewMore, size()));
  }
  ownTable().set(wanted.text(), std::move(value));
  compact();
  return true;
}

bool Dictionary::remove(std::string_view key) {
  const KeyText wanted(key);
  if (!placeOf(wanted.text())) return false;
  Value before;  // whose own key this may be
  if (!ownsTable()) before = renewTable(fewMore);
  ownTable().remove(*ownTable().find(wanted.text()));
  compact();
  return true;
}

bool operator==(const Dictionary& a, const Dictionary& b) { return Value(a) == Value(b); }

}  // namespace oxmv
