#include "MarletFoundation/Marlet/MarletResultInfo.h"

#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Utils/CheckedArithmetic.h"

namespace MarletFoundation {
namespace {

/// Characters of `text` that are a line feed; one behind a carriage return is part of another character.
std::int64_t lineFeedCount(std::string_view text) {
  std::int64_t count = 0;
  for (auto at = text.find('\n'); at != std::string_view::npos; at = text.find('\n', at + 1)) {
    if (at == 0 || text[at - 1] != '\r') ++count;
  }
  return count;
}

void store(InlineResults& results, MarletInlineResultData result) {
  const auto line = result.line;
  results.insert_or_assign(line, std::move(result));
}

}  // namespace

void MarletResultInfo::executionDidBegin() {
  if (oldResultsToPrune_) {
    for (const auto& [line, result] : *oldResultsToPrune_) inlineResults_.erase(line);
  }
  oldResultsToPrune_ = inlineResults_;
}

void MarletResultInfo::trackInlineResultDataAt(std::int64_t line, std::int64_t characterOffset) {
  const auto known = inlineResults_.find(line);
  if (known == inlineResults_.end()) {
    store(inlineResults_, {line, characterOffset, MarletInlineResultData::Hidden{}});
    return;
  }
  known->second.characterOffset = characterOffset;
  if (oldResultsToPrune_) oldResultsToPrune_->erase(line);
}

void MarletResultInfo::updateForTextInsertion(std::string_view text, const SourceEditorPosition& position,
                                              std::int64_t charOffset) {
  oldResultsToPrune_.reset();
  const auto newlines = lineFeedCount(text);
  const auto length = graphemeCount(text);
  InlineResults moved;
  for (const auto& [line, old] : inlineResults_) {
    auto result = old;
    if (line > position.line || (line == position.line && position.col == 0)) {
      result.line = checkedSum(line, newlines);
      result.characterOffset = checkedSum(old.characterOffset, length);
    } else if (line == position.line && old.characterOffset >= charOffset) {
      result.characterOffset = checkedSum(old.characterOffset, length);
    }
    store(moved, std::move(result));
  }
  inlineResults_ = std::move(moved);
}

void MarletResultInfo::updateForTextDeletion(std::string_view text, const SourceEditorRange& range,
                                             const TextRange& charRange) {
  oldResultsToPrune_.reset();
  const auto removed = checkedDifference(range.end.line, range.start.line);
  const auto length = graphemeCount(text);
  InlineResults moved;
  for (const auto& [line, old] : inlineResults_) {
    auto result = old;
    if (line >= range.start.line && line < range.end.line) continue;
    if (line >= range.start.line && line == range.end.line) {
      if (old.characterOffset >= charRange.location)
        result.characterOffset = checkedDifference(old.characterOffset, length);
    } else if (line >= range.start.line) {
      result.line = checkedDifference(line, removed);
      result.characterOffset = checkedDifference(old.characterOffset, length);
    }
    store(moved, std::move(result));
  }
  inlineResults_ = std::move(moved);
}

bool MarletResultInfo::updateAssessmentInformation(const std::optional<AssessmentInformation>& information) {
  if (assessmentInformation_ == information) return false;
  assessmentInformation_ = information;
  return true;
}

}  // namespace MarletFoundation
