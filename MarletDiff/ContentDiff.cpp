#include "MarletDiff/ContentDiff.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "MarletDiff/Comparison.h"
#include "MarletDiff/Sliding.h"
#include "MarletDiff/Tokens.h"

namespace MarletDiff {
namespace {

/// Work that is allowed for any text, and for each unit of it. The first is as much as it takes to compare
/// two pages of a thousand lines that have every line in common and none in its place.
constexpr std::int64_t leastBudget = std::int64_t{1} << 21;
constexpr std::int64_t budgetPerUnit = 3;

/// Offsets count in 32 bits, with room for differences.
constexpr std::size_t longestText = std::size_t{1} << 30;

constexpr std::size_t blockLength = 2048;

std::size_t commonPrefix(std::u16string_view a, std::u16string_view b) {
  const auto shorter = std::min(a.size(), b.size());
  std::size_t length = 0;
  while (length + blockLength <= shorter &&
         std::memcmp(a.data() + length, b.data() + length, blockLength * sizeof(char16_t)) == 0) {
    length += blockLength;
  }
  while (length < shorter && a[length] == b[length]) ++length;
  return length;
}

std::size_t commonSuffix(std::u16string_view a, std::u16string_view b) {
  const auto shorter = std::min(a.size(), b.size());
  const auto *aEnd = a.data() + a.size(), *bEnd = b.data() + b.size();
  std::size_t length = 0;
  while (length + blockLength <= shorter &&
         std::memcmp(aEnd - length - blockLength, bEnd - length - blockLength,
                     blockLength * sizeof(char16_t)) == 0) {
    length += blockLength;
  }
  while (length < shorter &&
         aEnd[-1 - static_cast<std::ptrdiff_t>(length)] == bEnd[-1 - static_cast<std::ptrdiff_t>(length)]) {
    ++length;
  }
  return length;
}

enum class Level { lines, stretches, words, characters };

/// From this length on, units, a part is compared by stretches of words before it is by words.
constexpr std::uint32_t longPart = 1 << 14;

class ContentDiff {
 public:
  ContentDiff(std::u16string_view original, std::u16string_view modified, bool smallerHunks)
      : original_(original),
        modified_(modified),
        smallerHunks_(smallerHunks),
        budget_(leastBudget + budgetPerUnit * static_cast<std::int64_t>(original.size() + modified.size())) {}

  std::vector<DiffDescriptor> run() {
    const auto differing = withoutEqualLines();
    if (isEmpty(differing)) return {};
    compare(differing, Level::lines);
    slideChanges(original_, modified_, changes_);
    joinTouching();
    std::vector<DiffDescriptor> result;
    result.reserve(changes_.size());
    for (const auto& change : changes_) result.push_back(descriptor(change));
    return result;
  }

 private:
  static bool isEmpty(const Change& c) { return c.original == c.originalEnd && c.modified == c.modifiedEnd; }
  static bool replaces(const Change& c) { return c.original < c.originalEnd && c.modified < c.modifiedEnd; }

  Change withoutEqualLines() const;
  void compare(const Change& part, Level level);
  void add(const Change& change, Level level);
  Level levelBelow(Level level, const Change& change) const;
  void joinTouching();
  Change trimmed(Change change, Level level);
  static bool startsToken(Text& text, std::size_t offset, Level level);
  DiffDescriptor descriptor(const Change& change) const;

  static void cut(Text& text, std::uint32_t start, std::uint32_t end, Level level, Tokens& tokens);

  /// Kept from part to part, for each level that is under way.
  struct Workspace {
    Tokens original;
    Tokens modified;
    Comparison comparison;
  };

  Text original_;
  Text modified_;
  bool smallerHunks_;
  std::int64_t budget_;
  TokenNumbers numbers_;
  std::array<Workspace, 4> workspaces_;
  std::vector<Change> changes_;
};

/// The part that is left when the whole lines that both texts start and end with are taken off.
Change ContentDiff::withoutEqualLines() const {
  const auto a = original_.view, b = modified_.view;
  auto prefix = commonPrefix(a, b);
  while (!isLineStart(a, prefix) || !isLineStart(b, prefix)) --prefix;
  auto suffix = commonSuffix(a.substr(prefix), b.substr(prefix));
  while (suffix > 0 && (!isLineStart(a, a.size() - suffix) || !isLineStart(b, b.size() - suffix))) --suffix;
  const auto offset = [](std::size_t value) { return static_cast<std::uint32_t>(value); };
  return {offset(prefix), offset(a.size() - suffix), offset(prefix), offset(b.size() - suffix)};
}

void ContentDiff::cut(Text& text, std::uint32_t start, std::uint32_t end, Level level, Tokens& tokens) {
  tokens.text = text.view;
  switch (level) {
    case Level::lines:
      return tokens.cutLines(start, end);
    case Level::stretches:
      return tokens.cutStretches(start, end);
    case Level::words:
      return tokens.cutWords(text.characters, start, end);
    case Level::characters:
      return tokens.cutCharacters(text.characters, start, end);
  }
}

/// Adds the changes within a part of the texts, compared token by token.
void ContentDiff::compare(const Change& part, Level level) {
  auto& [original, modified, comparison] = workspaces_[static_cast<std::size_t>(level)];
  cut(original_, part.original, part.originalEnd, level, original);
  cut(modified_, part.modified, part.modifiedEnd, level, modified);
  numbers_.number(original, modified);
  const auto& changes = comparison.changes(original.numbers, modified.numbers, numbers_.size(), budget_);
  for (const auto& change : changes) {
    Change inside{original.starts[change.original], original.starts[change.originalEnd],
                  modified.starts[change.modified], modified.starts[change.modifiedEnd]};
    // What took the place of as many tokens mostly has all words but a few in common with them. Where there are more
    // on one side, words can't tell at which end those are.
    const bool isAsMany = change.originalEnd - change.original == change.modifiedEnd - change.modified;
    if (smallerHunks_ && level < Level::words && isAsMany) inside = trimmed(inside, Level::words);
    add(inside, level);
  }
}

/// Adds a change that was found at a level, or what it comes to at the levels below.
void ContentDiff::add(const Change& change, Level level) {
  if (!smallerHunks_ || !replaces(change)) {
    changes_.push_back(change);
  } else if (level == Level::characters || budget_ <= 0) {
    changes_.push_back(trimmed(change, Level::characters));
  } else {
    compare(change, levelBelow(level, change));
  }
}

Level ContentDiff::levelBelow(Level level, const Change& change) const {
  const auto isOneWord = [](std::u16string_view text, std::uint32_t start, std::uint32_t end) {
    return std::all_of(text.begin() + start, text.begin() + end, isWordUnit);
  };
  if (level == Level::words || (isOneWord(original_.view, change.original, change.originalEnd) &&
                                isOneWord(modified_.view, change.modified, change.modifiedEnd))) {
    return Level::characters;
  }
  const auto length = std::min(change.originalEnd - change.original, change.modifiedEnd - change.modified);
  return level == Level::lines && length >= longPart ? Level::stretches : Level::words;
}

void ContentDiff::joinTouching() {
  std::vector<Change> joined;
  for (const auto& change : changes_) {
    if (joined.empty() || joined.back().originalEnd < change.original) {
      joined.push_back(change);
      continue;
    }
    auto& last = joined.back();
    last.originalEnd = change.originalEnd;
    last.modifiedEnd = change.modifiedEnd;
    if (smallerHunks_) last = trimmed(last, Level::characters);
  }
  changes_ = std::move(joined);
}

/// The change without the whole words, or characters, that both its texts start and end with.
Change ContentDiff::trimmed(Change change, Level level) {
  const auto a = original_.view.substr(change.original, change.originalEnd - change.original);
  const auto b = modified_.view.substr(change.modified, change.modifiedEnd - change.modified);
  const auto bothStartAt = [&](std::size_t offset, std::size_t otherOffset) {
    return startsToken(original_, offset, level) && startsToken(modified_, otherOffset, level);
  };
  auto prefix = static_cast<std::uint32_t>(commonPrefix(a, b));
  while (prefix > 0 && !bothStartAt(change.original + prefix, change.modified + prefix)) --prefix;
  auto suffix = static_cast<std::uint32_t>(commonSuffix(a.substr(prefix), b.substr(prefix)));
  while (suffix > 0 && !bothStartAt(change.originalEnd - suffix, change.modifiedEnd - suffix)) --suffix;
  return {change.original + prefix, change.originalEnd - suffix, change.modified + prefix,
          change.modifiedEnd - suffix};
}

bool ContentDiff::startsToken(Text& text, std::size_t offset, Level level) {
  if (!text.characters.startAt(offset)) return false;
  const bool isWithin = offset > 0 && offset < text.view.size();
  return level == Level::characters || !isWithin || !isWordUnit(text.view[offset - 1]) ||
         !isWordUnit(text.view[offset]);
}

DiffDescriptor ContentDiff::descriptor(const Change& change) const {
  const auto range = [](std::uint32_t start, std::uint32_t end) {
    return MarletFoundation::TextRange{start, end - start};
  };
  return {range(change.original, change.originalEnd), range(change.modified, change.modifiedEnd),
          std::u16string(original_.view.substr(change.original, change.originalEnd - change.original)),
          std::u16string(modified_.view.substr(change.modified, change.modifiedEnd - change.modified))};
}

}  // namespace

std::vector<DiffDescriptor> diffContent(std::u16string_view original, std::u16string_view modified,
                                        std::optional<DiffOptions> options) {
  if (original.size() > longestText || modified.size() > longestText) {
    if (original == modified) return {};
    return {{{0, std::ssize(original)},
             {0, std::ssize(modified)},
             std::u16string(original),
             std::u16string(modified)}};
  }
  return ContentDiff(original, modified, options && options->contains(DiffOptions::SmallerHunks)).run();
}

}  // namespace MarletDiff
