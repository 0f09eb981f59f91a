#include "MarletFoundation/SourceEditor/SourceEditorRange.h"

#include "MarletFoundation/Utils/CheckedArithmetic.h"

namespace MarletFoundation {
namespace {

using Failure = SourceEditorRange::PropertyListSerializationError;

const PropertyListValue& required(const PropertyListDictionary& dictionary, std::string_view key,
                                  Failure::Case missing) {
  const auto* value = dictionary.find(key);
  if (!value) throw Failure(missing);
  return *value;
}

SourceEditorPosition position(const PropertyListValue& value, Failure::Case invalid) {
  try {
    return SourceEditorPosition(value);
  } catch (const SourceEditorPosition::PropertyListSerializationError& error) {
    throw Failure(invalid, error);
  }
}

}  // namespace

const ErrorTable& errorTable(SourceEditorRange::PropertyListSerializationErrorCase) {
  static constexpr ErrorRow rows[] = {
      {.name = "StartInvalid", .code = 3},       {.name = "EndInvalid", .code = 4},
      {.name = "RootNotADictionary", .code = 0}, {.name = "MissingStart", .code = 1},
      {.name = "MissingEnd", .code = 2},
  };
  static constexpr ErrorTable table{"MarletFoundation.SourceEditorRange.PropertyListSerializationError",
                                    rows};
  return table;
}

SourceEditorRange::SourceEditorRange(const PropertyListValue& value) {
  const auto* dictionary = value.dictionary();
  if (!dictionary) throw Failure(Failure::Case::RootNotADictionary);
  const auto& startValue = required(*dictionary, "start", Failure::Case::MissingStart);
  const auto& endValue = required(*dictionary, "end", Failure::Case::MissingEnd);
  start = position(startValue, Failure::Case::StartInvalid);
  end = position(endValue, Failure::Case::EndInvalid);
}

PropertyListValue SourceEditorRange::propertyListValue() const {
  return PropertyListDictionary{{"start", start.propertyListValue()}, {"end", end.propertyListValue()}};
}

TextRange SourceEditorRange::columnDifferenceAsRange() const {
  return {start.col, checkedDifference(end.col, start.col)};
}

SourceEditorRange SourceEditorRange::adjustedRangeByInsertingRange(const SourceEditorRange& range) const {
  return {start.adjustedPositionByInsertingRange(range), end.adjustedPositionByInsertingRange(range)};
}

SourceEditorRange SourceEditorRange::adjustedRangeByDeletingRange(const SourceEditorRange& range) const {
  return {start.adjustedPositionByDeletingRange(range), end.adjustedPositionByDeletingRange(range)};
}

std::string SourceEditorRange::description() const {
  const auto place = [](const SourceEditorPosition& p) {
    return "line: " + std::to_string(p.line) + ", col: " + std::to_string(p.col);
  };
  return "SourceEditorRange: " + place(start) + " - " + place(end);
}

}  // namespace MarletFoundation
