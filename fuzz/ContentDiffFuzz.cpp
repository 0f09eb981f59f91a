#include <cstdlib>

#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/Text.h"

using namespace MarletDiff;

namespace {

void require(bool condition) {
  if (!condition) std::abort();
}

/// Texts that UTF-8 can hold have the same hunks in it.
void checkInUTF8(std::u16string_view original, std::u16string_view modified, DiffOptions options,
                 const std::vector<DiffDescriptor>& hunks) {
  const auto before = MarletFoundation::utf8FromUTF16(original),
             after = MarletFoundation::utf8FromUTF16(modified);
  if (!before || !after) return;
  require(diffContent(*before, *after, options) == hunks);
  require(mergeContent(*before, hunks) == *after);
}

/// What must hold of the hunks between two texts.
std::vector<DiffDescriptor> checkedDiff(std::u16string_view original, std::u16string_view modified,
                                        DiffOptions options) {
  auto hunks = diffContent(original, modified, options);
  require(hunks == diffContent(original, modified, options));
  require(hunks.empty() == (original == modified));
  require(mergeContent(original, hunks) == modified);
  checkInUTF8(original, modified, options, hunks);
  auto starts = MarletFoundation::graphemeStarts(original);
  starts.push_back(true);
  std::int64_t done = -1;
  for (const auto& hunk : hunks) {
    require(hunk.originalRange.location > done);
    done = hunk.originalRange.end();
    require(starts[static_cast<std::size_t>(hunk.originalRange.location)]);
    require(starts[static_cast<std::size_t>(done)]);
    const auto range = hunk.modifiedRange;
    require(modified.substr(static_cast<std::size_t>(range.location),
                            static_cast<std::size_t>(range.length)) == hunk.modifiedContent);
  }
  return hunks;
}

std::optional<std::u16string> merged(std::u16string_view base, std::span<const DiffDescriptor> diff,
                                     std::span<const DiffDescriptor> otherDiff) {
  try {
    return mergeContent(base, diff, otherDiff);
  } catch (const MarletFoundation::ErrorObject& error) {
    require(error.code() == static_cast<int>(MergeErrorCode::Conflict));
    return std::nullopt;
  }
}

/// Hunks of any kind, which the merge must refuse or apply.
void applyAnything(std::u16string_view base, std::u16string_view input) {
  std::vector<DiffDescriptor> hunks;
  for (std::size_t i = 0; i + 3 < input.size(); i += 4) {
    const std::int64_t location = static_cast<std::int16_t>(input[i]);
    const std::int64_t length = static_cast<std::int8_t>(input[i + 1]);
    std::u16string content;
    if (location >= 0 && location <= std::ssize(base) && length > 0) content = base.substr(location, length);
    hunks.push_back({{location, length}, {}, content, std::u16string(input.substr(i + 2, 2))});
  }
  const auto half = std::span<const DiffDescriptor>(hunks).first(hunks.size() / 2);
  const auto otherHalf = std::span<const DiffDescriptor>(hunks).subspan(half.size());
  std::optional<std::u16string> result;
  try {
    result = mergeContent(base, half, otherHalf);
  } catch (const MarletFoundation::ErrorObject&) {
  }
  const auto utf8 = MarletFoundation::utf8FromUTF16(base);
  if (!utf8) return;
  try {
    require(mergeContent(*utf8, half, otherHalf) == MarletFoundation::utf8FromUTF16(result.value()));
  } catch (const MarletFoundation::ErrorObject& error) {
    require(!result || error.domain() == MarletFoundation::PosixErrorDomain);
  }
}

/// The next piece of the input, up to a unit that seldom stands in a text.
std::u16string piece(std::u16string_view& input) {
  const auto text = input.substr(0, input.find(u'\x1e'));
  input.remove_prefix(std::min(text.size() + 1, input.size()));
  return std::u16string(text);
}

}  // namespace

/// Pieces, in UTF-16 or, after a first byte that is odd, in Latin-1: the base, two texts, hunks of any kind.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  std::u16string units;
  const bool isWide = size > 0 && bytes[0] % 2 == 0;
  for (std::size_t i = 1; i + isWide < size; i += 1u + isWide) {
    units += static_cast<char16_t>(isWide ? bytes[i] | bytes[i + 1] << 8 : bytes[i]);
  }
  std::u16string_view input = units;
  const auto base = piece(input), text = piece(input), otherText = piece(input);
  checkedDiff(base, text, {});
  const auto diff = checkedDiff(base, text, DiffOptions::SmallerHunks);
  const auto otherDiff = checkedDiff(base, otherText, DiffOptions::SmallerHunks);
  require(merged(base, diff, diff) == text);
  require(merged(base, diff, {}) == text && merged(base, {}, diff) == text);
  require(merged(base, diff, otherDiff) == merged(base, otherDiff, diff));
  applyAnything(base, input);
  return 0;
}
