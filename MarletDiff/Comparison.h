#pragma once

#include <cstdint>
#include <vector>

#include "MarletDiff/Tokens.h"

namespace MarletDiff {

/// A stretch of tokens and what it became; either may be empty. Ends are exclusive.
struct TokenChange {
  std::size_t original;
  std::size_t originalEnd;
  std::size_t modified;
  std::size_t modifiedEnd;
};

/// The changes that lead from one list of tokens to the other, in ascending order with an equal token between
/// any two of them. Takes the comparisons it makes off `budget`; once that is used up, or the lists are too
/// far apart, the last change takes in all that is left.
std::vector<TokenChange> changes(const Tokens& original, const Tokens& modified, std::int64_t& budget);

}  // namespace MarletDiff
