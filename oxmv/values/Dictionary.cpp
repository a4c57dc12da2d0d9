#include "oxmv/values/Dictionary.h"

#include <algorithm>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "oxmv/values/Text.h"

namespace oxmv {

using detail::Block;
using detail::Form;
using detail::Key;
using detail::Slot;

namespace {

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

namespace detail {

// The entries of a dictionary that a host made or changed. An entry that was removed stays as a
// vacant place, so that removing costs no more than finding, until vacant places outnumber the
// others.
class [[gnu::visibility("hidden")]] Table final : public Shared {
 public:
  Table() = default;
  // The same entries, none vacant. Copies no payload.
  explicit Table(const Dictionary& other) {
    entries_.reserve(other.size());
    for (const auto& [key, value] : other) append(key, value);
  }

  std::size_t size() const { return size_; }
  std::size_t places() const { return entries_.size(); }
  bool isVacant(std::size_t place) const { return entries_[place].value.isNothing(); }
  std::string_view key(std::size_t place) const {
    const Entry& entry = entries_[place];
    return entry.key.isTag() ? entry.key.tagText() : entry.name;
  }
  const Value& value(std::size_t place) const { return entries_[place].value; }

  std::optional<std::size_t> find(std::string_view key) const {
    if (index_) {
      const auto found = index_->find(key);
      return found == index_->end() ? std::nullopt : std::optional<std::size_t>(*found);
    }
    const Key wanted = Key::fits(key) ? Key::tag(key) : Key::textAt(0);
    for (std::size_t place = 0; place < entries_.size(); ++place) {
      const Entry& entry = entries_[place];
      if (entry.key == wanted && (wanted.isTag() || entry.name == key) && !isVacant(place))
        return place;
    }
    return std::nullopt;
  }

  void set(std::string_view key, Value value) {
    if (const auto place = find(key)) {
      entries_[*place].value = std::move(value);
    } else {
      append(key, std::move(value));
    }
  }

  void remove(std::size_t place) {
    if (index_) index_->erase(static_cast<std::uint32_t>(place));
    entries_[place].value = Value();
    --size_;
    if (entries_.size() >= 2 * size_ + leastToCompact) compact();
  }

 private:
  struct Entry {
    Key key;  // textAt(0): the key is `name`
    std::string name;
    Value value;
  };
  // Orders places by the keys there. An ordered index, not a hashed one: no choice of keys makes it
  // slow.
  struct ByKey {
    using is_transparent = void;
    const Table* table;
    bool operator()(std::uint32_t a, std::uint32_t b) const {
      return table->key(a) < table->key(b);
    }
    bool operator()(std::uint32_t a, std::string_view b) const { return table->key(a) < b; }
    bool operator()(std::string_view a, std::uint32_t b) const { return a < table->key(b); }
  };
  // Up to so many entries are searched one by one: dictionaries of tags, which never come to more,
  // need no index.
  static constexpr std::size_t searchedInLine = 256;

  static constexpr std::size_t leastToCompact = 32;

  // `key` must not be there yet.
  void append(std::string_view key, Value value) {
    const bool isTag = Key::fits(key);
    entries_.push_back({isTag ? Key::tag(key) : Key::textAt(0),
                        isTag ? std::string() : std::string(key), std::move(value)});
    try {
      if (index_) {
        index_->insert(static_cast<std::uint32_t>(entries_.size() - 1));
      } else if (entries_.size() > searchedInLine) {
        buildIndex();
      }
    } catch (...) {  // no memory: as if it had not been asked
      entries_.pop_back();
      throw;
    }
    ++size_;
  }

  void buildIndex() {
    std::set<std::uint32_t, ByKey> index(ByKey{this});
    for (std::size_t place = 0; place < entries_.size(); ++place) {
      if (!isVacant(place)) index.insert(static_cast<std::uint32_t>(place));
    }
    index_ = std::move(index);
  }

  void compact() {
    index_.reset();
    std::erase_if(entries_, [](const Entry& entry) { return entry.value.isNothing(); });
    if (entries_.size() > searchedInLine) buildIndex();
  }

  std::vector<Entry> entries_;
  std::size_t size_ = 0;  // without the vacant ones
  std::optional<std::set<std::uint32_t, ByKey>> index_;
};

}  // namespace detail

Dictionary::Dictionary(std::initializer_list<std::pair<std::string_view, Value>> entries) {
  for (const auto& [key, value] : entries) set(key, value);
}

const detail::Table* Dictionary::table() const noexcept {
  return static_cast<const detail::Table*>(value_.owner());
}

bool Dictionary::ownsTable() const noexcept {
  return isTable() && table() != nullptr && table()->isUnique();
}

// The table to change: this dictionary's alone.
detail::Table& Dictionary::ownTable() {
  if (!ownsTable()) {
    value_ = Value(Slot::scalar(Form::dictionaryBox, 0), new detail::Table(*this));
  }
  return const_cast<detail::Table&>(*table());  // made above without const, and shared with nobody
}

std::size_t Dictionary::size() const noexcept {
  if (isTable()) return table() == nullptr ? 0 : table()->size();
  return places();
}

std::size_t Dictionary::placesOfTable() const noexcept {
  return table() == nullptr ? 0 : table()->places();
}

void Dictionary::Iterator::arriveInTable() {
  const detail::Table& table = *dictionary_->table();
  while (place_ < end_ && table.isVacant(place_)) ++place_;
  if (place_ == end_) return;
  entry_.key = table.key(place_);
  entry_.value.borrow(table.value(place_));
}

bool Dictionary::contains(std::string_view key) const { return !(*this)[key].isNothing(); }

Value Dictionary::operator[](std::string_view key) const {
  const KeyText wanted(key);
  if (isTable()) {
    const auto place = table() == nullptr ? std::nullopt : table()->find(wanted.text());
    return place ? table()->value(*place) : Value();
  }
  if (value_.isNothing()) return {};
  const Slot* slot = value_.block().find(value_.slot_.body, wanted.text());
  return slot == nullptr ? Value() : Value::in(value_.block(), *slot);
}

bool Dictionary::set(std::string_view key, Value value) {
  if (value.isNothing()) return false;
  const Value before = ownsTable() ? Value() : value_;  // whose own key this may be
  ownTable().set(KeyText(key).text(), std::move(value));
  return true;
}

bool Dictionary::remove(std::string_view key) {
  const KeyText wanted(key);
  if (!contains(wanted.text())) return false;
  const Value before = ownsTable() ? Value() : value_;  // whose own key this may be
  detail::Table& own = ownTable();
  own.remove(*own.find(wanted.text()));
  return true;
}

bool operator==(const Dictionary& a, const Dictionary& b) { return Value(a) == Value(b); }

}  // namespace oxmv
