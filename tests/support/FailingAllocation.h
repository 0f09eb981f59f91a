#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <new>
#include <optional>

#include "MarletFoundation/Platform/Error.h"

namespace MarletFoundation::test {

/// While it lives, one of this thread's allocations fails: the `number`th from now on, from 1; with `lasting`, all
/// after it as well.
class FailingAllocation {
 public:
  FailingAllocation(long number, bool lasting);
  ~FailingAllocation();
  FailingAllocation(const FailingAllocation&) = delete;
};

/// How many allocations this thread has made since the last call.
long takeAllocationCount();

/// Lets the allocations of `work` fail, one after the other: it must throw an `Error` or `std::bad_alloc`, or
/// give what it gives otherwise, and nothing may stay behind that changes what it gives afterwards. Of more than
/// `most` allocations only some fail, spread evenly.
template <class Work>
void expectNothingWrongWithoutMemory(const char* name, Work work, long most = 500) {
  SCOPED_TRACE(name);
  const auto expected = work();
  takeAllocationCount();
  work();
  const long count = takeAllocationCount();
  ASSERT_GT(count, 0);
  for (const bool lasting : {false, true}) {
    for (long number = 1; number <= count; number += std::max(1L, count / most)) {
      std::optional<decltype(work())> result;
      try {
        const FailingAllocation failing(number, lasting);
        result.emplace(work());
      } catch (const std::bad_alloc&) {
      } catch (const Error&) {
      }
      EXPECT_TRUE(!result || *result == expected) << "allocation " << number << " of " << count;
    }
  }
  EXPECT_TRUE(work() == expected);
}

}  // namespace MarletFoundation::test
