#pragma once

#include "MarletFoundation/SourceEditor/SourceEditorBuffer.h"

namespace MarletFoundation {

/// The same place in two schemes: the first `utf16Index` units of a text take `utf8Index` bytes in UTF-8.
struct ConvertedIndex {
  std::int64_t utf8Index = 0;
  std::int64_t utf16Index = 0;
  bool operator==(const ConvertedIndex&) const = default;
};

/// The units of a text for reading at any offset.
struct InlineBuffer {
  const char16_t* units;
  std::int64_t endIndex;

  /// The unit at an offset; 0 outside of the text.
  char16_t operator[](std::int64_t index) const { return index >= 0 && index < endIndex ? units[index] : 0; }
};

/// Converts offsets in UTF-8 into offsets in UTF-16 units. It remembers its last answer, so offsets in
/// ascending order cost one pass over the text together; a lower offset starts over at the beginning. A high
/// surrogate counts four bytes and two units whatever follows it; a low one by itself, three bytes. A value:
/// a copy has a cache of its own.
class MARLET_EXPORT UTF8RangeConverter {
 public:
  explicit UTF8RangeConverter(SharedText text);
  explicit UTF8RangeConverter(std::u16string text);

  /// An offset inside a character gives the one behind it. One outside of the text gives 0 or the text's end,
  /// which lies one unit too far when the text ends in an unpaired high surrogate.
  std::int64_t utf16IndexFromUTF8Index(std::int64_t target);

  /// The last answer: always a true pair, between two characters.
  const ConvertedIndex& lastConversion() const { return lastConversion_; }
  const SharedText& string() const { return string_; }
  /// Length of the text in UTF-16 units.
  std::int64_t endIndex() const { return inlineBuffer_.endIndex; }

 private:
  friend class SourceEditorUTF8RangeConverter;

  std::int64_t utf8IndexFromUTF16Index(std::int64_t target);

  ConvertedIndex lastConversion_;
  InlineBuffer inlineBuffer_;
  SharedText string_;
};

}  // namespace MarletFoundation
