#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "MarletFoundation/Platform/Export.h"
#include "MarletFoundation/Platform/TextRange.h"

namespace MarletFoundation {

/// What a placeholder `<#…#>` says: a stretch that an editor shows as one token for the reader to fill in.
struct MARLET_EXPORT PlaceholderMetadata {
  struct Unknown {
    std::string tokenDescription;
    bool operator==(const Unknown&) const = default;
  };
  /// `<#description##type#>`
  struct TypedToken {
    std::string tokenDescription;
    std::string tokenType;
    bool operator==(const TypedToken&) const = default;
  };
  /// `<#extra##description##type#>`
  struct TypedTokenExtra {
    std::string tokenDescription;
    std::string tokenType;
    std::string extra;
    bool operator==(const TypedTokenExtra&) const = default;
  };
  /// `<#extra##description##type##actual type#>`
  struct TypedTokenAlias {
    std::string tokenDescription;
    std::string tokenType;
    std::string extra;
    std::string actualtype;
    bool operator==(const TypedTokenAlias&) const = default;
  };
  std::variant<Unknown, TypedToken, TypedTokenExtra, TypedTokenAlias> payload;

  /// "TypedToken"
  std::string_view caseName() const;
  bool operator==(const PlaceholderMetadata&) const = default;
};

/// A placeholder and its place, delimiters included, in UTF-16 units.
struct EditorPlaceholder {
  TextRange range;
  PlaceholderMetadata metadata;
  bool operator==(const EditorPlaceholder&) const = default;
};

/// The placeholders of a text in its order. A closing delimiter goes with the nearest opening one in front of
/// it that is still unused; the others open and close nothing.
MARLET_EXPORT std::vector<EditorPlaceholder> parseStringForPlaceholders(std::u16string_view text);

/// The occurrences of `needle` by exact units, none overlapping the one before. An empty needle occurs nowhere.
MARLET_EXPORT std::vector<TextRange> rangesOfString(std::u16string_view needle, std::u16string_view inString);

/// From an opening delimiter to a closing one; nothing when another opening stands in front of the closing.
MARLET_EXPORT std::optional<TextRange> matchRange(const TextRange& openingRange,
                                                  const std::optional<TextRange>& nextOpeningRange,
                                                  const TextRange& andClosingRange);

}  // namespace MarletFoundation
