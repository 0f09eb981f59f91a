#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// Says what may stand in a pack.
class MARLET_EXPORT DiffPackValidator {
 public:
  virtual ~DiffPackValidator() = default;
  /// Throws for a pack that isn't valid.
  virtual void validate() const = 0;
  /// What may stay of an entry, or nothing. `content` is the original text of a modified file.
  virtual std::optional<MarletDiff::FileDiffDescriptor> validatedUpdate(
      const MarletDiff::FileDiffDescriptor& descriptor,
      std::optional<std::u16string_view> content = std::nullopt) const = 0;
};

}  // namespace MarletFoundation
