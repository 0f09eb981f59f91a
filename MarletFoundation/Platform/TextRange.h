#pragma once

#include <cstdint>
#include <limits>

namespace MarletFoundation {

/// The location of a search that found nothing.
inline constexpr std::int64_t NotFound = std::numeric_limits<std::int64_t>::max();

/// A stretch of a text, counted in UTF-16 units from its start.
struct TextRange {
  std::int64_t location = 0;
  std::int64_t length = 0;

  std::int64_t end() const { return location + length; }
  bool operator==(const TextRange&) const = default;
};

}  // namespace MarletFoundation
