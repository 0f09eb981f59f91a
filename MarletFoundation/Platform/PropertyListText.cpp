#include "MarletFoundation/Platform/PropertyListText.h"

#include <algorithm>
#include <cstring>

namespace MarletFoundation::PropertyListText {
namespace {

std::uint64_t wordAt(const char* place) {
  std::uint64_t word;
  std::memcpy(&word, place, sizeof word);
  return word;
}

std::uint8_t byteAt(std::string_view text, std::size_t place) {
  return static_cast<std::uint8_t>(text[place]);
}

bool isContinuation(std::string_view text, std::size_t place) {
  return place < text.size() && (byteAt(text, place) & 0xC0) == 0x80;
}

// The length of the well-formed sequence at `place`, which is no ASCII; 0 for an ill-formed one.
std::size_t sequenceLength(std::string_view text, std::size_t place) {
  const auto first = byteAt(text, place);
  if (!isContinuation(text, place + 1)) return 0;
  const auto second = byteAt(text, place + 1);
  if (first >= 0xC2 && first <= 0xDF) return 2;
  if (!isContinuation(text, place + 2)) return 0;
  if (first >= 0xE0 && first <= 0xEF) {
    const bool overlong = first == 0xE0 && second < 0xA0;
    const bool surrogate = first == 0xED && second > 0x9F;
    return overlong || surrogate ? 0 : 3;
  }
  if (first < 0xF0 || first > 0xF4 || !isContinuation(text, place + 3)) return 0;
  const bool overlong = first == 0xF0 && second < 0x90;
  const bool tooLarge = first == 0xF4 && second > 0x8F;
  return overlong || tooLarge ? 0 : 4;
}

}  // namespace

std::size_t findNonASCII(std::string_view text) {
  constexpr std::uint64_t highBits = 0x8080808080808080;
  const auto isPlain = [text](std::size_t at) { return (wordAt(text.data() + at) & highBits) == 0; };
  std::size_t place = 0;
  while (place + 8 <= text.size() && isPlain(place)) place += 8;
  // The last word overlaps the one before it.
  if (place < text.size() && text.size() >= 8 && place + 8 > text.size() && isPlain(text.size() - 8))
    return npos;
  for (; place < text.size(); ++place) {
    if (byteAt(text, place) > 0x7F) return place;
  }
  return npos;
}

std::size_t findInvalidUTF8(std::string_view text) {
  std::size_t place = 0;
  while (true) {
    const auto ascii = findNonASCII(text.substr(place));
    if (ascii == npos) return npos;
    place += ascii;
    while (place < text.size() && byteAt(text, place) > 0x7F) {
      const auto length = sequenceLength(text, place);
      if (length == 0) return place;
      place += length;
    }
  }
}

std::size_t findUnusual(std::string_view text) {
  // Signed, so that one comparison finds the controls and what is no ASCII.
  using Block = signed char __attribute__((vector_size(16)));
  constexpr std::size_t blockSize = sizeof(Block);
  const auto unusual = [](Block block) {
    return (block < 0x20) & (block != '\t') & (block != '\n') & (block != '\r');
  };
  const auto blockAt = [text](std::size_t at) {
    Block block;
    std::memcpy(&block, text.data() + at, blockSize);
    return block;
  };
  const auto any = [](const auto& mask) {
    std::uint64_t halves[2];
    std::memcpy(halves, &mask, blockSize);
    return (halves[0] | halves[1]) != 0;
  };
  std::size_t place = 0;
  for (; place + 4 * blockSize <= text.size(); place += 4 * blockSize) {
    if (any(unusual(blockAt(place)) | unusual(blockAt(place + blockSize)) |
            unusual(blockAt(place + 2 * blockSize)) | unusual(blockAt(place + 3 * blockSize))))
      break;
  }
  for (; place + blockSize <= text.size(); place += blockSize) {
    if (any(unusual(blockAt(place)))) break;
  }
  for (; place < text.size(); ++place) {
    const char c = text[place];
    if (static_cast<signed char>(c) < 0x20 && c != '\t' && c != '\n' && c != '\r') return place;
  }
  return npos;
}

std::size_t findInvalidXMLCharacter(std::string_view text) {
  std::size_t place = 0;
  while (true) {
    const auto unusual = findUnusual(text.substr(place));
    if (unusual == npos) return npos;
    place += unusual;
    if (byteAt(text, place) < 0x20) return place;
    for (; place < text.size() && byteAt(text, place) > 0x7F; ++place) {
      if (byteAt(text, place) == 0xEF && byteAt(text, place + 1) == 0xBF && byteAt(text, place + 2) >= 0xBE)
        return place;
    }
  }
}

bool isXMLCharacter(char32_t character) {
  if (character < 0x20) return character == '\t' || character == '\n' || character == '\r';
  if (character >= 0xD800 && character <= 0xDFFF) return false;
  return character <= 0x10FFFF && character != 0xFFFE && character != 0xFFFF;
}

void appendUTF8(std::string& text, char32_t character) {
  const auto put = [&text](char32_t byte) { text.push_back(static_cast<char>(byte)); };
  if (character < 0x80) {
    put(character);
  } else if (character < 0x800) {
    put(0xC0 | character >> 6);
    put(0x80 | (character & 0x3F));
  } else if (character < 0x10000) {
    put(0xE0 | character >> 12);
    put(0x80 | (character >> 6 & 0x3F));
    put(0x80 | (character & 0x3F));
  } else {
    put(0xF0 | character >> 18);
    put(0x80 | (character >> 12 & 0x3F));
    put(0x80 | (character >> 6 & 0x3F));
    put(0x80 | (character & 0x3F));
  }
}

std::size_t appendUTF8FromUTF16(std::string& text, std::string_view bytes, bool bigEndian) {
  const auto unitAt = [bytes, high = bigEndian ? 0U : 1U, low = bigEndian ? 1U : 0U](std::size_t place) {
    return static_cast<char32_t>(byteAt(bytes, place + high) << 8 | byteAt(bytes, place + low));
  };
  std::size_t place = 0;
  while (place + 2 <= bytes.size()) {
    const auto unit = unitAt(place);
    if (unit < 0x80) {
      text.push_back(static_cast<char>(unit));
      place += 2;
      continue;
    }
    if (unit < 0xD800 || unit > 0xDFFF) {
      appendUTF8(text, unit);
      place += 2;
      continue;
    }
    if (unit > 0xDBFF || place + 4 > bytes.size()) break;
    const auto low = unitAt(place + 2);
    if (low < 0xDC00 || low > 0xDFFF) break;
    appendUTF8(text, 0x10000 + ((unit - 0xD800) << 10) + (low - 0xDC00));
    place += 4;
  }
  return place;
}

Data copiedData(std::string_view bytes) {
  const auto owner = std::make_shared<std::uint8_t[]>(bytes.size());
  if (!bytes.empty()) std::memcpy(owner.get(), bytes.data(), bytes.size());
  return {owner, {owner.get(), bytes.size()}};
}

char32_t nextCharacter(std::string_view text, std::size_t& place) {
  const auto first = byteAt(text, place++);
  if (first < 0x80) return first;
  const int more = first < 0xE0 ? 1 : first < 0xF0 ? 2 : 3;
  char32_t character = first & (0x3F >> more);
  for (int i = 0; i < more; ++i) character = character << 6 | (byteAt(text, place++) & 0x3F);
  return character;
}

}  // namespace MarletFoundation::PropertyListText
