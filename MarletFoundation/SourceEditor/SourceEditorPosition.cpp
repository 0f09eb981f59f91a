#include "MarletFoundation/SourceEditor/SourceEditorPosition.h"

#include "MarletFoundation/SourceEditor/SourceEditorRange.h"
#include "MarletFoundation/Utils/CheckedArithmetic.h"
#include "MarletFoundation/Utils/Functional.h"

namespace MarletFoundation {
namespace {

using Failure = SourceEditorPosition::PropertyListSerializationError;

std::int64_t integer(const PropertyListDictionary& dictionary, std::string_view key, Failure::Case missing) {
  const auto* value = dictionary.find(key);
  if (!value || !value->integer()) throw Failure(missing);
  return *value->integer();
}

std::uint64_t hashable(std::int64_t number) {
  if (number < 0) fatalError("a negative line or column has no hash");
  return static_cast<std::uint64_t>(number);
}

}  // namespace

const ErrorTable& errorTable(SourceEditorPosition::PropertyListSerializationErrorCase) {
  static constexpr ErrorRow rows[] = {{"RootNotADictionary"}, {"MissingLine"}, {"MissingColumn"}};
  static constexpr ErrorTable table{"MarletFoundation.SourceEditorPosition.PropertyListSerializationError",
                                    rows};
  return table;
}

SourceEditorPosition::SourceEditorPosition(const PropertyListValue& value) {
  const auto* dictionary = value.dictionary();
  if (!dictionary) throw Failure(Failure::Case::RootNotADictionary);
  line = integer(*dictionary, "line", Failure::Case::MissingLine);
  col = integer(*dictionary, "column", Failure::Case::MissingColumn);
}

PropertyListValue SourceEditorPosition::propertyListValue() const {
  return PropertyListDictionary{{"line", line}, {"column", col}};
}

SourceEditorPosition SourceEditorPosition::adjustedPositionByInsertingRange(
    const SourceEditorRange& range) const {
  if (range.start >= *this) return *this;
  const auto lines = checkedDifference(range.end.line, range.start.line);
  const auto newLine = checkedSum(line, lines);
  if (newLine != range.end.line) return {newLine, col};
  const auto newColumn = checkedSum(col, range.end.col);
  return {newLine, lines == 0 ? checkedDifference(newColumn, range.start.col) : newColumn};
}

SourceEditorPosition SourceEditorPosition::adjustedPositionByDeletingRange(
    const SourceEditorRange& range) const {
  if (range.start >= *this) return *this;
  if (range.end.line < line)
    return {checkedDifference(line, checkedDifference(range.end.line, range.start.line)), col};
  if (range.end >= *this) return range.start;
  return {range.start.line, checkedDifference(checkedSum(col, range.start.col), range.end.col)};
}

std::uint64_t SourceEditorPosition::hashValue() const { return combiningHash(hashable(line), hashable(col)); }

std::string SourceEditorPosition::description() const {
  return "SourceEditorPosition: line: " + std::to_string(line) + ", col: " + std::to_string(col);
}

}  // namespace MarletFoundation
