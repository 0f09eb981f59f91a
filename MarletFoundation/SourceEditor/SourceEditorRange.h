#pragma once

#include "MarletFoundation/Platform/TextRange.h"
#include "MarletFoundation/SourceEditor/OffsetRange.h"
#include "MarletFoundation/SourceEditor/SourceEditorPosition.h"

namespace MarletFoundation {

/// A stretch of a text from one position to another. An end in front of the start is not ruled out.
struct MARLET_EXPORT SourceEditorRange {
  enum class PropertyListSerializationErrorCase {
    StartInvalid,
    EndInvalid,
    RootNotADictionary,
    MissingStart,
    MissingEnd,
  };
  using PropertyListSerializationError = CaseError<PropertyListSerializationErrorCase>;

  SourceEditorPosition start;
  SourceEditorPosition end;

  SourceEditorRange() = default;
  SourceEditorRange(SourceEditorPosition startPosition, SourceEditorPosition endPosition)
      : start(startPosition), end(endPosition) {}
  /// Columns of one line.
  SourceEditorRange(std::int64_t lineIndex, const OffsetRange& range)
      : SourceEditorRange(lineIndex, range.lowerBound, range.upperBound) {}
  /// The columns from `lowerBound` up to `upperBound` of one line; bounds in the wrong order are kept.
  SourceEditorRange(std::int64_t lineIndex, std::int64_t lowerBound, std::int64_t upperBound)
      : start(lineIndex, lowerBound), end(lineIndex, upperBound) {}
  /// Reads a dictionary of "start" and "end"; throws `PropertyListSerializationError`.
  explicit SourceEditorRange(const PropertyListValue& value);
  PropertyListValue propertyListValue() const;

  bool isEmptyRange() const { return start == end; }
  /// Whether the position lies in the range or at one of its ends.
  bool touchesPosition(const SourceEditorPosition& position) const {
    return position >= start && position <= end;
  }
  /// Whether the position lies in the range, its start included and its end not.
  bool enclosesPosition(const SourceEditorPosition& position) const {
    return position >= start && position < end;
  }
  /// Whether both ends of `range` touch this one.
  bool containsRange(const SourceEditorRange& range) const {
    return touchesPosition(range.start) && touchesPosition(range.end);
  }
  /// Whether `range` begins no earlier and ends earlier.
  bool enclosesRange(const SourceEditorRange& range) const { return range.start >= start && range.end < end; }

  /// The columns, whatever the lines. An overflow is fatal.
  TextRange columnDifferenceAsRange() const;
  /// Both ends adjusted, each by itself.
  SourceEditorRange adjustedRangeByInsertingRange(const SourceEditorRange& range) const;
  SourceEditorRange adjustedRangeByDeletingRange(const SourceEditorRange& range) const;

  /// "SourceEditorRange: line: 3, col: 5 - line: 4, col: 0"
  std::string description() const;
  bool operator==(const SourceEditorRange&) const = default;

  /// A range is less than another one that ends behind its start. Overlapping ranges are so less than each
  /// other: no order to sort by.
  bool operator<(const SourceEditorRange& other) const { return start < other.end; }
  bool operator>(const SourceEditorRange& other) const { return other < *this; }
  bool operator<=(const SourceEditorRange& other) const { return !(other < *this); }
  bool operator>=(const SourceEditorRange& other) const { return !(*this < other); }
};

MARLET_EXPORT const ErrorTable& errorTable(SourceEditorRange::PropertyListSerializationErrorCase);

}  // namespace MarletFoundation
