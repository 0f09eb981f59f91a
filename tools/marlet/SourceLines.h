#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/TextRange.h"

/// The lines of a page's source as the tag language counts them: they end at LF, CR, CR LF or U+2029.
class SourceLines {
 public:
  explicit SourceLines(std::u16string_view text);

  std::size_t count() const { return ranges_.size(); }
  /// Of a line's text without its line end, in UTF-16 units. Index from 0.
  const MarletFoundation::TextRange& range(std::size_t index) const { return ranges_[index]; }
  std::u16string_view text(std::size_t index) const;
  /// The line on which an offset lies.
  std::size_t indexAt(std::int64_t offset) const;

 private:
  std::u16string_view text_;
  std::vector<MarletFoundation::TextRange> ranges_;
};
