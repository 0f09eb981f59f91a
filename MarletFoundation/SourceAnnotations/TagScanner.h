#pragma once

#include <string_view>

#include "MarletFoundation/SourceAnnotations/SourceTag.h"
#include "MarletFoundation/SourceAnnotations/TagCandidates.h"

namespace MarletFoundation {

/// What lies between two line ends of a text: LF, CR, CR LF or U+2029.
struct LineUnit {
  std::u16string_view text;
  /// Of the unit and behind its line end, in the whole text.
  std::int64_t location;
  std::int64_t enclosingEnd;

  /// The unit that holds the character at `at`, which ends no line.
  static LineUnit around(std::u16string_view text, std::size_t at);
};

/// Calls `use` for each unit that may hold a tag, in order. The others are passed over at memory speed.
template <class Use>
void forEachUnitWithCandidates(std::u16string_view text, const Use& use) {
  for (std::size_t at = nextTagCandidate(text, 0); at != text.npos;) {
    const auto unit = LineUnit::around(text, at);
    use(unit);
    at = nextTagCandidate(text, static_cast<std::size_t>(unit.enclosingEnd));
  }
}

/// Appends the tags and errors of a unit: its line tag, or else its inline tags.
void scanUnit(const LineUnit& unit, SourceTag::ParseResult& result);

}  // namespace MarletFoundation
