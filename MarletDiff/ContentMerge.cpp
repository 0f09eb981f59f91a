#include "MarletDiff/ContentMerge.h"

#include <algorithm>
#include <cstdint>

#include "MarletDiff/Encoding.h"
#include "MarletDiff/Words.h"
#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletDiff {
namespace {

using MarletFoundation::ErrorObject;
using MarletFoundation::TextRange;
using MarletFoundation::UserInfo;
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

/// A hunk, by its place in the base's own units.
struct Edit {
  std::size_t start;
  std::size_t end;
  std::u16string_view text;
};
using Edits = std::span<const Edit>;

/// The hunks once they are checked.
template <class Unit>
std::vector<Edit> validEdits(View<Unit> base, std::size_t length, Hunks hunks) {
  std::vector<Edit> edits;
  edits.reserve(hunks.size());
  Offsets<Unit> offsets(base);
  std::int64_t done = 0;
  for (const auto& hunk : hunks) {
    const auto& place = hunk.originalRange;
    if (place.location < 0 || place.length < 0 || static_cast<std::size_t>(place.location) > length ||
        static_cast<std::size_t>(place.length) > length - static_cast<std::size_t>(place.location)) {
      throw mergeError(MergeErrorCode::OutOfBounds, place);
    }
    if (place.location < done) throw mergeError(MergeErrorCode::OutOfOrder, place);
    done = place.end();
    const auto start = offsets.at(static_cast<std::size_t>(place.location));
    const auto end = start ? offsets.at(static_cast<std::size_t>(done)) : std::nullopt;
    if (!end) throw mergeError(MergeErrorCode::DividedCharacter, place);
    if (!isEqual(base.substr(*start, *end - *start), hunk.originalContent)) {
      throw mergeError(MergeErrorCode::DifferentText, place);
    }
    edits.push_back({*start, *end, hunk.modifiedContent});
  }
  return edits;
}

/// Whether the word ahead of an edit's place becomes another one, since it goes on into the place, before the
/// change or after it.
template <class Unit>
bool changesWordBefore(View<Unit> base, const Edit& edit) {
  const auto before = base.substr(0, edit.start);
  return wordSpans(base, edit.start) ||
         (edit.text.empty() ? wordSpans(before, base.substr(edit.end)) : wordSpans(before, edit.text));
}

/// The same for the word behind the place.
template <class Unit>
bool changesWordBehind(View<Unit> base, const Edit& edit) {
  const auto behind = base.substr(edit.end);
  return wordSpans(base, edit.end) ||
         (edit.text.empty() ? wordSpans(base.substr(0, edit.start), behind) : wordSpans(edit.text, behind));
}

/// Edits of both sides that must be taken together, and the span of the base that they change.
template <class Unit>
class Cluster {
 public:
  using String = std::basic_string<Unit>;

  Cluster(View<Unit> base, std::size_t start) : base_(base), start_(start), end_(start), wordsEnd_(start) {}

  /// Whether an edit that doesn't start ahead of those taken in belongs to them.
  bool meets(const Edit& edit) const {
    auto at = edit.start;
    if (at <= end_) return true;
    if (changesWordBefore(base_, edit)) {
      do --at;
      while (at >= wordsEnd_ && wordSpans(base_, at));
    }
    return at < wordsEnd_;
  }

  void add(const Edit& edit) {
    end_ = std::max(end_, edit.end);
    // A word that reaches `wordsEnd_` from within ends there, so that none is walked twice.
    if (edit.end < wordsEnd_) return;
    wordsEnd_ = edit.end;
    if (changesWordBehind(base_, edit)) {
      do ++wordsEnd_;
      while (wordSpans(base_, wordsEnd_));
    }
  }

  std::size_t start() const { return start_; }
  std::size_t end() const { return end_; }

  /// Appends what becomes of the cluster's span.
  void appendMerged(Edits edits, Edits otherEdits, String& merged) const {
    if (otherEdits.empty()) return appendRendered(edits, merged);
    if (edits.empty()) return appendRendered(otherEdits, merged);
    String text, otherText;
    appendRendered(edits, text);
    appendRendered(otherEdits, otherText);
    const auto original = base_.substr(start_, end_ - start_);
    if (text != otherText && text != original && otherText != original) throw conflict(text, otherText);
    merged += text == original ? otherText : text;
  }

 private:
  /// The text of the span as one side's edits make it.
  void appendRendered(Edits edits, String& text) const {
    auto at = start_;
    for (const auto& edit : edits) {
      text += base_.substr(at, edit.start - at);
      append(text, edit.text);
      at = edit.end;
    }
    text += base_.substr(at, end_ - at);
  }

  ErrorObject conflict(const String& text, const String& otherText) const {
    const auto original = base_.substr(start_, end_ - start_);
    const TextRange place{static_cast<std::int64_t>(utf16Length(base_.substr(0, start_))),
                          static_cast<std::int64_t>(utf16Length(original))};
    return mergeError(MergeErrorCode::Conflict, place,
                      {{std::string(BaseTextKey), printableUTF8(original)},
                       {std::string(TextKey), printableUTF8(View<Unit>(text))},
                       {std::string(OtherTextKey), printableUTF8(View<Unit>(otherText))}});
  }

  View<Unit> base_;
  std::size_t start_;
  std::size_t end_;
  /// `end_`, or the end of the word that is changed beyond it.
  std::size_t wordsEnd_;
};

/// One side's edits, taken off from the front.
class Side {
 public:
  explicit Side(Edits edits) : edits_(edits) {}
  const Edit* next() const { return taken_ < edits_.size() ? &edits_[taken_] : nullptr; }
  void take() { ++taken_; }
  /// What was taken since the last call.
  Edits taken() {
    const auto result = edits_.first(taken_);
    edits_ = edits_.subspan(taken_);
    taken_ = 0;
    return result;
  }

 private:
  Edits edits_;
  std::size_t taken_ = 0;
};

/// The most units that the hunks' text takes.
template <class Unit>
std::size_t longestText(Hunks hunks) {
  constexpr std::size_t bytesPerUnit = 3;
  std::size_t length = 0;
  for (const auto& hunk : hunks) length += hunk.modifiedContent.size();
  return sizeof(Unit) == 1 ? bytesPerUnit * length : length;
}

template <class Unit>
std::basic_string<Unit> merge(View<Unit> base, Hunks diff, Hunks otherDiff) {
  const auto length = checkedUTF16Length(base);
  const auto edits = validEdits(base, length, diff), otherEdits = validEdits(base, length, otherDiff);
  Side side(edits), otherSide(otherEdits);
  const auto first = [&]() -> Side* {
    const auto *a = side.next(), *b = otherSide.next();
    if (!a || !b) return a ? &side : b ? &otherSide : nullptr;
    if (a->start != b->start) return a->start < b->start ? &side : &otherSide;
    // The one that ties the place to what is in front comes first, whichever side it is of.
    return changesWordBefore(base, *a) ? &side : &otherSide;
  };

  std::basic_string<Unit> merged;
  merged.reserve(base.size() + longestText<Unit>(diff) + longestText<Unit>(otherDiff));
  std::size_t copied = 0;
  while (auto* next = first()) {
    Cluster<Unit> cluster(base, next->next()->start);
    do {
      cluster.add(*next->next());
      next->take();
      next = first();
    } while (next && cluster.meets(*next->next()));
    merged += base.substr(copied, cluster.start() - copied);
    cluster.appendMerged(side.taken(), otherSide.taken(), merged);
    copied = cluster.end();
  }
  merged += base.substr(copied);
  return merged;
}

}  // namespace

std::u16string mergeContent(std::u16string_view base, Hunks diff, Hunks otherDiff) {
  return merge(base, diff, otherDiff);
}

std::string mergeContent(std::string_view base, Hunks diff, Hunks otherDiff) {
  return merge(base, diff, otherDiff);
}

}  // namespace MarletDiff
