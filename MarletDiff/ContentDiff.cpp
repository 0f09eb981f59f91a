#include "MarletDiff/ContentDiff.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "MarletDiff/Comparison.h"
#include "MarletDiff/Encoding.h"
#include "MarletDiff/Sliding.h"
#include "MarletDiff/Tokens.h"
#include "MarletDiff/Words.h"
#include "MarletDiff/WorkMemory.h"

namespace MarletDiff {
namespace {

/// Work that is allowed for any text, and for each unit of it. The first is as much as it takes to compare
/// two pages of a thousand lines that have every line in common and none in its place.
constexpr std::int64_t leastBudget = std::int64_t{1} << 21;
constexpr std::int64_t budgetPerUnit = 3;

/// Offsets count in 32 bits, with room for differences.
constexpr std::size_t longestText = std::size_t{1} << 30;

/// What the lists of a comparison take of memory for each unit, where lines are as long as most are.
constexpr std::size_t workBytesPerUnit = 2;

constexpr std::size_t blockLength = 2048;

template <class Unit>
std::size_t commonPrefix(View<Unit> a, View<Unit> b) {
  const auto shorter = std::min(a.size(), b.size());
  std::size_t length = 0;
  while (length + blockLength <= shorter &&
         std::memcmp(a.data() + length, b.data() + length, blockLength * sizeof(Unit)) == 0) {
    length += blockLength;
  }
  while (length < shorter && a[length] == b[length]) ++length;
  return length;
}

template <class Unit>
std::size_t commonSuffix(View<Unit> a, View<Unit> b) {
  const auto shorter = std::min(a.size(), b.size());
  const auto *aEnd = a.data() + a.size(), *bEnd = b.data() + b.size();
  std::size_t length = 0;
  while (length + blockLength <= shorter &&
         std::memcmp(aEnd - length - blockLength, bEnd - length - blockLength, blockLength * sizeof(Unit)) ==
             0) {
    length += blockLength;
  }
  while (length < shorter &&
         aEnd[-1 - static_cast<std::ptrdiff_t>(length)] == bEnd[-1 - static_cast<std::ptrdiff_t>(length)]) {
    ++length;
  }
  return length;
}

/// The part that is left when the whole lines that both texts start and end with are taken off.
template <class Unit>
Change withoutEqualLines(View<Unit> a, View<Unit> b) {
  auto prefix = commonPrefix(a, b);
  while (!isLineStart(a, prefix) || !isLineStart(b, prefix)) --prefix;
  auto suffix = commonSuffix(a.substr(prefix), b.substr(prefix));
  while (suffix > 0 && (!isLineStart(a, a.size() - suffix) || !isLineStart(b, b.size() - suffix))) --suffix;
  const auto offset = [](std::size_t value) { return static_cast<std::uint32_t>(value); };
  return {offset(prefix), offset(a.size() - suffix), offset(prefix), offset(b.size() - suffix)};
}

/// Of both sides, in the texts' own units.
std::size_t partLength(const Change& change) {
  return std::size_t{change.originalEnd - change.original} + (change.modifiedEnd - change.modified);
}

enum class Level { blocks, lines, stretches, words, characters };

/// From this length on, UTF-16 units of both, texts are compared by blocks of lines before they are by lines: the lists
/// of a comparison then stay within the processor's caches.
constexpr std::size_t longTexts = std::size_t{1} << 21;

/// From this length on, UTF-16 units, a part is compared by stretches of words before it is by words.
constexpr std::size_t longPart = 1 << 14;

template <class Unit>
bool isLong(View<Unit> text) {
  return text.size() >= longPart && utf16Length(text) >= longPart;
}

template <class Unit>
bool isOneWord(View<Unit> text) {
  std::size_t at = 1;
  while (at < text.size() && wordSpans(text, at)) ++at;
  return at >= text.size();
}

/// Whatever is decided by a length counts UTF-16 units, so that the hunks don't depend on the texts' encoding.
template <class Unit>
class ContentDiff {
 public:
  /// `length` is that of both texts together, UTF-16 units. Takes the work off `budget`.
  ContentDiff(View<Unit> original, View<Unit> modified, std::size_t length, bool smallerHunks,
              std::int64_t& budget)
      : original_(original),
        modified_(modified),
        smallerHunks_(smallerHunks),
        isLong_(length >= longTexts),
        budget_(budget),
        differing_(withoutEqualLines(original, modified)),
        memory_(workBytesPerUnit * partLength(differing_)) {}

  std::vector<DiffDescriptor> run() {
    if (partLength(differing_) == 0) return {};
    compare(differing_, isLong_ ? Level::blocks : Level::lines);
    slideChanges(original_, modified_, changes_);
    joinTouching();
    return descriptors();
  }

 private:
  static bool replaces(const Change& c) { return c.original < c.originalEnd && c.modified < c.modifiedEnd; }

  void compare(const Change& part, Level level);
  void add(const Change& change, Level level);
  Level levelBelow(Level level, const Change& change) const;
  void joinTouching();
  Change trimmed(Change change, Level level);
  static bool startsToken(Text<Unit>& text, std::size_t offset, Level level);
  std::vector<DiffDescriptor> descriptors() const;

  static void cut(Text<Unit>& text, std::uint32_t start, std::uint32_t end, Level level,
                  Tokens<Unit>& tokens);

  /// Kept from part to part, for each level that is under way.
  struct Workspace {
    explicit Workspace(std::pmr::memory_resource* memory)
        : original(memory), modified(memory), comparison(memory) {}
    Tokens<Unit> original;
    Tokens<Unit> modified;
    Comparison comparison;
  };

  Text<Unit> original_;
  Text<Unit> modified_;
  bool smallerHunks_;
  bool isLong_;
  std::int64_t& budget_;
  /// Its own, so that blocks leave the lines theirs.
  std::int64_t blocksBudget_ = leastBudget;
  Change differing_;
  WorkMemory memory_;
  TokenNumbers<Unit> numbers_{&memory_};
  std::array<Workspace, 5> workspaces_{Workspace(&memory_), Workspace(&memory_), Workspace(&memory_),
                                       Workspace(&memory_), Workspace(&memory_)};
  std::pmr::vector<Change> changes_{&memory_};
};

template <class Unit>
void ContentDiff<Unit>::cut(Text<Unit>& text, std::uint32_t start, std::uint32_t end, Level level,
                            Tokens<Unit>& tokens) {
  tokens.text = text.view;
  switch (level) {
    case Level::blocks:
      return tokens.cutBlocks(start, end);
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
template <class Unit>
void ContentDiff<Unit>::compare(const Change& part, Level level) {
  auto& [original, modified, comparison] = workspaces_[static_cast<std::size_t>(level)];
  cut(original_, part.original, part.originalEnd, level, original);
  cut(modified_, part.modified, part.modifiedEnd, level, modified);
  numbers_.number(original, modified);
  const auto& changes = comparison.changes(original.numbers, modified.numbers, numbers_.size(),
                                           level == Level::blocks ? blocksBudget_ : budget_);
  for (const auto& change : changes) {
    Change inside{original.starts[change.original], original.starts[change.originalEnd],
                  modified.starts[change.modified], modified.starts[change.modifiedEnd]};
    // What took the place of as many tokens mostly has all words but a few in common with them. Where there are more
    // on one side, words can't tell at which end those are.
    const bool isAsMany = change.originalEnd - change.original == change.modifiedEnd - change.modified;
    const bool ofLinesOrStretches = level == Level::lines || level == Level::stretches;
    if (smallerHunks_ && ofLinesOrStretches && isAsMany) inside = trimmed(inside, Level::words);
    add(inside, level);
  }
}

/// Adds a change that was found at a level, or what it comes to at the levels below.
template <class Unit>
void ContentDiff<Unit>::add(const Change& change, Level level) {
  if (level == Level::blocks && replaces(change)) {
    compare(change, Level::lines);
  } else if (!smallerHunks_ || !replaces(change)) {
    changes_.push_back(change);
  } else if (level == Level::characters || budget_ <= 0) {
    changes_.push_back(trimmed(change, Level::characters));
  } else {
    compare(change, levelBelow(level, change));
  }
}

template <class Unit>
Level ContentDiff<Unit>::levelBelow(Level level, const Change& change) const {
  const auto a = original_.view.substr(change.original, change.originalEnd - change.original);
  const auto b = modified_.view.substr(change.modified, change.modifiedEnd - change.modified);
  if (level == Level::words || (isOneWord(a) && isOneWord(b))) return Level::characters;
  return level == Level::lines && isLong(a) && isLong(b) ? Level::stretches : Level::words;
}

template <class Unit>
void ContentDiff<Unit>::joinTouching() {
  std::pmr::vector<Change> joined(&memory_);
  bool isUntrimmed = false;
  const auto trimLast = [&] {
    if (isUntrimmed) joined.back() = trimmed(joined.back(), Level::characters);
    isUntrimmed = false;
  };
  for (const auto& change : changes_) {
    if (joined.empty() || joined.back().originalEnd < change.original) {
      trimLast();
      joined.push_back(change);
      continue;
    }
    auto& last = joined.back();
    last.originalEnd = change.originalEnd;
    last.modifiedEnd = change.modifiedEnd;
    isUntrimmed = smallerHunks_;
    // Trimmed at once it may touch the next one no more. A long row of changes is trimmed as a whole.
    if (budget_ <= 0) continue;
    budget_ -= static_cast<std::int64_t>(partLength(last));
    trimLast();
  }
  trimLast();
  changes_ = std::move(joined);
}

/// The change without the whole words, or characters, that both its texts start and end with.
template <class Unit>
Change ContentDiff<Unit>::trimmed(Change change, Level level) {
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

template <class Unit>
bool ContentDiff<Unit>::startsToken(Text<Unit>& text, std::size_t offset, Level level) {
  if (!text.characters.startAt(offset)) return false;
  return level == Level::characters || !wordSpans(text.view, offset);
}

template <class Unit>
std::vector<DiffDescriptor> ContentDiff<Unit>::descriptors() const {
  std::vector<DiffDescriptor> result;
  result.reserve(changes_.size());
  std::uint32_t done = 0;
  std::int64_t at = 0, modifiedAt = 0;
  for (const auto& change : changes_) {
    // The text since the last change is equal, and as long on both sides.
    const auto between =
        static_cast<std::int64_t>(utf16Length(original_.view.substr(done, change.original - done)));
    auto content = utf16(original_.view.substr(change.original, change.originalEnd - change.original));
    auto modified = utf16(modified_.view.substr(change.modified, change.modifiedEnd - change.modified));
    const MarletFoundation::TextRange range{at + between, std::ssize(content)};
    const MarletFoundation::TextRange modifiedRange{modifiedAt + between, std::ssize(modified)};
    result.push_back({range, modifiedRange, std::move(content), std::move(modified)});
    done = change.originalEnd;
    at = range.end();
    modifiedAt = modifiedRange.end();
  }
  return result;
}

bool asksForSmallerHunks(const std::optional<DiffOptions>& options) {
  return options && options->contains(DiffOptions::SmallerHunks);
}

}  // namespace

std::int64_t diffBudget(std::size_t length) {
  return leastBudget + budgetPerUnit * static_cast<std::int64_t>(length);
}

std::vector<DiffDescriptor> diffContent(std::u16string_view original, std::u16string_view modified,
                                        std::optional<DiffOptions> options) {
  auto budget = diffBudget(original.size() + modified.size());
  return diffContent(original, modified, options, budget);
}

std::vector<DiffDescriptor> diffContent(std::u16string_view original, std::u16string_view modified,
                                        std::optional<DiffOptions> options, std::int64_t& budget) {
  if (original.size() > longestText || modified.size() > longestText) {
    if (original == modified) return {};
    return {{{0, std::ssize(original)},
             {0, std::ssize(modified)},
             std::u16string(original),
             std::u16string(modified)}};
  }
  const auto length = original.size() + modified.size();
  return ContentDiff(original, modified, length, asksForSmallerHunks(options), budget).run();
}

std::vector<DiffDescriptor> diffContent(std::string_view original, std::string_view modified,
                                        std::optional<DiffOptions> options) {
  const auto length = checkedUTF16Length(original) + checkedUTF16Length(modified);
  if (original.size() > longestText || modified.size() > longestText) {
    return diffContent(utf16(original), utf16(modified), options);
  }
  auto budget = diffBudget(length);
  return ContentDiff(original, modified, length, asksForSmallerHunks(options), budget).run();
}

}  // namespace MarletDiff
