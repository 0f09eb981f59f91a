#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/SharedRelease.h"

namespace MarletFoundation {

/// A diagnostic of a language service: what is wrong, where, how it may be repaired, and the issues that
/// explain it. Reading, writing, copying, comparing and destroying need no stack, however deep issues lie in issues.
struct MARLET_EXPORT Issue {
  /// Ordered by raw value.
  enum class Severity { Note = 0, Warning = 1, Error = 2 };

  /// A stretch of a file. Whoever makes it chooses the units and the origin of its numbers.
  struct Location {
    std::string file;
    std::int64_t line = 0;
    std::int64_t column = 0;
    std::int64_t length = 0;
    bool operator==(const Location&) const = default;
  };

  /// A suggested repair: the text that takes the place of a range.
  struct MARLET_EXPORT FixIt {
    enum class PropertyListSerializationErrorCase {
      RootNotADictionary,
      MissingRange,
      RangeMissingFile,
      RangeMissingLine,
      RangeMissingColumn,
      RangeMissingLength,
      MissingReplacementText,
    };
    using PropertyListSerializationError = CaseError<PropertyListSerializationErrorCase>;

    Location range;
    std::string replacementText;

    FixIt(Location where, std::string replacement)
        : range(std::move(where)), replacementText(std::move(replacement)) {}
    /// Throws `PropertyListSerializationError`.
    explicit FixIt(const PropertyListValue& value);
    PropertyListValue propertyListValue() const;

    /// Whether it lies on a later line, or on the same line in an earlier column: the order in which repairs
    /// can be applied from the last line up.
    bool isBefore(const FixIt& other) const {
      return range.line > other.range.line ||
             (range.line == other.range.line && range.column < other.range.column);
    }
    bool operator==(const FixIt&) const = default;
  };

  enum class PropertyListSerializationErrorCase {
    InvalidSeverity,
    InvalidChildIssue,
    InvalidFixIt,
    RootNotADictionary,
    MissingSeverity,
    MissingMessage,
    LocationMissingFile,
    LocationMissingLine,
    LocationMissingColumn,
    LocationMissingLength,
  };
  class PropertyListSerializationError;

  Severity severity;
  std::optional<std::string> identifier;
  std::optional<Location> location;
  std::string message;
  std::vector<FixIt> fixIts;
  std::vector<Issue> childIssues;

  Issue(Severity issueSeverity, std::optional<Location> place, std::string text,
        std::vector<FixIt> repairs = {}, std::optional<std::string> name = std::nullopt)
      : severity(issueSeverity),
        identifier(std::move(name)),
        location(std::move(place)),
        message(std::move(text)),
        fixIts(std::move(repairs)) {}
  /// Throws `PropertyListSerializationError`. An optional value of the wrong kind counts as absent.
  explicit Issue(const PropertyListValue& value);
  Issue(const Issue& other);
  Issue(Issue&& other) noexcept = default;
  Issue& operator=(const Issue& other) { return *this = Issue(other); }
  Issue& operator=(Issue&& other) noexcept = default;
  ~Issue();
  PropertyListValue propertyListValue() const;

  /// "<Issue:Warning:unused variable>"
  std::string description() const;
  bool operator==(const Issue& other) const;
};

/// Nothing for a raw value that no severity has.
MARLET_EXPORT std::optional<Issue::Severity> severityFromRawValue(std::int64_t rawValue);
/// "Note", "Warning" or "Error".
MARLET_EXPORT std::string_view description(Issue::Severity severity);

MARLET_EXPORT const ErrorTable& errorTable(Issue::PropertyListSerializationErrorCase);
MARLET_EXPORT const ErrorTable& errorTable(Issue::FixIt::PropertyListSerializationErrorCase);

/// A wrapped failure stands in `error`.
class MARLET_EXPORT Issue::PropertyListSerializationError final
    : public BasicCaseError<PropertyListSerializationError, PropertyListSerializationErrorCase, Error> {
 public:
  using BasicCaseError::BasicCaseError;
  explicit PropertyListSerializationError(std::int64_t foundSeverity)
      : BasicCaseError(Case::InvalidSeverity), severity(foundSeverity) {}
  PropertyListSerializationError(const PropertyListSerializationError&) = default;
  PropertyListSerializationError& operator=(const PropertyListSerializationError&) = default;
  /// A failure is wrapped as often as its issue lies deep.
  ~PropertyListSerializationError() override { releaseWithoutStack(std::move(error)); }

  /// The number that `InvalidSeverity` found.
  std::optional<std::int64_t> severity;

  /// `InvalidSeverity(3)`, `InvalidFixIt(MissingRange)`
  std::string description() const override {
    return severity ? "InvalidSeverity(" + std::to_string(*severity) + ")" : BasicCaseError::description();
  }
};

}  // namespace MarletFoundation
