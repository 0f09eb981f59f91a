#include "MarletDiff/ContentMerge.h"

#include <algorithm>
#include <cstdint>

#include "MarletDiff/Characters.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletDiff {
namespace {

using MarletFoundation::ErrorObject;
using MarletFoundation::TextRange;
using MarletFoundation::UserInfo;
using MarletFoundation::utf8FromUTF16Lossy;
using Hunks = std::span<const DiffDescriptor>;

struct MergeErrorWords {
  std::string_view beforePlace;
  std::string_view afterPlace;
};

MergeErrorWords words(MergeErrorCode code) {
  switch (code) {
    case MergeErrorCode::OutOfBounds:
      return {"The change at ", " reaches beyond the text."};
    case MergeErrorCode::OutOfOrder:
      return {"The change at ", " starts ahead of the end of the one before it."};
    case MergeErrorCode::DividedCharacter:
      return {"The change at ", " divides a character."};
    case MergeErrorCode::DifferentText:
      return {"The change at ", " is of other text than stands there."};
    case MergeErrorCode::Conflict:
      return {"Both sides change the text at ", " in different ways."};
  }
  return {};
}

ErrorObject mergeError(MergeErrorCode code, const TextRange& place, UserInfo details = {}) {
  const auto [before, after] = words(code);
  const auto printed = "{" + std::to_string(place.location) + ", " + std::to_string(place.length) + "}";
  details.emplace(MarletFoundation::LocalizedDescriptionKey,
                  std::string(before) + printed + std::string(after));
  details.emplace(LocationKey, place.location);
  details.emplace(LengthKey, place.length);
  return {std::string(ErrorDomain), static_cast<int>(code), std::move(details)};
}

std::u16string_view textAt(std::u16string_view base, std::int64_t start, std::int64_t end) {
  return base.substr(static_cast<std::size_t>(start), static_cast<std::size_t>(end - start));
}

bool dividesCharacter(std::u16string_view base, std::int64_t at) {
  if (at <= 0 || at >= std::ssize(base)) return false;
  const auto offset = static_cast<std::size_t>(at);
  return (base[offset - 1] & 0xFC00) == 0xD800 && (base[offset] & 0xFC00) == 0xDC00;
}

void validate(std::u16string_view base, Hunks hunks) {
  std::int64_t end = 0;
  for (const auto& hunk : hunks) {
    const auto& place = hunk.originalRange;
    if (place.location < 0 || place.location > std::ssize(base) || place.length < 0 ||
        place.length > std::ssize(base) - place.location) {
      throw mergeError(MergeErrorCode::OutOfBounds, place);
    }
    if (place.location < end) throw mergeError(MergeErrorCode::OutOfOrder, place);
    end = place.end();
    if (dividesCharacter(base, place.location) || dividesCharacter(base, end)) {
      throw mergeError(MergeErrorCode::DividedCharacter, place);
    }
    if (textAt(base, place.location, end) != hunk.originalContent) {
      throw mergeError(MergeErrorCode::DifferentText, place);
    }
  }
}

bool isWordUnitAt(std::u16string_view text, std::int64_t at) {
  return at >= 0 && at < std::ssize(text) && isWordUnit(text[static_cast<std::size_t>(at)]);
}

/// Whether the word ahead of a hunk's place becomes another one, since it goes on into the place, before the
/// change or after it.
bool changesWordBefore(std::u16string_view base, const DiffDescriptor& hunk) {
  const auto& place = hunk.originalRange;
  const auto& text = hunk.modifiedContent;
  const bool joins = text.empty() ? isWordUnitAt(base, place.end()) : isWordUnit(text.front());
  return isWordUnitAt(base, place.location) || joins;
}

/// The same for the word behind the place.
bool changesWordBehind(std::u16string_view base, const DiffDescriptor& hunk) {
  const auto& place = hunk.originalRange;
  const auto& text = hunk.modifiedContent;
  const bool joins = text.empty() ? isWordUnitAt(base, place.location - 1) : isWordUnit(text.back());
  return isWordUnitAt(base, place.end() - 1) || joins;
}

/// Hunks of both sides that must be taken together, and the span of the base that they change.
class Cluster {
 public:
  Cluster(std::u16string_view base, std::int64_t start)
      : base_(base), start_(start), end_(start), wordsEnd_(start) {}

  /// Whether a hunk that doesn't start ahead of those taken in belongs to them.
  bool meets(const DiffDescriptor& hunk) const {
    auto at = hunk.originalRange.location;
    if (at <= end_) return true;
    if (changesWordBefore(base_, hunk)) {
      while (at >= wordsEnd_ && isWordUnitAt(base_, at - 1)) --at;
    }
    return at < wordsEnd_;
  }

  void add(const DiffDescriptor& hunk) {
    const auto hunkEnd = hunk.originalRange.end();
    end_ = std::max(end_, hunkEnd);
    // A word that reaches `wordsEnd_` from within ends there, so that none is walked twice.
    if (hunkEnd < wordsEnd_) return;
    wordsEnd_ = hunkEnd;
    if (changesWordBehind(base_, hunk)) {
      while (isWordUnitAt(base_, wordsEnd_)) ++wordsEnd_;
    }
  }

  std::int64_t start() const { return start_; }
  std::int64_t end() const { return end_; }

  /// The text of the cluster's span as one side's `hunks` make it.
  std::u16string render(Hunks hunks) const {
    std::u16string text;
    auto at = start_;
    for (const auto& hunk : hunks) {
      text += textAt(base_, at, hunk.originalRange.location);
      text += hunk.modifiedContent;
      at = hunk.originalRange.end();
    }
    text += textAt(base_, at, end_);
    return text;
  }

  std::u16string merge(Hunks hunks, Hunks otherHunks) const {
    if (otherHunks.empty()) return render(hunks);
    if (hunks.empty()) return render(otherHunks);
    auto text = render(hunks), otherText = render(otherHunks);
    const auto original = textAt(base_, start_, end_);
    if (text == otherText || otherText == original) return text;
    if (text == original) return otherText;
    throw mergeError(MergeErrorCode::Conflict, {start_, end_ - start_},
                     {{std::string(BaseTextKey), utf8FromUTF16Lossy(original)},
                      {std::string(TextKey), utf8FromUTF16Lossy(text)},
                      {std::string(OtherTextKey), utf8FromUTF16Lossy(otherText)}});
  }

 private:
  std::u16string_view base_;
  std::int64_t start_;
  std::int64_t end_;
  /// `end_`, or the end of the word that is changed beyond it.
  std::int64_t wordsEnd_;
};

/// One side's hunks, taken off from the front.
class Side {
 public:
  explicit Side(Hunks hunks) : hunks_(hunks) {}
  const DiffDescriptor* next() const { return taken_ < hunks_.size() ? &hunks_[taken_] : nullptr; }
  void take() { ++taken_; }
  /// What was taken since the last call.
  Hunks taken() {
    const auto result = hunks_.first(taken_);
    hunks_ = hunks_.subspan(taken_);
    taken_ = 0;
    return result;
  }

 private:
  Hunks hunks_;
  std::size_t taken_ = 0;
};

}  // namespace

std::u16string mergeContent(std::u16string_view base, Hunks diff, Hunks otherDiff) {
  validate(base, diff);
  validate(base, otherDiff);

  Side side(diff), otherSide(otherDiff);
  const auto first = [&]() -> Side* {
    const auto *a = side.next(), *b = otherSide.next();
    if (!a || !b) return a ? &side : b ? &otherSide : nullptr;
    const auto at = a->originalRange.location, otherAt = b->originalRange.location;
    if (at != otherAt) return at < otherAt ? &side : &otherSide;
    // The one that ties the place to what is in front comes first, whichever side it is of.
    return changesWordBefore(base, *a) ? &side : &otherSide;
  };

  std::u16string merged;
  auto longest = base.size();
  for (const auto hunks : {diff, otherDiff}) {
    for (const auto& hunk : hunks) longest += hunk.modifiedContent.size();
  }
  merged.reserve(longest);
  std::int64_t copied = 0;
  while (auto* next = first()) {
    Cluster cluster(base, next->next()->originalRange.location);
    do {
      cluster.add(*next->next());
      next->take();
      next = first();
    } while (next && cluster.meets(*next->next()));
    merged += textAt(base, copied, cluster.start());
    merged += cluster.merge(side.taken(), otherSide.taken());
    copied = cluster.end();
  }
  merged += textAt(base, copied, std::ssize(base));
  return merged;
}

}  // namespace MarletDiff
