#pragma once

#include <string_view>
#include <vector>

namespace MarletDiff {

/// Whether a UTF-16 unit is part of a word: a letter, a digit or an underscore, and whatever lies beyond
/// ASCII, so that neither a surrogate pair nor a letter with its marks is ever divided.
bool isWordUnit(char16_t unit);

/// A text cut into tokens that follow each other without a gap.
class Tokens {
 public:
  /// Lines with their ends: LF, CR, CR LF or U+2029.
  static Tokens lines(std::u16string_view text);
  /// Words, and every other character by itself.
  static Tokens words(std::u16string_view text);

  std::size_t size() const { return ends_.size(); }
  std::u16string_view operator[](std::size_t index) const {
    return text_.substr(start(index), ends_[index] - start(index));
  }
  /// The offset of a token, or for `size()` the text's length.
  std::size_t start(std::size_t index) const { return index == 0 ? 0 : ends_[index - 1]; }

 private:
  explicit Tokens(std::u16string_view text) : text_(text) {}
  std::u16string_view text_;
  std::vector<std::size_t> ends_;
};

}  // namespace MarletDiff
