// Between UTF-8 and UTF-16, as fast as memory for what is ASCII. Both directions write to a block on the stack
// that goes to the result whenever it is full, which costs less than filling the result with zeros first.

#include <bit>
#include <cstring>
#include <type_traits>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t blockSize = 2048;
// What one step may write beyond the place that it moves to.
constexpr std::size_t slack = 64;

bool isASCII(char c) { return static_cast<unsigned char>(c) < 0x80; }

// `widen32` writes 32 bytes as units, `narrow16` writes 16 units as bytes; each returns how many are ASCII before the
// first that isn't. What is written from there on means nothing.
#ifdef __SSE2__

inline int widen32(const char* bytes, char16_t* units) {
  const auto zeros = _mm_setzero_si128();
  const auto* const from = reinterpret_cast<const __m128i*>(bytes);
  auto* const to = reinterpret_cast<__m128i*>(units);
  const auto first = _mm_loadu_si128(from), second = _mm_loadu_si128(from + 1);
  _mm_storeu_si128(to, _mm_unpacklo_epi8(first, zeros));
  _mm_storeu_si128(to + 1, _mm_unpackhi_epi8(first, zeros));
  _mm_storeu_si128(to + 2, _mm_unpacklo_epi8(second, zeros));
  _mm_storeu_si128(to + 3, _mm_unpackhi_epi8(second, zeros));
  const auto low = static_cast<unsigned>(_mm_movemask_epi8(first));
  return std::countr_zero(low | static_cast<unsigned>(_mm_movemask_epi8(second)) << 16);
}

inline int narrow16(const char16_t* units, char* bytes) {
  const auto* const from = reinterpret_cast<const __m128i*>(units);
  const auto first = _mm_loadu_si128(from), second = _mm_loadu_si128(from + 1);
  _mm_storeu_si128(reinterpret_cast<__m128i*>(bytes), _mm_packus_epi16(first, second));
  const auto aboveASCII = _mm_set1_epi16(static_cast<short>(0xFF80));
  const auto isASCII =
      _mm_packs_epi16(_mm_cmpeq_epi16(_mm_and_si128(first, aboveASCII), _mm_setzero_si128()),
                      _mm_cmpeq_epi16(_mm_and_si128(second, aboveASCII), _mm_setzero_si128()));
  return std::countr_one(static_cast<unsigned>(_mm_movemask_epi8(isASCII)));
}

#else

template <int count, class From, class To>
int copyASCII(const From* from, To* to) {
  int ascii = 0;
  while (ascii < count && static_cast<std::make_unsigned_t<From> >(from[ascii]) < 0x80) {
    to[ascii] = static_cast<To>(from[ascii]);
    ++ascii;
  }
  return ascii;
}

inline int widen32(const char* bytes, char16_t* units) { return copyASCII<32>(bytes, units); }
inline int narrow16(const char16_t* units, char* bytes) { return copyASCII<16>(units, bytes); }

#endif

struct Scalar {
  char32_t value = 0;
  /// Bytes that it takes; 0 for ill-formed ones.
  std::size_t length = 0;
};

/// The non-ASCII scalar value that begins at `at`.
inline Scalar decodeUTF8(const char* at, const char* end) {
  const auto left = static_cast<std::size_t>(end - at);
  const auto continuation = [&](std::size_t i) -> char32_t {
    return i < left && (at[i] & 0xC0) == 0x80 ? at[i] & 0x3F : 0x80000000;
  };
  const auto lead = static_cast<unsigned char>(*at);
  if (lead >= 0xC2 && lead < 0xE0) {
    const char32_t value = (lead & 0x1Fu) << 6 | continuation(1);
    if (value < 0x800) return {value, 2};
  } else if (lead >= 0xE0 && lead < 0xF0) {
    const char32_t second = continuation(1), third = continuation(2);
    const char32_t value = (lead & 0x0Fu) << 12 | second << 6 | third;
    if ((second | third) < 0x40 && value >= 0x800 && (value < 0xD800 || value > 0xDFFF)) return {value, 3};
  } else if (lead >= 0xF0 && lead < 0xF5) {
    const char32_t second = continuation(1), third = continuation(2), fourth = continuation(3);
    const char32_t value = (lead & 0x07u) << 18 | second << 12 | third << 6 | fourth;
    if ((second | third | fourth) < 0x40 && value >= 0x10000 && value <= 0x10FFFF) return {value, 4};
  }
  return {};
}

inline char16_t* encodeUTF16(char32_t scalar, char16_t* out) {
  if (scalar < 0x10000) {
    *out++ = static_cast<char16_t>(scalar);
  } else {
    *out++ = static_cast<char16_t>(0xD7C0 + (scalar >> 10));
    *out++ = static_cast<char16_t>(0xDC00 | (scalar & 0x3FF));
  }
  return out;
}

/// Writes the UTF-8 form of a non-ASCII scalar value and returns the place behind it.
inline char* encodeUTF8(char32_t scalar, char* out) {
  const auto trail = [&](int shift) { return static_cast<char>(0x80 | (scalar >> shift & 0x3F)); };
  if (scalar < 0x800) {
    *out++ = static_cast<char>(0xC0 | scalar >> 6);
  } else if (scalar < 0x10000) {
    *out++ = static_cast<char>(0xE0 | scalar >> 12);
    *out++ = trail(6);
  } else {
    *out++ = static_cast<char>(0xF0 | scalar >> 18);
    *out++ = trail(12);
    *out++ = trail(6);
  }
  *out++ = trail(0);
  return out;
}

/// One non-ASCII character. Null for an ill-formed one.
inline const char* decodeCharacter(const char* at, const char* end, char16_t*& out) {
  const auto scalar = decodeUTF8(at, end);
  if (!scalar.length) return nullptr;
  out = encodeUTF16(scalar.value, out);
  return at + scalar.length;
}

/// The same where at least four bytes are left, the common ones first.
inline const char* decodeCharacterWithin(const char* at, const char* end, char16_t*& out) {
  const auto lead = static_cast<unsigned char>(at[0]);
  const auto second = static_cast<unsigned char>(at[1] ^ 0x80);
  if (lead < 0xE0) {
    *out++ = static_cast<char16_t>((lead & 0x1F) << 6 | second);
    return lead >= 0xC2 && second < 0x40 ? at + 2 : nullptr;
  }
  const auto third = static_cast<unsigned char>(at[2] ^ 0x80);
  if (lead < 0xF0) {
    const auto unit = static_cast<std::uint16_t>((lead & 0x0F) << 12 | second << 6 | third);
    *out++ = unit;
    return (second | third) < 0x40 && unit >= 0x800 && (unit & 0xF800) != 0xD800 ? at + 3 : nullptr;
  }
  return decodeCharacter(at, end, out);
}

/// Fills one block from `place` on. False at an ill-formed byte. (Places in variables of its own: what is written as
/// bytes might change others.)
bool decodeBlock(const char*& place, const char* end, char16_t*& outPlace, const char16_t* blockEnd) {
  const auto* at = place;
  auto* out = outPlace;
  while (end - at >= 40 && out < blockEnd) {
    // What stands behind the first that isn't ASCII is written over.
    const auto ascii = widen32(at, out);
    if (ascii == 32) {
      at += 32;
      out += 32;
      continue;
    }
    at += ascii;
    out += ascii;
    for (int i = 0; i < 8 && end - at >= 4 && !isASCII(*at); ++i) {
      at = decodeCharacterWithin(at, end, out);
      if (!at) return false;
    }
  }
  while (at < end && out < blockEnd) {
    if (isASCII(*at)) {
      *out++ = static_cast<char16_t>(*at++);
    } else if (!(at = decodeCharacter(at, end, out))) {
      return false;
    }
  }
  place = at;
  outPlace = out;
  return true;
}

enum class Unpaired { fail, replace };

/// The same the other way. False at an unpaired surrogate.
bool encodeBlock(const char16_t*& place, const char16_t* end, char*& outPlace, const char* blockEnd,
                 Unpaired unpaired) {
  const auto* at = place;
  auto* out = outPlace;
  while (at < end && out < blockEnd) {
    if (end - at >= 16) {
      const auto ascii = narrow16(at, out);
      if (ascii == 16) {
        // By a constant, for the next step needn't wait for the count.
        at += 16;
        out += 16;
        continue;
      }
      at += ascii;
      out += ascii;
    } else if (*at < 0x80) {
      *out++ = static_cast<char>(*at++);
      continue;
    }
    for (int i = 0; i < 8 && at < end && *at >= 0x80; ++i) {
      char32_t scalar = *at++;
      if (scalar >= 0xD800 && scalar <= 0xDFFF) {
        const bool paired = scalar < 0xDC00 && at < end && *at >= 0xDC00 && *at <= 0xDFFF;
        if (!paired && unpaired == Unpaired::fail) return false;
        scalar = paired ? 0x10000 + ((scalar - 0xD800) << 10) + (*at++ - 0xDC00u) : 0xFFFD;
      }
      out = encodeUTF8(scalar, out);
    }
  }
  place = at;
  outPlace = out;
  return true;
}

std::optional<std::string> utf8(std::u16string_view text, Unpaired unpaired) {
  std::string result;
  result.reserve(text.size());
  char block[blockSize + slack];
  const auto* const end = text.data() + text.size();
  for (const auto* at = text.data(); at < end;) {
    auto* out = block;
    if (!encodeBlock(at, end, out, block + blockSize, unpaired)) return std::nullopt;
    result.append(block, out);
  }
  return result;
}

}  // namespace

std::optional<std::u16string> utf16FromUTF8(std::string_view text) {
  std::u16string result;
  char16_t block[blockSize + slack];
  const auto* const end = text.data() + text.size();
  const auto* at = text.data();
  if (text.size() > blockSize) result.reserve(text.size());
  while (at < end) {
    auto* out = block;
    if (!decodeBlock(at, end, out, block + blockSize)) return std::nullopt;
    result.append(block, out);
  }
  if (result.size() < text.size() / 8 * 7) result.shrink_to_fit();
  return result;
}

std::optional<std::string> utf8FromUTF16(std::u16string_view text) { return utf8(text, Unpaired::fail); }

std::string utf8FromUTF16Lossy(std::u16string_view text) { return *utf8(text, Unpaired::replace); }

bool isValidUTF8(std::string_view text) { return utf8PrefixLength(text) == text.size(); }

std::size_t asciiPrefixLength(std::string_view text) {
  std::size_t i = 0;
#ifdef __SSE2__
  for (; i + 16 <= text.size(); i += 16) {
    const auto bytes = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text.data() + i));
    const auto others = static_cast<unsigned>(_mm_movemask_epi8(bytes));
    if (others) return i + static_cast<std::size_t>(std::countr_zero(others));
  }
#endif
  for (std::uint64_t word; i + sizeof word <= text.size(); i += sizeof word) {
    std::memcpy(&word, text.data() + i, sizeof word);
    if (word & 0x8080808080808080) break;
  }
  while (i < text.size() && isASCII(text[i])) ++i;
  return i;
}

std::size_t utf8PrefixLength(std::string_view text) {
  const auto* const end = text.data() + text.size();
  for (std::size_t i = 0; i < text.size();) {
    if (isASCII(text[i])) {
      i += asciiPrefixLength(text.substr(i));
      continue;
    }
    const auto scalar = decodeUTF8(text.data() + i, end);
    if (!scalar.length) return i;
    i += scalar.length;
  }
  return text.size();
}

std::optional<std::size_t> utf16Length(std::string_view text) {
  char16_t block[blockSize + slack];
  std::size_t length = 0;
  const auto* const end = text.data() + text.size();
  for (const auto* at = text.data(); at < end;) {
    auto* out = block;
    if (!decodeBlock(at, end, out, block + blockSize)) return std::nullopt;
    length += static_cast<std::size_t>(out - block);
  }
  return length;
}

}  // namespace MarletFoundation
