#include "MarletFoundation/Platform/XMLText.h"

#include <algorithm>
#include <array>
#include <string>

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view blanks = " \t\r\n";
constexpr std::size_t attributeLimit = 256;

/// The scalar values of the bytes 0x80 to 0x9F in windows-1252; 0 for those that it leaves out.
constexpr std::array<char16_t, 32> windows1252{
    0x20AC, 0,      0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0,      0x017D, 0,      0,      0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0,      0x017E, 0x0178};

constexpr std::string_view illFormed = "The document holds bytes that its encoding has no character for.";

/// The value of `encoding` in the XML declaration, or empty.
std::string_view declaredEncoding(std::string_view text) {
  constexpr std::string_view start = "<?xml", name = "encoding";
  if (!text.starts_with(start)) return {};
  const auto declaration = text.substr(0, text.find("?>"));
  const auto at = declaration.find(name);
  if (at == std::string_view::npos) return {};
  const auto open = declaration.find_first_of("\"'", at + name.size());
  if (open == std::string_view::npos) return {};
  const auto value = declaration.substr(open + 1);
  return value.substr(0, value.find(declaration[open]));
}

bool equalIgnoringCase(std::string_view a, std::string_view b) {
  const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; };
  return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                    [&](char x, char y) { return lower(x) == lower(y); });
}

/// Length of the part in front of the first surrogate without its partner.
std::size_t pairedPrefix(std::u16string_view text) {
  const auto isHigh = [](char16_t unit) { return (unit & 0xFC00) == 0xD800; };
  const auto isLow = [](char16_t unit) { return (unit & 0xFC00) == 0xDC00; };
  for (std::size_t i = 0; i < text.size(); ++i) {
    const bool pair = isHigh(text[i]) && i + 1 < text.size() && isLow(text[i + 1]);
    if (!pair && (isHigh(text[i]) || isLow(text[i]))) return i;
    i += pair;
  }
  return text.size();
}

XMLText fromUTF16(std::string_view bytes, bool bigEndian) {
  std::u16string units(bytes.size() / 2, u'\0');
  for (std::size_t i = 0; i < units.size(); ++i) {
    const auto first = static_cast<unsigned char>(bytes[2 * i]);
    const auto second = static_cast<unsigned char>(bytes[2 * i + 1]);
    units[i] = static_cast<char16_t>(bigEndian ? first << 8 | second : second << 8 | first);
  }
  const auto wellFormed = pairedPrefix(units);
  XMLText result{Data(*utf8FromUTF16({units.data(), wellFormed})), {}};
  if (wellFormed < units.size() || bytes.size() % 2) result.refusal = illFormed;
  return result;
}

/// Converts byte by byte; `scalar` gives 0 for a byte without a character.
XMLText fromBytes(std::string_view bytes, char16_t (*scalar)(unsigned char)) {
  std::u16string text;
  text.reserve(bytes.size());
  for (const char byte : bytes) {
    const auto unit = scalar(static_cast<unsigned char>(byte));
    if (!unit) break;
    text += unit;
  }
  XMLText result{Data(*utf8FromUTF16(text)), {}};
  if (text.size() < bytes.size()) result.refusal = illFormed;
  return result;
}

XMLText decoded(const Data& document) {
  const auto bytes = document.view();
  const auto startsWith = [&](std::string_view mark) { return bytes.starts_with(mark); };
  if (startsWith("\xFE\xFF") || startsWith({"\0<", 2})) return fromUTF16(bytes, true);
  if (startsWith("\xFF\xFE") || startsWith({"<\0", 2})) return fromUTF16(bytes, false);

  const auto name = startsWith("\xEF\xBB\xBF") ? "UTF-8" : declaredEncoding(bytes);
  const auto is = [&](std::string_view encoding) { return equalIgnoringCase(name, encoding); };
  if (name.empty() || is("UTF-8") || is("US-ASCII")) {
    const auto wellFormed = is("US-ASCII") ? asciiPrefixLength(bytes) : utf8PrefixLength(bytes);
    if (wellFormed == bytes.size()) return {document, {}};
    return {document.slice(0, wellFormed), illFormed};
  }
  if (is("ISO-8859-1")) return fromBytes(bytes, [](unsigned char byte) -> char16_t { return byte; });
  if (is("windows-1252")) {
    return fromBytes(bytes, [](unsigned char byte) -> char16_t {
      return byte >= 0x80 && byte < 0xA0 ? windows1252[byte - 0x80u] : byte;
    });
  }
  return {Data(), "The document is in an encoding that isn't read."};
}

/// Behind the quoted value that opens at `open`, or at the "<" that ends it, as no value holds one.
std::size_t endOfValue(std::string_view text, std::size_t open) {
  const char ends[] = {text[open], '<'};
  const auto end = std::min(text.find_first_of({ends, 2}, open + 1), text.size());
  return end < text.size() && text[end] == text[open] ? end + 1 : end;
}

/// Where the first tag with too many attributes starts. The parser compares each attribute of a tag with all
/// the others, so their number has to be bounded in front of it. What only looks like a tag, in a comment
/// say, is counted, too: nothing can hide one then.
std::size_t firstCrowdedTag(std::string_view text) {
  for (auto tag = text.find('<'); tag < text.size(); tag = text.find('<', tag + 1)) {
    std::size_t attributes = 0;
    auto at = tag + 1;
    while ((at = text.find_first_of("\"'<>", at)) < text.size() && text[at] != '<' && text[at] != '>') {
      const auto before = text.find_last_not_of(blanks, at - 1);
      if (text[before] == '=' && ++attributes > attributeLimit) return tag;
      at = endOfValue(text, at);
    }
  }
  return text.size();
}

}  // namespace

XMLText xmlText(const Data& document) {
  auto text = decoded(document);
  const auto refuse = [&](std::size_t from, std::string_view why) {
    if (from < text.utf8.size()) text = {text.utf8.slice(0, from), why};
  };
  // A NUL is no character of XML; among the first bytes it would look like yet another encoding.
  refuse(text.utf8.view().find('\0'), "The document holds a NUL.");
  refuse(firstCrowdedTag(text.utf8.view()), "An element has more than 256 attributes.");
  return text;
}

}  // namespace MarletFoundation
