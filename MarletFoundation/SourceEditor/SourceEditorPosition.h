#pragma once

#include <compare>
#include <cstdint>
#include <functional>
#include <string>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Data/PropertyListValue.h"

namespace MarletFoundation {

struct SourceEditorRange;

/// A point between two characters of a text. Line and column count from 0; the unit of a column is whatever
/// the buffer counts in. Ordered by line, then by column.
struct MARLET_EXPORT SourceEditorPosition {
  enum class PropertyListSerializationErrorCase { RootNotADictionary, MissingLine, MissingColumn };
  using PropertyListSerializationError = CaseError<PropertyListSerializationErrorCase>;

  std::int64_t line = 0;
  std::int64_t col = 0;

  SourceEditorPosition() = default;
  SourceEditorPosition(std::int64_t lineNumber, std::int64_t column) : line(lineNumber), col(column) {}
  /// Reads a dictionary of "line" and "column"; throws `PropertyListSerializationError`.
  explicit SourceEditorPosition(const PropertyListValue& value);
  PropertyListValue propertyListValue() const;

  /// Where the position is after text was inserted that now takes `range`. A position at the insertion point
  /// stays. Behind an insertion of several lines, on its line, the column counts from the end of what was
  /// inserted without the column where it began being taken off. An overflow is fatal.
  SourceEditorPosition adjustedPositionByInsertingRange(const SourceEditorRange& range) const;
  /// Where the position is after the text of `range` was deleted; its start for a position inside. An overflow
  /// is fatal.
  SourceEditorPosition adjustedPositionByDeletingRange(const SourceEditorRange& range) const;

  /// A negative line or column is fatal.
  std::uint64_t hashValue() const;
  /// "SourceEditorPosition: line: 3, col: 5"
  std::string description() const;
  auto operator<=>(const SourceEditorPosition&) const = default;
};

MARLET_EXPORT const ErrorTable& errorTable(SourceEditorPosition::PropertyListSerializationErrorCase);

}  // namespace MarletFoundation

/// `hashValue`
template <>
struct std::hash<MarletFoundation::SourceEditorPosition> {
  std::size_t operator()(const MarletFoundation::SourceEditorPosition& position) const {
    return position.hashValue();
  }
};
