#pragma once

#include "MarletFoundation/Marlet/MarletResultInfoSnapshot.h"
#include "MarletFoundation/Platform/TextRange.h"
#include "MarletFoundation/SourceEditor/SourceEditorRange.h"

namespace MarletFoundation {

/// The live record of what a page's runs showed, kept while the learner types and runs code. It holds no lock;
/// its owner confines it to one thread or queue. An overflow of a line or an offset is fatal. A host's subclass may
/// follow what happens to it.
class MARLET_EXPORT MarletResultInfo : public MarletResultInfoType {
 public:
  MarletResultInfo() = default;
  explicit MarletResultInfo(const MarletResultInfoSnapshot& snapshot)
      : assessmentInformation_(snapshot.assessmentInformation()), inlineResults_(snapshot.inlineResults()) {}
  MarletResultInfo(const MarletResultInfo&) = delete;
  MarletResultInfo& operator=(const MarletResultInfo&) = delete;

  const std::optional<AssessmentInformation>& assessmentInformation() const override {
    return assessmentInformation_;
  }
  const InlineResults& inlineResults() const override { return inlineResults_; }
  /// The record as it stands; in the midst of a run with the results that the run may still prune.
  MarletResultInfoSnapshot snapshot() const override { return {assessmentInformation_, inlineResults_}; }

  /// To be called as a run starts: drops the results that the previous run didn't report again.
  virtual void executionDidBegin();
  /// To be called as a run reports a result: a new one is hidden, a known one gets the new offset.
  virtual void trackInlineResultDataAt(std::int64_t line, std::int64_t characterOffset);

  /// To be called after `text` (UTF-8) was inserted at `position`, which is `charOffset` characters from the
  /// text's start. Ends the tracking of a run.
  virtual void updateForTextInsertion(std::string_view text, const SourceEditorPosition& position,
                                      std::int64_t charOffset);
  /// To be called after `text` (UTF-8) was deleted from `range`, which began `charRange.location` characters
  /// from the text's start. Results on the lines of the range but its last go; those on its last line keep
  /// their line. Ends the tracking of a run.
  virtual void updateForTextDeletion(std::string_view text, const SourceEditorRange& range,
                                     const TextRange& charRange);

  /// Takes over the information and answers true, if it differs from the present one.
  virtual bool updateAssessmentInformation(const std::optional<AssessmentInformation>& information);

 private:
  std::optional<AssessmentInformation> assessmentInformation_;
  InlineResults inlineResults_;
  /// The results that the run in progress hasn't reported yet; nothing when none is tracked.
  std::optional<InlineResults> oldResultsToPrune_;
};

}  // namespace MarletFoundation
