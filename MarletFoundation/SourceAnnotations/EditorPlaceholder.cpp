#include "MarletFoundation/SourceAnnotations/EditorPlaceholder.h"

#include <algorithm>

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::u16string_view opening = u"<#";
constexpr std::u16string_view closing = u"#>";
constexpr std::u16string_view separator = u"##";

PlaceholderMetadata metadata(std::u16string_view inner) {
  std::vector<std::string> parts;
  std::size_t start = 0;
  for (const auto& range : rangesOfString(separator, inner)) {
    const auto at = static_cast<std::size_t>(range.location);
    parts.push_back(utf8FromUTF16Lossy(inner.substr(start, at - start)));
    start = at + separator.size();
  }
  parts.push_back(utf8FromUTF16Lossy(inner.substr(start)));
  switch (parts.size()) {
    case 2:
      return {PlaceholderMetadata::TypedToken{parts[0], parts[1]}};
    case 3:
      return {PlaceholderMetadata::TypedTokenExtra{parts[1], parts[2], parts[0]}};
    case 4:
      return {PlaceholderMetadata::TypedTokenAlias{parts[1], parts[2], parts[0], parts[3]}};
    default:
      return {PlaceholderMetadata::Unknown{utf8FromUTF16Lossy(inner)}};
  }
}

EditorPlaceholder placeholder(std::u16string_view text, const TextRange& range) {
  const auto delimiters = opening.size() + closing.size();
  const auto length = static_cast<std::size_t>(range.length);
  // In `<#>` the delimiters share their "#", and nothing lies between them.
  const auto inner =
      length < delimiters
          ? std::u16string_view()
          : text.substr(static_cast<std::size_t>(range.location) + opening.size(), length - delimiters);
  return {range, metadata(inner)};
}

}  // namespace

std::string_view PlaceholderMetadata::caseName() const {
  constexpr std::string_view names[] = {"Unknown", "TypedToken", "TypedTokenExtra", "TypedTokenAlias"};
  return names[payload.index()];
}

std::vector<TextRange> rangesOfString(std::u16string_view needle, std::u16string_view inString) {
  std::vector<TextRange> ranges;
  if (needle.empty()) return ranges;
  for (auto at = inString.find(needle); at != inString.npos; at = inString.find(needle, at + needle.size()))
    ranges.push_back({static_cast<std::int64_t>(at), static_cast<std::int64_t>(needle.size())});
  return ranges;
}

std::optional<TextRange> matchRange(const TextRange& openingRange,
                                    const std::optional<TextRange>& nextOpeningRange,
                                    const TextRange& andClosingRange) {
  if (nextOpeningRange && andClosingRange.location >= nextOpeningRange->location) return std::nullopt;
  const auto start = std::min(openingRange.location, andClosingRange.location);
  return TextRange{start, std::max(openingRange.end(), andClosingRange.end()) - start};
}

std::vector<EditorPlaceholder> parseStringForPlaceholders(std::u16string_view text) {
  std::vector<EditorPlaceholder> placeholders;
  const auto openings = rangesOfString(opening, text);
  std::size_t next = 0;
  for (const auto& end : rangesOfString(closing, text)) {
    for (; next < openings.size() && openings[next].location < end.location; ++next) {
      const auto following =
          next + 1 < openings.size() ? std::optional<TextRange>(openings[next + 1]) : std::nullopt;
      if (const auto range = matchRange(openings[next], following, end))
        placeholders.push_back(placeholder(text, *range));
    }
  }
  return placeholders;
}

}  // namespace MarletFoundation
