// Lets the memory of this process run short. A program that links this passes every allocation of
// the process through here, those of the C library and of the outside libraries included. Where a
// sanitizer brings allocation functions of its own, only those by `new` can fail, all from one on,
// and it is left to the sanitizer to see what is not given back.

#pragma once

#include <cstddef>
#include <initializer_list>
#include <new>
#include <optional>
#include <utility>

#include <gtest/gtest.h>

#include "tests/support/SmallStack.h"

#if defined(OXMV_ADDRESS_SANITIZER) || defined(__SANITIZE_THREAD__)
#define OXMV_ALLOCATES_BY_SANITIZER
#endif

namespace oxmv::test {

enum class Shortage {
  once,     // one allocation fails, later ones succeed
  lasting,  // so do all later ones
};

// Fails the n-th allocation of this thread from now on, counted from 1.
void armShortage(std::size_t nth, Shortage shortage) noexcept;
// Nothing fails any more. Answers whether something did.
bool disarmShortage() noexcept;
// Pieces of memory that this thread has taken since it was armed, less those given back.
std::ptrdiff_t piecesHeld() noexcept;

// Runs `work` with its first allocation failing, then its second, and so on until there are no
// more; and all that again with every later one failing, too. Each time `check` gets what it
// answered, or nothing if std::bad_alloc left it; memory is no longer short then. Once the answer
// is gone, nothing of what was taken may be held, but for what is kept for the process: that is
// made before, by a run which is checked, too. `mayBeLost`: pieces that an outside library is known
// to lose. Answers how often memory was short.
template <class Work, class Check>
std::size_t failEachAllocation(Work work, Check check, std::ptrdiff_t mayBeLost = 0) {
  check(std::optional<decltype(work())>(std::in_place, work()));
  std::size_t failures = 0;
  for (const Shortage shortage : {Shortage::once, Shortage::lasting}) {
    bool wasFelt = true;
    for (std::size_t nth = 1; wasFelt && !testing::Test::HasFailure(); ++nth) {
      SCOPED_TRACE(testing::Message()
                   << "allocation " << nth
                   << (shortage == Shortage::once ? " fails" : " and later ones fail"));
      {
        std::optional<decltype(work())> answer;
        armShortage(nth, shortage);
        try {
          answer.emplace(work());
        } catch (const std::bad_alloc&) {
        }
        wasFelt = disarmShortage();
        EXPECT_TRUE(wasFelt || answer);
        check(answer);
      }
      const std::ptrdiff_t held = piecesHeld();
      if (!testing::Test::HasFailure()) {
        EXPECT_LE(held, mayBeLost);
        EXPECT_GE(held, 0);
      }
      failures += wasFelt;
    }
  }
#ifndef OXMV_ALLOCATES_BY_SANITIZER
  EXPECT_GT(failures, 0u);
#endif
  return failures;
}

}  // namespace oxmv::test
