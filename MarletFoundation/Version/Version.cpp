#include "MarletFoundation/Version/Version.h"

#include <algorithm>

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

Version::Version(std::vector<std::int64_t> components) { setComponents(std::move(components)); }

std::optional<Version> Version::fromString(std::string_view versionString) {
  std::vector<std::int64_t> components;
  for (const auto piece : split(versionString, '.')) {
    const auto number = parseDecimalInteger(piece);
    if (!number) return std::nullopt;
    components.push_back(*number);
  }
  return Version(std::move(components));
}

void Version::setComponents(std::vector<std::int64_t> components) {
  if (components.empty()) fatalError("Versions must have at least one component!");
  components_ = std::move(components);
}

std::string Version::versionString() const {
  std::string text;
  for (const auto number : components_) {
    if (!text.empty()) text += '.';
    text += std::to_string(number);
  }
  return text;
}

bool Version::operator<(const Version& other) const {
  const auto length = std::max(components_.size(), other.components_.size());
  for (std::size_t i = 0; i < length; ++i) {
    const auto mine = component(i).value_or(0);
    const auto theirs = other.component(i).value_or(0);
    if (mine != theirs) return mine < theirs;
  }
  return false;
}

std::optional<std::int64_t> Version::component(std::size_t index) const {
  return index < components_.size() ? std::optional(components_[index]) : std::nullopt;
}

}  // namespace MarletFoundation
