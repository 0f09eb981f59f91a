#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Data/PropertyListValue.h"

namespace MarletFoundation {

/// How a page judged the learner's work after a run.
struct MARLET_EXPORT AssessmentStatus {
  struct Pass {
    std::optional<std::string> message;
    bool operator==(const Pass&) const = default;
  };
  struct Fail {
    std::vector<std::string> hints;
    std::optional<std::string> solution;
    bool operator==(const Fail&) const = default;
  };
  enum class SerializationErrorCase {
    invalidStatus,
    rootNotADictionary,
    missingStatus,
    messageNotAString,
    hintsNotAnArray,
    hintNotAString,
    solutionNotAString,
  };
  using SerializationError = UserVisibleCaseError<SerializationErrorCase>;

  std::variant<Pass, Fail> outcome;

  AssessmentStatus(Pass pass) : outcome(std::move(pass)) {}
  AssessmentStatus(Fail fail) : outcome(std::move(fail)) {}
  /// Reads the dictionary that `propertyListValue` gives; throws `SerializationError`.
  explicit AssessmentStatus(const PropertyListValue& value);
  PropertyListValue propertyListValue() const;

  bool passed() const { return std::holds_alternative<Pass>(outcome); }
  bool operator==(const AssessmentStatus&) const = default;
};

MARLET_EXPORT const ErrorTable& errorTable(AssessmentStatus::SerializationErrorCase);

}  // namespace MarletFoundation
