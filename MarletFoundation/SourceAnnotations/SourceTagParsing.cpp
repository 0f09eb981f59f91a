#include <algorithm>

#include "MarletFoundation/SourceAnnotations/SourceTag.h"
#include "MarletFoundation/SourceAnnotations/TagScanner.h"

namespace MarletFoundation {
namespace {

template <class IsDropped>
std::vector<SourceTag::Located> tagsWithout(std::u16string_view text, const IsDropped& isDropped) {
  auto tags = SourceTag::parseStringForTags(text).tags;
  std::erase_if(tags, [&](const SourceTag::Located& located) { return isDropped(located.tag); });
  return tags;
}

}  // namespace

SourceTag::ParseResult SourceTag::parseStringForTags(std::u16string_view text) {
  ParseResult result;
  forEachUnitWithCandidates(text, [&](const LineUnit& unit) { scanUnit(unit, result); });
  return result;
}

SourceTag::ParseResult SourceTag::parseStringForValidTags(std::u16string_view text) {
  auto scanned = parseStringForTags(text);
  auto valid = filterForOnlyValidTagsFor(std::move(scanned.tags));
  std::move(valid.errors.begin(), valid.errors.end(), std::back_inserter(scanned.errors));
  return {std::move(valid.tags), std::move(scanned.errors)};
}

bool SourceTag::hasValidTags(std::u16string_view text) {
  return parseStringForValidTags(text).errors.empty();
}

std::vector<SourceTag::Located> SourceTag::parseStringForLineTagsInSourceEditor(std::u16string_view text) {
  return tagsWithout(text, [](const SourceTag& tag) { return tag.isInlineTag() || tag.isCopyDestination(); });
}

std::vector<SourceTag::Located> SourceTag::parseStringForInlineTagsInSourceEditor(std::u16string_view text) {
  return tagsWithout(text, [](const SourceTag& tag) { return tag.isLineTag() || tag.isCopyDestination(); });
}

std::vector<SourceTag::Located> SourceTag::parseLineForTagsInSourceEditor(std::u16string_view line) {
  return tagsWithout(line, [](const SourceTag& tag) { return tag.isCopyDestination(); });
}

}  // namespace MarletFoundation
