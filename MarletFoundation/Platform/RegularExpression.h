#pragma once

#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"
#include "MarletFoundation/Platform/TextRange.h"

namespace MarletFoundation {

/// A compiled pattern in the syntax of ICU regular expressions. Immutable: copies share it, and it may be
/// used from any thread at once.
class MARLET_EXPORT RegularExpression {
 public:
  /// Throws an `ErrorObject` of the domain "RegularExpression" for a pattern that doesn't compile.
  explicit RegularExpression(std::u16string_view pattern);

  /// The ranges of a match and of its capture groups; a group that took no part is at `NotFound`.
  using Match = std::vector<TextRange>;
  /// The first match in `text`, ranges in UTF-16 units. Nothing also when the engine gives up: its stack and
  /// its steps are bounded, so that no text keeps it busy for more than about a second.
  std::optional<Match> firstMatch(std::u16string_view text) const;
  /// All matches in their order; those found so far when the engine gives up.
  std::vector<Match> matches(std::u16string_view text) const;

 private:
  struct Compiled;
  std::shared_ptr<const Compiled> compiled_;
};

}  // namespace MarletFoundation
