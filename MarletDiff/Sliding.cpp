#include "MarletDiff/Sliding.h"

#include <algorithm>
#include <utility>

#include "MarletDiff/Words.h"

namespace MarletDiff {
namespace {

template <class Unit>
bool startsWith(View<Unit> text, std::string_view ascii) {
  return text.size() >= ascii.size() && std::equal(ascii.begin(), ascii.end(), text.begin());
}

template <class Unit>
bool endsWith(View<Unit> text, std::string_view ascii) {
  return text.size() >= ascii.size() &&
         std::equal(ascii.begin(), ascii.end(), text.end() - std::ssize(ascii));
}

/// Whether a place stands within a comment's delimiter. A quote beside a comment is a part of it: what is
/// written between the quotes of a field is then not taken for text behind the field.
template <class Unit>
bool dividesDelimiter(View<Unit> before, View<Unit> after) {
  return (endsWith(before, "/") && startsWith(after, "*")) ||
         (endsWith(before, "*") && startsWith(after, "/")) ||
         (endsWith(before, "\"") && startsWith(after, "/*")) ||
         (endsWith(before, "*/") && startsWith(after, "\""));
}

/// How good a place is to start or end a change at.
template <class Unit>
int rank(View<Unit> text, std::size_t offset) {
  if (offset == text.size() || isLineStart(text, offset)) return 5;
  const auto before = text.substr(0, offset), after = text.substr(offset);
  // If it can be helped, text beside a comment is not taken for a part of it.
  if (dividesDelimiter(before, after)) return 0;
  const bool opens = startsWith(after, "/*") || startsWith(after, "\"/*");
  const bool closes = endsWith(before, "*/") || endsWith(before, "*/\"");
  if (opens || closes) return 4;
  if (wordSpans(text, offset)) return 0;
  const bool wordBefore = endsWithWord(before), wordAfter = startsWithWord(after);
  if (wordAfter) return wordBefore ? 1 : 3;
  return wordBefore ? 2 : 1;
}

struct Score {
  int worse = -1;
  int sum = 0;
  bool standsAlone = false;
  auto operator<=>(const Score&) const = default;
};

template <class Unit>
Score score(Text<Unit>& original, Text<Unit>& modified, const Change& change, bool standsAlone) {
  const bool wholeCharacters =
      original.characters.startAt(change.original) && original.characters.startAt(change.originalEnd) &&
      modified.characters.startAt(change.modified) && modified.characters.startAt(change.modifiedEnd);
  if (!wholeCharacters) return {};
  const auto start = rank(original.view, change.original), end = rank(original.view, change.originalEnd);
  return {std::min(start, end), start + end, standsAlone};
}

Change moved(const Change& change, std::int64_t by) {
  const auto add = [&](std::uint32_t offset) { return static_cast<std::uint32_t>(offset + by); };
  return {add(change.original), add(change.originalEnd), add(change.modified), add(change.modifiedEnd)};
}

}  // namespace

template <class Unit>
void slideChanges(Text<Unit>& original, Text<Unit>& modified, std::pmr::vector<Change>& changes) {
  for (std::size_t i = 0; i < changes.size(); ++i) {
    auto& change = changes[i];
    const bool inserts = change.original == change.originalEnd;
    if (!inserts && change.modified != change.modifiedEnd) continue;
    const auto text = inserts ? modified.view : original.view;
    const auto start = inserts ? change.modified : change.original;
    const auto end = inserts ? change.modifiedEnd : change.originalEnd;
    const bool isFirst = i == 0, isLast = i + 1 == changes.size();
    const std::int64_t before = change.original - (isFirst ? 0 : changes[i - 1].originalEnd);
    const std::int64_t behind =
        (isLast ? std::ssize(original.view) : changes[i + 1].original) - std::int64_t{change.originalEnd};
    std::int64_t back = 0, ahead = 0;
    while (back < before && text[start - 1 - back] == text[end - 1 - back]) ++back;
    while (ahead < behind && text[start + ahead] == text[end + ahead]) ++ahead;
    if (back == 0 && ahead == 0) continue;

    auto best = change;
    Score bestScore;
    for (auto by = -back; by <= ahead; ++by) {
      const auto candidate = moved(change, by);
      const bool touches = (by == -before && !isFirst) || (by == behind && !isLast);
      const auto candidateScore = score(original, modified, candidate, !touches);
      if (candidateScore < bestScore) continue;
      best = candidate;
      bestScore = candidateScore;
    }
    change = best;
  }
}

template void slideChanges(Text<char>&, Text<char>&, std::pmr::vector<Change>&);
template void slideChanges(Text<char16_t>&, Text<char16_t>&, std::pmr::vector<Change>&);

}  // namespace MarletDiff
