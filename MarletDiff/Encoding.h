#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "MarletDiff/Characters.h"

// What a text's encoding makes a difference to. UTF-8 must be well-formed here; `checkedUTF16Length` sees to that.
namespace MarletDiff {

/// How many UTF-16 units a text takes. Throws a `MarletFoundation::ErrorObject` of the POSIX domain (EILSEQ) for
/// ill-formed UTF-8.
std::size_t checkedUTF16Length(std::string_view text);
inline std::size_t checkedUTF16Length(std::u16string_view text) { return text.size(); }

/// The same of a text that was checked.
std::size_t utf16Length(std::string_view text);
inline std::size_t utf16Length(std::u16string_view text) { return text.size(); }

std::u16string utf16(std::string_view text);
inline std::u16string utf16(std::u16string_view text) { return std::u16string(text); }

bool isEqual(std::string_view text, std::u16string_view other);
inline bool isEqual(std::u16string_view text, std::u16string_view other) { return text == other; }

/// For messages: unpaired surrogates become U+FFFD.
inline std::string printableUTF8(std::string_view text) { return std::string(text); }
std::string printableUTF8(std::u16string_view text);

/// Throws as above for an unpaired surrogate where the text is in UTF-8.
void append(std::string& text, std::u16string_view added);
inline void append(std::u16string& text, std::u16string_view added) { text += added; }

/// Takes offsets that count UTF-16 units to a text's own. It only goes forward, so all of them cost one walk.
template <class Unit>
class Offsets {
 public:
  explicit Offsets(View<Unit> text) : text_(text) {}
  /// Nothing within a character of two units. To be called with ascending offsets within the text.
  std::optional<std::size_t> at(std::size_t utf16Offset);

 private:
  View<Unit> text_;
  std::size_t offset_ = 0;
  std::size_t utf16Offset_ = 0;
};

}  // namespace MarletDiff
