#pragma once

#include "MarletFoundation/Marlet/AssessmentStatus.h"

namespace MarletFoundation {

/// A page's present outcome, and whether it has passed at some time, now or in a run before.
struct MARLET_EXPORT AssessmentInformation {
  enum class SerializationErrorCase { rootNotADictionary, missingStatus };
  using SerializationError = UserVisibleCaseError<SerializationErrorCase>;

  AssessmentStatus currentStatus;
  bool everPassed = false;

  /// The page counts as passed from now on if it passes or passed before.
  AssessmentInformation(AssessmentStatus status, bool passedPreviously)
      : currentStatus(std::move(status)), everPassed(passedPreviously || currentStatus.passed()) {}
  /// Reads the dictionary that `propertyListValue` gives, the flag as it stands; throws `SerializationError`,
  /// or the status' own for a bad status.
  explicit AssessmentInformation(const PropertyListValue& value);
  PropertyListValue propertyListValue() const;

  bool operator==(const AssessmentInformation&) const = default;
};

MARLET_EXPORT const ErrorTable& errorTable(AssessmentInformation::SerializationErrorCase);

}  // namespace MarletFoundation
