#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <variant>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Data/PropertyListValue.h"

namespace MarletFoundation {

/// An inline result that the learner has beside a source line.
struct MARLET_EXPORT MarletInlineResultData {
  enum class DisplayMode { latest, list, graph };
  /// As large as its content, but no larger. In points.
  struct AtMost {
    double width = 0;
    double height = 0;
    bool operator==(const AtMost&) const = default;
  };
  /// As wide as the editor. In points.
  struct FullWidth {
    double height = 0;
    bool operator==(const FullWidth&) const = default;
  };
  using VisibleSize = std::variant<AtMost, FullWidth>;
  struct Visible {
    VisibleSize size;
    DisplayMode mode = DisplayMode::latest;
    bool operator==(const Visible&) const = default;
  };
  struct Hidden {
    bool operator==(const Hidden&) const = default;
  };
  using VisibleState = std::variant<Visible, Hidden>;

  enum class SerializationErrorCase {
    unknownDisplayMode,
    unknownTypeForVisibleState,
    rootNotADictionary,
    missingLineNumber,
    missingDisplayModeForVisibleState,
    missingTypeForVisibleState,
    missingWidthForVisibleState,
    missingHeightForVisibleState,
  };
  using SerializationError = CaseError<SerializationErrorCase>;

  std::int64_t line = 0;
  /// Where the result's expression is, in the units of whoever tracks results. Not stored in a property list.
  std::int64_t characterOffset = 0;
  VisibleState visibleState;

  MarletInlineResultData(std::int64_t lineNumber, std::int64_t offset, VisibleState state)
      : line(lineNumber), characterOffset(offset), visibleState(std::move(state)) {}
  /// Reads the dictionary that `propertyListValue` gives; throws `SerializationError`.
  explicit MarletInlineResultData(const PropertyListValue& value);
  PropertyListValue propertyListValue() const;

  /// The result as an item of the timeline format, stamped with the present time.
  std::string legacyTimelineItemString() const;

  bool operator==(const MarletInlineResultData&) const = default;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletInlineResultData::SerializationErrorCase);

/// The inline results of a page by their lines.
using InlineResults = std::map<std::int64_t, MarletInlineResultData>;

/// The printed forms, for diagnostics: "[3: MarletInlineResultData(line: 3, …)]", "[:]" without results.
MARLET_EXPORT std::string description(const MarletInlineResultData& result);
MARLET_EXPORT std::string description(const InlineResults& results);

}  // namespace MarletFoundation
