#include "SafeText.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>

#include "MarletFoundation/Platform/Text.h"
#include "Terminal.h"

namespace {

struct Range {
  char32_t first, last;
};

constexpr Range unsafe[] = {{0x00, 0x1F},     {0x7F, 0x9F},     {0x061C, 0x061C},
                            {0x200E, 0x200F}, {0x2028, 0x202E}, {0x2066, 0x206F}};

bool isUnsafe(char32_t character) {
  return std::any_of(std::begin(unsafe), std::end(unsafe),
                     [&](const Range& range) { return range.first <= character && character <= range.last; });
}

/// The first character of a well-formed text, and how many bytes it takes.
std::pair<char32_t, std::size_t> firstCharacter(std::string_view text) {
  const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
  if (byte(0) < 0x80) return {byte(0), 1};
  const std::size_t length = byte(0) < 0xE0 ? 2 : byte(0) < 0xF0 ? 3 : 4;
  char32_t character = byte(0) & (0x7F >> length);
  for (std::size_t i = 1; i < length; ++i) character = character << 6 | (byte(i) & 0x3F);
  return {character, length};
}

/// How many bytes in front are printing ASCII, most of any text.
std::size_t plainLength(std::string_view text) {
  const auto end = std::find_if(text.begin(), text.end(), [](char c) { return c < 0x20 || c > 0x7E; });
  return static_cast<std::size_t>(end - text.begin());
}

std::string escape(const char* form, unsigned value) {
  char text[16];
  std::snprintf(text, sizeof text, form, value);
  return text;
}

/// `kept` tells how many bytes at the start of a text stay though they are unsafe.
template <class Kept>
std::string escaped(std::string_view text, Kept kept, const char* asciiForm = "\\x%02X",
                    const char* form = "\\u%04X") {
  std::string safe;
  safe.reserve(text.size());
  while (true) {
    auto wellFormed = text.substr(0, MarletFoundation::utf8PrefixLength(text));
    text.remove_prefix(wellFormed.size());
    while (!wellFormed.empty()) {
      const auto plain = plainLength(wellFormed);
      safe += wellFormed.substr(0, plain);
      wellFormed.remove_prefix(plain);
      if (wellFormed.empty()) break;
      const auto [character, length] = firstCharacter(wellFormed);
      const bool stays = !isUnsafe(character);
      const auto taken = stays ? length : kept(wellFormed);
      if (taken > 0) {
        safe += wellFormed.substr(0, taken);
      } else {
        safe += escape(character < 0x80 ? asciiForm : form, static_cast<unsigned>(character));
      }
      wellFormed.remove_prefix(std::max(taken, length));
    }
    if (text.empty()) return safe;
    safe += escape("\\x%02X", static_cast<unsigned char>(text.front()));
    text.remove_prefix(1);
  }
}

/// Bytes in front that only lay out lines.
std::size_t layoutLength(std::string_view text) {
  return text.starts_with("\r\n") ? 2 : text.front() == '\n' || text.front() == '\t' ? 1 : 0;
}

std::size_t ownSequenceLength(std::string_view text) {
  for (const auto sequence : terminalSequences)
    if (text.starts_with(sequence)) return sequence.size();
  return layoutLength(text);
}

}  // namespace

std::string printable(std::string_view text) {
  return escaped(text, [](std::string_view) -> std::size_t { return 0; });
}

std::string printableLines(std::string_view text) { return escaped(text, layoutLength); }

std::string printableOutput(std::string_view output) { return escaped(output, ownSequenceLength); }

std::string printableJSON(std::string_view json) { return escaped(json, layoutLength, "\\u%04x", "\\u%04x"); }
