#include "MarletFoundation/SourceEditor/LineIndexedBuffer.h"

#include <algorithm>

namespace MarletFoundation {

LineIndexedBuffer::LineIndexedBuffer(std::u16string text)
    : text_(std::make_shared<const std::u16string>(std::move(text))), lineStarts_{0} {
  const auto& units = *text_;
  for (std::size_t i = 0; i < units.size(); ++i) {
    const auto unit = units[i];
    if (unit > u'\r' && unit != u'\u2029') continue;
    const bool isInsideCRLF = unit == u'\r' && i + 1 < units.size() && units[i + 1] == u'\n';
    if (unit == u'\n' || unit == u'\u2029' || (unit == u'\r' && !isInsideCRLF))
      lineStarts_.push_back(static_cast<std::int64_t>(i) + 1);
  }
}

SourceEditorPosition LineIndexedBuffer::positionFromIndex(std::int64_t index, std::int64_t lineHint) const {
  const auto offset = std::clamp<std::int64_t>(index, 0, static_cast<std::int64_t>(text_->size()));
  // The line is kept between `low`, which starts no later than the offset, and `high`, which starts behind it.
  // Both move away from the hint by doubled steps.
  auto low = std::clamp<std::int64_t>(lineHint, 0, lineCount() - 1);
  auto high = low + 1;
  const auto start = [&](std::int64_t line) { return lineStarts_[static_cast<std::size_t>(line)]; };
  for (std::int64_t step = 1; start(low) > offset; step *= 2) {
    high = low;
    low = std::max<std::int64_t>(low - step, 0);
  }
  for (std::int64_t step = 1; high < lineCount() && start(high) <= offset; step *= 2) {
    low = high;
    high = std::min(high + step, lineCount());
  }
  const auto behind =
      std::upper_bound(lineStarts_.begin() + low, lineStarts_.begin() + high, offset) - lineStarts_.begin();
  return {behind - 1, offset - start(behind - 1)};
}

std::int64_t LineIndexedBuffer::indexFromPosition(const SourceEditorPosition& position) const {
  const auto end = static_cast<std::int64_t>(text_->size());
  if (position.line < 0) return 0;
  if (position.line >= lineCount()) return end;
  const auto line = static_cast<std::size_t>(position.line);
  const auto last = line + 1 < lineStarts_.size() ? lineStarts_[line + 1] - 1 : end;
  return lineStarts_[line] + std::clamp<std::int64_t>(position.col, 0, last - lineStarts_[line]);
}

}  // namespace MarletFoundation
