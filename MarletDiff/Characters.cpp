#include "MarletDiff/Characters.h"

#include <algorithm>

#include "MarletFoundation/Platform/Text.h"

namespace MarletDiff {

template <class Unit>
bool Characters<Unit>::alwaysStartsAt(std::size_t offset) const {
  if (offset == 0 || offset == text_.size()) return true;
  const auto before = text_[offset - 1], after = text_[offset];
  return (isASCII(before) && isASCII(after)) || endsLine(before) || endsLine(after);
}

template <class Unit>
bool Characters<Unit>::startsInStretch(std::size_t offset) {
  if (known_.empty()) {
    known_.resize(text_.size());
    starts_.resize(text_.size());
  }
  if (!known_[offset]) cutStretchAround(offset);
  return starts_[offset];
}

template <class Unit>
void Characters<Unit>::cutStretchAround(std::size_t offset) {
  auto start = offset, end = offset;
  while (!alwaysStartsAt(start)) --start;
  while (!alwaysStartsAt(end)) ++end;
  const auto at = [](std::vector<bool>& bits, std::size_t place) {
    return bits.begin() + static_cast<std::ptrdiff_t>(place);
  };
  const auto starts = MarletFoundation::graphemeStarts(text_.substr(start, end - start));
  std::copy(starts.begin(), starts.end(), at(starts_, start));
  std::fill(at(known_, start), at(known_, end), true);
}

template class Characters<char>;
template class Characters<char16_t>;

}  // namespace MarletDiff
