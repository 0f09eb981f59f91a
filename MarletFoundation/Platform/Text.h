#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Strict conversions: ill-formed UTF-8 (overlong, surrogates, truncated) and unpaired surrogates give
/// nothing. A byte-order mark is a character like any other.
MARLET_EXPORT std::optional<std::u16string> utf16FromUTF8(std::string_view text);
MARLET_EXPORT std::optional<std::string> utf8FromUTF16(std::u16string_view text);
MARLET_EXPORT bool isValidUTF8(std::string_view text);
/// How many UTF-16 units a text in UTF-8 takes; nothing for an ill-formed one.
MARLET_EXPORT std::optional<std::size_t> utf16Length(std::string_view text);
/// Bytes in front of the first one that isn't ASCII, or that belongs to no well-formed UTF-8 character.
MARLET_EXPORT std::size_t asciiPrefixLength(std::string_view text);
MARLET_EXPORT std::size_t utf8PrefixLength(std::string_view text);

/// Conversions for printing only: what is ill-formed becomes U+FFFD.
MARLET_EXPORT std::string utf8FromUTF16Lossy(std::u16string_view text);

/// Number of user-perceived characters (extended grapheme clusters). ASCII is counted without ICU.
MARLET_EXPORT std::int64_t graphemeCount(std::string_view text);

/// Byte offset just behind the first `count` characters from byte offset `from` on; the end of the text when
/// there are fewer. Linear in the bytes passed over when called run after run.
MARLET_EXPORT std::size_t graphemeRunEnd(std::string_view text, std::size_t from, std::int64_t count);

/// For each offset of a text, whether a character starts there. An unpaired surrogate is a character of its own;
/// UTF-8 must be well-formed.
MARLET_EXPORT std::vector<bool> graphemeStarts(std::u16string_view text);
MARLET_EXPORT std::vector<bool> graphemeStarts(std::string_view text);

/// Equality by Unicode canonical equivalence.
MARLET_EXPORT bool canonicallyEquivalent(std::string_view a, std::string_view b);

/// A decimal integer: an optional sign, then ASCII digits and nothing else. Nothing when it doesn't fit.
MARLET_EXPORT std::optional<std::int64_t> parseDecimalInteger(std::string_view text);

/// The shortest decimal form that reads back as the same number, without an exponent and always with a point:
/// `500000000.0`.
MARLET_EXPORT std::string shortestDecimal(double number);

/// The pieces between separators, as views into `text`; an empty text gives one empty piece.
MARLET_EXPORT std::vector<std::string_view> split(std::string_view text, char separator);

/// The debug form of a string: in double quotes, with `"`, `\` and control characters escaped.
MARLET_EXPORT std::string quoted(std::string_view text);
/// The debug form of an optional string: `Optional("text")` or `nil`. The text stands as it is.
MARLET_EXPORT std::string optionalDescription(const std::optional<std::string>& text);

}  // namespace MarletFoundation
