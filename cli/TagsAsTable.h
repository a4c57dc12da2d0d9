// Tags for people: one a line, nested ones indented.
//
//   TIMC     Timecode       01:02:03:04
//   WBAL     White balance  1.0 1.2 1.05 1.5
//   COL1                    2 tags
//     SATU   Saturation     0.8

#pragma once

#include "cli/Sink.h"
#include "cli/Style.h"
#include "cli/ValueText.h"
#include "oxmv/values/Dictionary.h"

namespace oxmv::cli {

void writeTagsAsTable(Sink& sink, const Dictionary& tags, const Style& style, Extent extent);

}  // namespace oxmv::cli
