#pragma once

#include <chrono>
#include <compare>

namespace MarletFoundation {

/// A moment, as seconds since the reference date, 1 January 2001 00:00:00 UTC.
struct Date {
  double secondsSinceReferenceDate = 0;

  /// Seconds from 1 January 1970 to the reference date.
  static constexpr double unixEpochOffset = 978307200;

  static Date now() {
    const std::chrono::duration<double> sinceEpoch = std::chrono::system_clock::now().time_since_epoch();
    return {sinceEpoch.count() - unixEpochOffset};
  }

  auto operator<=>(const Date&) const = default;
};

}  // namespace MarletFoundation
