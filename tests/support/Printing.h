// How GoogleTest shows values when an expectation fails: as a test would write them down.

#pragma once

#include <ostream>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/values/Array.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/Value.h"
#include "oxmv/values/myGUID.h"

// Found by argument-dependent look-up, so they stand beside the types. Every test file that
// compares one of these includes this header: the printers must be the same throughout the program.
namespace oxmv {

void PrintTo(const Value& value, std::ostream* out);
void PrintTo(const Array& array, std::ostream* out);
void PrintTo(const Dictionary& dictionary, std::ostream* out);
void PrintTo(const myGUID& guid, std::ostream* out);
void PrintTo(SkipReason reason, std::ostream* out);

}  // namespace oxmv
