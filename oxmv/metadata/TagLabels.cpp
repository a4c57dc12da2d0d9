#include "oxmv/metadata/TagLabels.h"

#include <functional>
#include <map>
#include <mutex>

#include "oxmv/metadata/TagTable.h"

namespace oxmv {
namespace {

using Labels = std::map<std::string, const std::string, std::less<>>;

std::shared_ptr<const Labels> makeLabels() {
  auto labels = std::make_shared<Labels>();
  for (const TagRow& row : tagRows()) {
    if (row.label.empty()) continue;
    const auto characters = charactersOf(row.tag);
    labels->emplace(std::string(characters.data(), characters.size()), row.label);
  }
  return labels;
}

// The table in use; null until somebody asks. Constant-initialised, so it is there before anybody
// can.
constinit std::mutex guard;
constinit std::shared_ptr<const Labels> current;

}  // namespace

std::shared_ptr<const std::string> tagLabel(std::string_view tag) {
  std::shared_ptr<const Labels> labels;
  {
    const std::scoped_lock lock(guard);
    if (current == nullptr) current = makeLabels();
    labels = current;
  }
  const auto found = labels->find(tag);
  if (found == labels->end()) return nullptr;
  return {labels, &found->second};  // holds the table as long as the label is held
}

void resetTagLabels() noexcept {
  std::shared_ptr<const Labels> old;  // goes when the lock is gone
  const std::scoped_lock lock(guard);
  old.swap(current);
}

}  // namespace oxmv
