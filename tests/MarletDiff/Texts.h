#pragma once

#include <rapidcheck.h>

#include <string>

#include "MarletDiff/DiffDescriptor.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation::test {

/// Texts put together from pieces.
inline rc::Gen<std::u16string> textOf(std::vector<std::u16string> pieces) {
  const auto list = rc::gen::container<std::vector<std::u16string>>(rc::gen::elementOf(std::move(pieces)));
  return rc::gen::map(list, [](const std::vector<std::u16string>& chosen) {
    std::u16string text;
    for (const auto& piece : chosen) text += piece;
    return text;
  });
}

/// Texts of few pieces, so that they share much: words, punctuation, every line end, letters with marks,
/// flags, joined emoji, surrogate pairs and halves of them.
inline rc::Gen<std::u16string> similarText() {
  return textOf({u"a",
                 u"b",
                 u"foo",
                 u" ",
                 u" ",
                 u"(",
                 u"/",
                 u"*",
                 u"\n",
                 u"\n",
                 u"\r\n",
                 u"\u2029",
                 u"\r",
                 u"\u00e9",
                 u"\u0301",
                 u"\u200d",
                 u"\U0001F1E9",
                 u"\U0001F1EA",
                 u"\U0001F469\u200d\U0001F680",
                 u"\U0001F600",
                 u"\U0001F680",
                 {char16_t{0xD83D}},
                 {char16_t{0xDE00}}});
}

/// A hunk at an offset; the modified range is of no use to who applies it.
inline MarletDiff::DiffDescriptor hunk(std::int64_t at, std::u16string original, std::u16string modified) {
  return {{at, std::ssize(original)}, {0, std::ssize(modified)}, original, modified};
}

}  // namespace MarletFoundation::test

namespace MarletDiff {

inline void PrintTo(const DiffDescriptor& hunk, std::ostream* out) {
  *out << "{" << hunk.originalRange.location << ", " << hunk.originalRange.length << "} -> {"
       << hunk.modifiedRange.location << ", " << hunk.modifiedRange.length << "} "
       << MarletFoundation::quoted(MarletFoundation::utf8FromUTF16Lossy(hunk.originalContent)) << " -> "
       << MarletFoundation::quoted(MarletFoundation::utf8FromUTF16Lossy(hunk.modifiedContent));
}

}  // namespace MarletDiff
