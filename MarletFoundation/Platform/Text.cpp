#include "MarletFoundation/Platform/Text.h"

#include <unicode/ubrk.h>
#include <unicode/unorm2.h>
#include <unicode/utext.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstring>
#include <limits>
#include <memory>

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {
namespace {

bool isASCII(char c) { return static_cast<unsigned char>(c) < 0x80; }

bool isAllASCII(std::string_view text) { return asciiPrefixLength(text) == text.size(); }

/// Whether a character ends behind the ASCII character at `at` whatever surrounds it. Two ASCII characters
/// never belong together, but for CR LF, which ends at its own end.
bool standsAlone(std::string_view text, std::size_t at) {
  return isASCII(text[at]) && (at + 1 == text.size() || isASCII(text[at + 1]));
}

std::size_t lengthOfASCIICharacter(std::string_view text, std::size_t at) {
  return text[at] == '\r' && at + 1 < text.size() && text[at + 1] == '\n' ? 2 : 1;
}

/// ICU's walk over characters. Opening one is costly, so each thread keeps its own.
class CharacterWalk {
 public:
  static CharacterWalk& ofThisThread() {
    thread_local CharacterWalk walk;
    return walk;
  }

  ~CharacterWalk() {
    ubrk_close(iterator_);
    utext_close(&text_);
  }

  /// Starts at the front of `text`, which must be the start of a character.
  void start(std::string_view text) {
    UErrorCode status = U_ZERO_ERROR;
    utext_openUTF8(&text_, text.data(), static_cast<std::int64_t>(text.size()), &status);
    ubrk_setUText(iterator_, &text_, &status);
    if (U_FAILURE(status)) fatalError("the character break iterator takes no text");
  }
  void start(std::u16string_view text) {
    UErrorCode status = U_ZERO_ERROR;
    ubrk_setText(iterator_, text.data(), static_cast<std::int32_t>(text.size()), &status);
    if (U_FAILURE(status)) fatalError("the character break iterator takes no text");
  }
  /// Units from the start to the end of the next character. Not to be called at the end.
  std::size_t next() { return static_cast<std::size_t>(ubrk_next(iterator_)); }

 private:
  CharacterWalk() {
    UErrorCode status = U_ZERO_ERROR;
    iterator_ = ubrk_open(UBRK_CHARACTER, "", nullptr, 0, &status);
    if (U_FAILURE(status)) fatalError("no character break iterator");
  }

  UText text_ = UTEXT_INITIALIZER;
  UBreakIterator* iterator_ = nullptr;
};

// ICU counts its offsets in 32 bits.
constexpr std::size_t window = std::size_t{1} << 30;

struct Run {
  std::size_t end;
  std::int64_t count;
};

/// Walks at most `limit` characters from `from` on. Starts ICU only where a character isn't ASCII by itself,
/// and always at the start of a character, so that nothing in front is looked at again.
Run walk(std::string_view text, std::size_t from, std::int64_t limit) {
  std::size_t at = std::min(from, text.size());
  std::int64_t count = 0;
  while (at < text.size() && count < limit) {
    if (standsAlone(text, at)) {
      at += lengthOfASCIICharacter(text, at);
      ++count;
      continue;
    }
    const auto base = at;
    const auto end = std::min(text.size(), base + window);
    auto& characters = CharacterWalk::ofThisThread();
    characters.start(text.substr(base, window));
    do {
      at = base + characters.next();
      ++count;
    } while (at < end && count < limit && !standsAlone(text, at));
  }
  return {at, count};
}

template <class Unit>
std::vector<bool> characterStarts(std::basic_string_view<Unit> text) {
  std::vector<bool> starts(text.size());
  auto& characters = CharacterWalk::ofThisThread();
  for (std::size_t base = 0; base < text.size(); base += window) {
    const auto part = text.substr(base, window);
    characters.start(part);
    for (std::size_t at = 0; at < part.size(); at = characters.next()) starts[base + at] = true;
  }
  return starts;
}

std::optional<std::u16string> canonicalDecomposition(std::string_view text) {
  const auto source = utf16FromUTF8(text);
  if (!source || source->size() > std::numeric_limits<std::int32_t>::max() / 4) return std::nullopt;
  UErrorCode status = U_ZERO_ERROR;
  const auto* normalizer = unorm2_getNFDInstance(&status);
  const auto length = static_cast<std::int32_t>(source->size());
  // No character decomposes into more than four units for each of its own.
  std::u16string result(source->size() * 4, u'\0');
  const auto size = unorm2_normalize(normalizer, source->data(), length, result.data(),
                                     static_cast<std::int32_t>(result.size()), &status);
  if (U_FAILURE(status)) return std::nullopt;
  result.resize(static_cast<std::size_t>(size));
  return result;
}

}  // namespace

std::int64_t graphemeCount(std::string_view text) {
  if (isAllASCII(text) && text.find('\r') == std::string_view::npos)
    return static_cast<std::int64_t>(text.size());
  return walk(text, 0, std::numeric_limits<std::int64_t>::max()).count;
}

std::size_t graphemeRunEnd(std::string_view text, std::size_t from, std::int64_t count) {
  return walk(text, from, count).end;
}

std::vector<bool> graphemeStarts(std::u16string_view text) { return characterStarts(text); }
std::vector<bool> graphemeStarts(std::string_view text) { return characterStarts(text); }

bool canonicallyEquivalent(std::string_view a, std::string_view b) {
  if (a == b) return true;
  // ASCII decomposes into itself; but U+212A decomposes into "K", so one ASCII side doesn't decide.
  if (isAllASCII(a) && isAllASCII(b)) return false;
  const auto first = canonicalDecomposition(a);
  const auto second = canonicalDecomposition(b);
  return first && first == second;
}

std::optional<std::int64_t> parseDecimalInteger(std::string_view text) {
  if (text.starts_with('+')) {
    text.remove_prefix(1);
    if (text.starts_with('-')) return std::nullopt;
  }
  std::int64_t value = 0;
  const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
  if (result.ec != std::errc() || result.ptr != text.data() + text.size()) return std::nullopt;
  return value;
}

std::string shortestDecimal(double number) {
  // The largest double has 309 digits in front of the point, the smallest 1074 places behind it.
  char buffer[1100];
  std::string text(buffer, std::to_chars(buffer, std::end(buffer), number, std::chars_format::fixed).ptr);
  if (std::isfinite(number) && text.find('.') == std::string::npos) text += ".0";
  return text;
}

std::vector<std::string_view> split(std::string_view text, char separator) {
  std::vector<std::string_view> pieces;
  while (true) {
    const auto end = text.find(separator);
    pieces.push_back(text.substr(0, end));
    if (end == std::string_view::npos) return pieces;
    text.remove_prefix(end + 1);
  }
}

std::string quoted(std::string_view text) {
  constexpr char digits[] = "0123456789ABCDEF";
  std::string result = "\"";
  result.reserve(text.size() + 2);
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    if (c == '"' || c == '\\') {
      result += {'\\', c};
    } else if (c == '\n') {
      result += "\\n";
    } else if (c == '\r') {
      result += "\\r";
    } else if (c == '\t') {
      result += "\\t";
    } else if (byte < 0x20 || byte == 0x7F) {
      result += {'\\', 'u', '{', digits[byte >> 4], digits[byte & 0xF], '}'};
    } else {
      result += c;
    }
  }
  return result += '"';
}

std::string optionalDescription(const std::optional<std::string>& text) {
  return text ? "Optional(" + quoted(*text) + ")" : "nil";
}

}  // namespace MarletFoundation
