#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A dotted version. Equality is exact, length included, while ordering pads the shorter side with zeros:
/// "1.0" and "1.0.0" are unequal, and neither is less than the other, so both `<=` and `>=` hold between
/// them.
class MARLET_EXPORT Version {
 public:
  /// Most significant component first. An empty array is a fatal error, here and in `setComponents`.
  explicit Version(std::vector<std::int64_t> components);
  /// Decimal integers, signs accepted, joined with dots; nothing for any other string.
  static std::optional<Version> fromString(std::string_view versionString);

  const std::vector<std::int64_t>& components() const { return components_; }
  void setComponents(std::vector<std::int64_t> components);

  std::string versionString() const;
  std::int64_t majorVersion() const { return components_[0]; }
  std::optional<std::int64_t> minorVersion() const { return component(1); }
  std::optional<std::int64_t> patchVersion() const { return component(2); }

  bool operator==(const Version&) const = default;
  bool operator<(const Version& other) const;
  bool operator>(const Version& other) const { return other < *this; }
  bool operator<=(const Version& other) const { return !(other < *this); }
  bool operator>=(const Version& other) const { return !(*this < other); }

 private:
  std::optional<std::int64_t> component(std::size_t index) const;

  std::vector<std::int64_t> components_;
};

}  // namespace MarletFoundation
