#include "MarletFoundation/Utils/CollapsibleStack.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

namespace MarletFoundation::test {
namespace {

using Stack = CollapsibleStack<int>;
using Slice = StackSlice<int>;
using Decision = StackCollapsingDecision;

template <class Run>
std::vector<int> listOf(const Run& run) {
  std::vector<int> list;
  for (auto next = run.begin(); next != run.end(); ++next) list.push_back(*next);
  return list;
}

/// What the stack is to do, on an array whose end is the top.
struct Naive {
  std::vector<int> entries;
  // The entries up to this place were folded.
  std::size_t folded = 0;

  void pop() {
    entries.pop_back();
    folded = std::min(folded, entries.size());
  }

  template <class Decide, class Replace>
  void collapse(bool onlyUncollapsed, Decide decide, Replace replace) {
    struct Run {
      std::size_t begin, end;
    };
    std::vector<Run> runs;
    constexpr auto none = static_cast<std::size_t>(-1);
    auto open = none;
    for (auto i = onlyUncollapsed ? folded : 0; i < entries.size(); ++i) {
      const auto decision = decide(entries[i]);
      if (decision == Decision::MarkBegin) open = i;
      if (decision == Decision::MarkEnd && open != none) runs.push_back({open, i + 1});
      if (decision == Decision::MarkEnd || decision == Decision::CancelGrouping) open = none;
    }
    std::ptrdiff_t shift = 0;
    for (const auto& run : runs) {
      const auto begin = entries.begin() + static_cast<std::ptrdiff_t>(run.begin) + shift;
      const auto end = begin + static_cast<std::ptrdiff_t>(run.end - run.begin);
      const auto replacement = replace(std::vector<int>(begin, end));
      const auto place = entries.erase(begin, end);
      if (replacement) entries.insert(place, *replacement);
      const auto length = static_cast<std::ptrdiff_t>(replacement ? 1 : 0);
      folded = static_cast<std::size_t>(static_cast<std::ptrdiff_t>(run.begin) + shift + length);
      shift += length - static_cast<std::ptrdiff_t>(run.end - run.begin);
    }
  }
};

void expectSame(const Stack& stack, const Naive& naive) {
  auto reversed = naive.entries;
  std::reverse(reversed.begin(), reversed.end());
  RC_ASSERT(listOf(stack) == naive.entries);
  RC_ASSERT(listOf(stack.reverse()) == reversed);
  RC_ASSERT(listOf(stack.uncollapsed()) ==
            std::vector<int>(naive.entries.begin() + static_cast<std::ptrdiff_t>(naive.folded),
                             naive.entries.end()));
  RC_ASSERT(stack.userEntries() == naive.entries.size());
  RC_ASSERT(stack.isEmpty() == naive.entries.empty());
  RC_ASSERT(stack.peek() == (naive.entries.empty() ? std::nullopt : std::optional(naive.entries.back())));
}

TEST(CollapsibleStack, DoesAsANaiveOneUnderRandomOperations) {
  EXPECT_TRUE(rc::check([] {
    Stack stack;
    Naive naive;
    const auto steps = *rc::gen::container<std::vector<int>>(rc::gen::inRange(0, 100));
    for (const int step : steps) {
      if (step < 60) {
        stack.push(step);
        naive.entries.push_back(step);
      } else if (step < 75) {
        const auto popped = stack.pop();
        RC_ASSERT(popped == (naive.entries.empty() ? std::nullopt : std::optional(naive.entries.back())));
        if (popped) naive.pop();
      } else {
        const auto decide = [](int entry) { return static_cast<Decision>(entry % 4); };
        const auto replace = [step](const std::vector<int>& run) {
          return step % 3 == 0 ? std::nullopt : std::optional((run.front() + run.back() + 2) % 60);
        };
        const bool onlyUncollapsed = step % 2 == 0;
        std::vector<int> seen, expected;
        stack.collapseEntries(
            onlyUncollapsed,
            [&](int entry, const int* following) {
              seen.push_back(entry);
              if (following) expected.push_back(*following);
              return decide(entry);
            },
            [&](const Slice& slice) {
              auto run = listOf(slice);
              RC_ASSERT(run.size() == slice.userEntries());
              auto reversed = listOf(slice.reverse());
              std::reverse(reversed.begin(), reversed.end());
              RC_ASSERT(reversed == run);
              return replace(run);
            });
        if (!seen.empty()) RC_ASSERT(std::vector<int>(seen.begin() + 1, seen.end()) == expected);
        naive.collapse(onlyUncollapsed, decide, replace);
      }
      expectSame(stack, naive);
    }
  }));
}

TEST(CollapsibleStack, OfAMillionEntriesGoesWithoutUsingUpTheStack) {
  Stack stack;
  for (int i = 0; i < 1000000; ++i) stack.push(i);
  EXPECT_EQ(stack.makeIterator().next(), 0);
}

}  // namespace
}  // namespace MarletFoundation::test
