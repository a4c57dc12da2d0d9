// The entries of a dictionary that a host made or changed. Internal: hosts meet it only inside
// Dictionary.
//
// What was taken over from a decoded stream stays in the stream's block; what was set since is the
// table's own. A table has its places once and for all, and a dictionary that needs more makes
// itself a larger table.
//
//   table := Table Value[] Slot[] Key[]
//
// An entry that was removed leaves a vacant place, so that removing costs no more than finding.

#pragma once

#include <cstddef>
#include <cstdint>
#include <new>
#include <optional>
#include <set>
#include <string_view>

#include "oxmv/values/Block.h"
#include "oxmv/values/HeldEntries.h"
#include "oxmv/values/Shared.h"
#include "oxmv/values/Value.h"

namespace oxmv::detail {

class Table final : public Shared {
 public:
  // The same entries, none vacant, and room for at least one more; for `more`, unless their keys
  // are no tags. Copies no payload, and keeps the block only if something stands there.
  static Ref<Table> make(const HeldEntries& from, std::size_t more);
  ~Table() override;

  HeldEntries held() const { return {base_.get(), slots_, keys_, places_, own_, streamSize_}; }
  std::size_t size() const { return places_ - vacant_; }
  // Whether one more value may be set, under whatever key.
  bool hasRoom() const { return places_ < mostPlaces_ && owned_ + 2 <= mostOwned_; }
  // Whether to make it anew would spare something: going through the entries means going past
  // vacant places most of the time, or nothing stands in the block any more.
  bool isWasteful() const { return vacant_ >= size() + 32 || (base_ && inBlock_ == 0); }

  // `key` is in UTF-8.
  std::optional<std::size_t> find(std::string_view key) const;

  // For these the table must be nobody else's, and to set there must be room. Where there is no
  // memory, set() throws and has changed nothing.
  void set(std::string_view key, Value value);
  void remove(std::size_t place) noexcept;

  static void operator delete(void* memory) { ::operator delete(memory); }

 private:
  // Orders places by the keys there. An ordered index, not a hashed one: no choice of keys makes it
  // slow.
  struct ByKey {
    using is_transparent = void;
    const Table* table;
    std::string_view name(std::uint32_t place) const { return table->held().name(place); }
    bool operator()(std::uint32_t a, std::uint32_t b) const { return name(a) < name(b); }
    bool operator()(std::uint32_t a, std::string_view b) const { return name(a) < b; }
    bool operator()(std::string_view a, std::uint32_t b) const { return a < name(b); }
  };
  using Index = std::set<std::uint32_t, ByKey>;

  Table(std::size_t mostPlaces, std::size_t mostOwned) noexcept;
  static void* operator new(std::size_t size, std::size_t mostPlaces, std::size_t mostOwned) {
    return ::operator new(size + mostPlaces * (sizeof(Slot) + sizeof(Key)) + Block::readAhead +
                          mostOwned * sizeof(Value));
  }
  static void operator delete(void* memory, std::size_t, std::size_t) { ::operator delete(memory); }

  void takeOverAll(const HeldEntries& from) noexcept;
  void takeOverEach(const HeldEntries& from);
  void append(std::string_view key, Value value);
  void vacate(Slot& slot) noexcept;
  Slot kept(Value value) noexcept;
  Key keptName(Value name) noexcept;
  void buildIndex();

  const std::size_t mostPlaces_, mostOwned_;
  Value* const own_;
  Slot* const slots_;
  Key* const keys_;
  std::size_t owned_ = 0;
  std::size_t places_ = 0;
  std::size_t vacant_ = 0;   // of those
  std::size_t inBlock_ = 0;  // of those: whose values stand in the block
  Ref<const Block> base_;
  std::size_t streamSize_ = 0;
  std::optional<Index> index_;
};

}  // namespace oxmv::detail
