#include "MarletFoundation/SourceAnnotations/TagCandidates.h"

#include <algorithm>

namespace MarletFoundation {
namespace {

constexpr std::size_t blockLength = 64;

/// Whether one of the `blockLength` units is "#". Without an early end, compilers make vectors of it.
bool holdsNumberSign(const char16_t* units) {
  char16_t found = 0;
  for (std::size_t i = 0; i < blockLength; ++i) found |= units[i] == u'#' ? 0xFFFF : 0;
  return found != 0;
}

/// Whether the "#" at `at` is that of a tag's opening.
bool opensTag(std::u16string_view text, std::size_t at) {
  return at >= 2 && at + 1 < text.size() && text[at + 1] == u'-' && text[at - 2] == u'/' &&
         (text[at - 1] == u'/' || text[at - 1] == u'*');
}

}  // namespace

std::size_t nextTagCandidate(std::u16string_view text, std::size_t from) {
  std::size_t at = from + 2;
  while (at < text.size()) {
    while (at + blockLength <= text.size() && !holdsNumberSign(text.data() + at)) at += blockLength;
    const auto blockEnd = std::min(at + blockLength, text.size());
    for (; at < blockEnd; ++at) {
      if (text[at] == u'#' && opensTag(text, at)) return at - 2;
    }
  }
  return text.npos;
}

}  // namespace MarletFoundation
