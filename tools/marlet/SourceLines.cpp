#include "SourceLines.h"

#include <algorithm>

using namespace MarletFoundation;

SourceLines::SourceLines(std::u16string_view text) : text_(text) {
  std::size_t start = 0;
  while (start < text.size()) {
    const auto end = std::min(text.find_first_of(u"\n\r\u2029", start), text.size());
    ranges_.push_back({static_cast<std::int64_t>(start), static_cast<std::int64_t>(end - start)});
    start = end + (text.substr(end).starts_with(u"\r\n") ? 2 : 1);
  }
}

std::u16string_view SourceLines::text(std::size_t index) const {
  const auto& range = ranges_[index];
  return text_.substr(static_cast<std::size_t>(range.location), static_cast<std::size_t>(range.length));
}

std::size_t SourceLines::indexAt(std::int64_t offset) const {
  const auto behind =
      std::upper_bound(ranges_.begin(), ranges_.end(), offset,
                       [](std::int64_t at, const TextRange& range) { return at < range.location; });
  return static_cast<std::size_t>(behind - ranges_.begin()) - 1;
}
