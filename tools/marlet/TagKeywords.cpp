#include "TagKeywords.h"

#include <algorithm>
#include <numeric>
#include <vector>

using namespace MarletFoundation;

namespace {

/// In the order of the cases.
constexpr std::string_view keywords[] = {
    "editable-code",        "editable-code",    "end-editable-code", "copy-source",
    "copy-source",          "copy-destination", "copy-destination",  "code-completion",
    "end-editable-code",    "end-copy-source",  "end-copy-source",   "end-copy-destination",
    "end-copy-destination", "hidden-code",      "end-hidden-code",
};

std::size_t editDistance(std::string_view a, std::string_view b) {
  std::vector<std::size_t> row(b.size() + 1);
  std::iota(row.begin(), row.end(), std::size_t{0});
  for (std::size_t i = 0; i < a.size(); ++i) {
    auto diagonal = row[0]++;
    for (std::size_t j = 0; j < b.size(); ++j) {
      const auto replaced = diagonal + (a[i] == b[j] ? 0 : 1);
      diagonal = row[j + 1];
      row[j + 1] = std::min({replaced, row[j] + 1, row[j + 1] + 1});
    }
  }
  return row.back();
}

}  // namespace

std::string writtenForm(SourceTag::Case tag) {
  const std::string keyword(keywords[static_cast<std::size_t>(tag)]);
  return SourceTag::isInlineTag(tag) ? "/*#-" + keyword + "*/" : "//#-" + keyword;
}

NearestKeyword nearestKeyword(std::string_view word) {
  std::string lower(word);
  for (auto& letter : lower)
    if (letter >= 'A' && letter <= 'Z') letter = static_cast<char>(letter + 0x20);
  NearestKeyword nearest{"", std::string::npos};
  for (const auto keyword : keywords) {
    const auto distance = editDistance(lower, keyword);
    if (distance < nearest.distance) nearest = {keyword, distance};
  }
  return nearest;
}
