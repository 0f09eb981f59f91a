#include "MarletDiff/Characters.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletDiff {

bool isLineStart(std::u16string_view text, std::size_t offset) {
  if (offset == 0) return true;
  const char16_t before = text[offset - 1];
  return before == u'\r' ? offset == text.size() || text[offset] != u'\n' : endsLine(before);
}

bool Characters::alwaysStartsAt(std::size_t offset) const {
  if (offset == 0 || offset == text_.size()) return true;
  const char16_t before = text_[offset - 1], after = text_[offset];
  return (before | after) < 0x80 || endsLine(before) || endsLine(after);
}

bool Characters::startsInStretch(std::size_t offset) {
  if (offset < stretch_ || offset >= stretch_ + starts_.size()) {
    auto end = offset;
    for (stretch_ = offset; !alwaysStartsAt(stretch_);) --stretch_;
    while (!alwaysStartsAt(end)) ++end;
    starts_ = MarletFoundation::graphemeStarts(text_.substr(stretch_, end - stretch_));
  }
  return starts_[offset - stretch_];
}

}  // namespace MarletDiff
