// What people call tags.

#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace oxmv {

// The label of a tag: "WBAL" gives "White balance". Null for a tag without one, and for everything
// that is no tag: the whole key counts, case and blanks included, and a label is no key.
//
// The labels stand in a table that is made when it is first asked for, and made again after
// resetTagLabels(). A label handed out stays as it is as long as somebody holds it. Safe on several
// threads at once.
std::shared_ptr<const std::string> tagLabel(std::string_view tag);

// Forgets the table of labels.
void resetTagLabels() noexcept;

}  // namespace oxmv
