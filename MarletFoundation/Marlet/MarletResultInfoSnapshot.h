#pragma once

#include "MarletFoundation/Marlet/MarletResultInfoType.h"
#include "MarletFoundation/Platform/Data.h"

namespace MarletFoundation {

/// What a page's last run showed, as an immutable value with its two stored forms.
class MARLET_EXPORT MarletResultInfoSnapshot final : public MarletResultInfoType {
 public:
  /// `ResultInfo` is the binary property list of the file "ResultInfo.plist"; `LegacyInlineResultsTimeline` the
  /// XML of an older editor, which holds no assessment.
  enum class Format { ResultInfo, LegacyInlineResultsTimeline };
  enum class SerializationErrorCase {
    invalidVersion,
    versionTooNew,
    /// For callers; reading throws the assessment's own error.
    assessmentInformationInvalid,
    rootNotADictionary,
    missingVersion,
  };
  using SerializationError = CaseError<SerializationErrorCase>;

  MarletResultInfoSnapshot() = default;
  MarletResultInfoSnapshot(std::optional<AssessmentInformation> assessmentInformation,
                           InlineResults inlineResults)
      : assessmentInformation_(std::move(assessmentInformation)), inlineResults_(std::move(inlineResults)) {}
  /// Reads either form. `ResultInfo` throws the property-list reader's error, `SerializationError`, or that of
  /// the assessment; bad inline results are logged and left out. A timeline is read as far as it goes.
  MarletResultInfoSnapshot(const Data& data, Format format);

  const std::optional<AssessmentInformation>& assessmentInformation() const override {
    return assessmentInformation_;
  }
  const InlineResults& inlineResults() const override { return inlineResults_; }
  MarletResultInfoSnapshot snapshot() const override { return *this; }

  /// Whether there is anything to write in that form.
  bool needsSerialization(Format format) const;
  /// The stored form; throws the property-list writer's error. A `ResultInfo` keeps no character offsets.
  Data data(Format format) const;

  bool operator==(const MarletResultInfoSnapshot& other) const {
    return assessmentInformation_ == other.assessmentInformation_ && inlineResults_ == other.inlineResults_;
  }

 private:
  void readResultInfo(const Data& data);
  PropertyListValue resultInfo() const;

  std::optional<AssessmentInformation> assessmentInformation_;
  InlineResults inlineResults_;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletResultInfoSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
