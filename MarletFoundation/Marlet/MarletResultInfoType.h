#pragma once

#include <optional>

#include "MarletFoundation/Marlet/AssessmentInformation.h"
#include "MarletFoundation/Marlet/MarletInlineResultData.h"

namespace MarletFoundation {

class MarletResultInfoSnapshot;

/// What a page's last run showed, as a value or live.
class MARLET_EXPORT MarletResultInfoType {
 public:
  virtual ~MarletResultInfoType() = default;
  virtual const std::optional<AssessmentInformation>& assessmentInformation() const = 0;
  virtual const InlineResults& inlineResults() const = 0;
  virtual MarletResultInfoSnapshot snapshot() const = 0;
};

}  // namespace MarletFoundation
