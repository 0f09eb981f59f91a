#include "MarletDiff/Encoding.h"

#include <cerrno>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletDiff {
namespace {

[[noreturn]] void throwIllFormed() {
  throw MarletFoundation::ErrorObject(std::string(MarletFoundation::PosixErrorDomain), EILSEQ);
}

}  // namespace

std::size_t checkedUTF16Length(std::string_view text) {
  const auto length = MarletFoundation::utf16Length(text);
  if (!length) throwIllFormed();
  return *length;
}

std::size_t utf16Length(std::string_view text) { return *MarletFoundation::utf16Length(text); }

std::u16string utf16(std::string_view text) { return *MarletFoundation::utf16FromUTF8(text); }

bool isEqual(std::string_view text, std::u16string_view other) { return utf16(text) == other; }

std::string printableUTF8(std::u16string_view text) { return MarletFoundation::utf8FromUTF16Lossy(text); }

void append(std::string& text, std::u16string_view added) {
  const auto encoded = MarletFoundation::utf8FromUTF16(added);
  if (!encoded) throwIllFormed();
  text += *encoded;
}

template <>
std::optional<std::size_t> Offsets<char>::at(std::size_t utf16Offset) {
  while (utf16Offset_ < utf16Offset) {
    const auto ascii = MarletFoundation::asciiPrefixLength(text_.substr(offset_, utf16Offset - utf16Offset_));
    offset_ += ascii;
    utf16Offset_ += ascii;
    if (utf16Offset_ == utf16Offset) break;
    const auto lead = static_cast<unsigned char>(text_[offset_]);
    offset_ += lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    utf16Offset_ += lead < 0xF0 ? 1 : 2;
  }
  return utf16Offset_ == utf16Offset ? std::optional(offset_) : std::nullopt;
}

template <>
std::optional<std::size_t> Offsets<char16_t>::at(std::size_t offset) {
  const bool divides = offset > 0 && offset < text_.size() && (text_[offset - 1] & 0xFC00) == 0xD800 &&
                       (text_[offset] & 0xFC00) == 0xDC00;
  return divides ? std::nullopt : std::optional(offset);
}

}  // namespace MarletDiff
