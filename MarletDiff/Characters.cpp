#include "MarletDiff/Characters.h"

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
  if (offset < stretch_ || offset >= stretch_ + starts_.size()) {
    auto end = offset;
    for (stretch_ = offset; !alwaysStartsAt(stretch_);) --stretch_;
    while (!alwaysStartsAt(end)) ++end;
    starts_ = MarletFoundation::graphemeStarts(text_.substr(stretch_, end - stretch_));
  }
  return starts_[offset - stretch_];
}

template class Characters<char>;
template class Characters<char16_t>;

}  // namespace MarletDiff
