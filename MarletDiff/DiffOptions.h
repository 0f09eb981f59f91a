#pragma once

#include <cstdint>

namespace MarletDiff {

/// A set of flags that say how to diff.
class DiffOptions {
 public:
  /// Asks for finer hunks: words, and characters within them, instead of whole lines.
  static const DiffOptions SmallerHunks;

  /// The empty set.
  constexpr DiffOptions() = default;

  constexpr bool empty() const { return flags_ == 0; }
  /// Whether every flag of `other` is in this set.
  constexpr bool contains(DiffOptions other) const { return (flags_ & other.flags_) == other.flags_; }

  friend constexpr DiffOptions operator|(DiffOptions a, DiffOptions b) {
    return DiffOptions(a.flags_ | b.flags_);
  }
  friend constexpr DiffOptions operator&(DiffOptions a, DiffOptions b) {
    return DiffOptions(a.flags_ & b.flags_);
  }
  friend constexpr DiffOptions operator^(DiffOptions a, DiffOptions b) {
    return DiffOptions(a.flags_ ^ b.flags_);
  }
  friend constexpr DiffOptions operator-(DiffOptions a, DiffOptions b) {
    return DiffOptions(a.flags_ & ~b.flags_);
  }
  constexpr bool operator==(const DiffOptions&) const = default;

 private:
  constexpr explicit DiffOptions(std::uint32_t flags) : flags_(flags) {}
  std::uint32_t flags_ = 0;
};

inline constexpr DiffOptions DiffOptions::SmallerHunks{1};

}  // namespace MarletDiff
