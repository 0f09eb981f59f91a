#pragma once

#include <vector>

#include "MarletFoundation/SourceEditor/SourceEditorBuffer.h"

namespace MarletFoundation {

/// A buffer over a text that doesn't change, for hosts without a text object of their own. Columns count
/// UTF-16 units. Lines end at LF, CR, CR LF and U+2029; U+2028 ends none, and a text that ends in a line end
/// has an empty last line. A look-up takes time logarithmic in the lines between the hint and the answer.
class MARLET_EXPORT LineIndexedBuffer final : public SourceEditorBuffer {
 public:
  explicit LineIndexedBuffer(std::u16string text);

  std::int64_t lineCount() const { return static_cast<std::int64_t>(lineStarts_.size()); }

  SharedText text() const override { return text_; }
  /// An offset outside of the text counts as its nearest end; a hint outside of it, as the nearest line.
  SourceEditorPosition positionFromIndex(std::int64_t index, std::int64_t lineHint) const override;
  /// A position outside of the text counts as its nearest end; a column outside of its line, as the nearest
  /// place that is still on the line.
  std::int64_t indexFromPosition(const SourceEditorPosition& position) const override;

 private:
  SharedText text_;
  /// Offsets at which lines start; the first is 0.
  std::vector<std::int64_t> lineStarts_;
};

}  // namespace MarletFoundation
