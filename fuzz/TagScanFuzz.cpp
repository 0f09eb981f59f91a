#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "MarletFoundation/SourceAnnotations/EditableRanges.h"
#include "MarletFoundation/SourceAnnotations/EditorPlaceholder.h"
#include "MarletFoundation/SourceAnnotations/SourceTag.h"

using namespace MarletFoundation;

namespace {

void require(bool condition) {
  if (!condition) std::abort();
}

/// A first byte of 0xFF says that UTF-16 units follow; else each byte is one.
std::u16string text(const std::uint8_t* bytes, std::size_t size) {
  if (size == 0 || bytes[0] != 0xFF) return {bytes, bytes + size};
  std::u16string units;
  for (std::size_t i = 1; i + 1 < size; i += 2) units += static_cast<char16_t>(bytes[i] | bytes[i + 1] << 8);
  return units;
}

template <class List>
void requireOrderIn(const std::u16string& source, const List& list) {
  std::int64_t last = -1;
  for (const auto& item : list) {
    require(item.range.location > last && item.range.length > 0);
    require(item.range.end() <= static_cast<std::int64_t>(source.size()));
    last = item.range.location;
  }
}

}  // namespace

/// A page's source, in the hands of all that reads tags in it.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  const auto source = text(bytes, size);
  const auto scanned = SourceTag::parseStringForTags(source);
  const auto valid = SourceTag::parseStringForValidTags(source);
  requireOrderIn(source, scanned.tags);
  require(std::includes(scanned.tags.begin(), scanned.tags.end(), valid.tags.begin(), valid.tags.end(),
                        [](const auto& a, const auto& b) { return a.range.location < b.range.location; }));
  for (const auto& error : valid.errors) {
    require(error.range.location >= 0 && error.range.end() <= static_cast<std::int64_t>(source.size()));
    require(!error.description().empty());
  }
  require(SourceTag::hasValidTags(source) == valid.errors.empty());
  require(SourceTag::filterForOnlyValidTagsFor(valid.tags).tags == valid.tags);
  const auto lines = SourceTag::parseStringForLineTagsInSourceEditor(source).size();
  const auto inlines = SourceTag::parseStringForInlineTagsInSourceEditor(source).size();
  require(SourceTag::parseLineForTagsInSourceEditor(source).size() >= lines + inlines);

  const auto editable = editableRanges(source);
  require(!editable.empty());
  for (const auto& range : editable)
    require(range.location >= 0 && range.end() <= static_cast<std::int64_t>(source.size()));

  requireOrderIn(source, parseStringForPlaceholders(source));
  lexiportDirectivesFromLine(source);
  return 0;
}
