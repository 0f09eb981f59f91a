#include "MarletFoundation/Platform/PropertyListEncoding.h"

#include <unicode/ucnv.h>
#include <unicode/ucnv_err.h>

#include <algorithm>
#include <memory>

#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListText.h"

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

// What ICU converts for us; all of them hold ASCII as it is, so a declaration in them can be read.
constexpr std::string_view convertedEncodings[] = {
    "iso-8859-1", "iso-8859-2", "iso-8859-15", "windows-1250", "windows-1251", "windows-1252",
    "macintosh",  "shift_jis",  "euc-jp",      "euc-kr",       "gb18030",      "big5",
};

std::string lowered(std::string_view text) {
  std::string lower(text);
  for (char& c : lower) {
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c | 0x20);
  }
  return lower;
}

bool isBlank(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; }

// The encoding that an XML declaration at the start of `text` names; empty without one.
std::string_view declaredEncoding(std::string_view text) {
  if (!text.starts_with("<?xml") || text.size() < 6 || !isBlank(text[5])) return {};
  const auto declaration = text.substr(0, text.find("?>"));
  constexpr std::string_view name = "encoding";
  auto place = declaration.find(name);
  if (place == std::string_view::npos) return {};
  place += name.size();
  while (place < declaration.size() && (isBlank(declaration[place]) || declaration[place] == '=')) ++place;
  if (place == declaration.size()) return {};
  const auto close = declaration.find(declaration[place], place + 1);
  if (close == std::string_view::npos) return {};
  return declaration.substr(place + 1, close - place - 1);
}

void checkDeclaration(std::string_view text, std::string_view family) {
  const auto declared = declaredEncoding(text);
  if (!declared.empty() && !lowered(declared).starts_with(family))
    throw propertyListError(invalidEncoding, "the declaration names another one", 0, 1);
}

std::size_t lineAt(std::string_view text, std::size_t place) {
  return 1 + static_cast<std::size_t>(
                 std::count(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(place), '\n'));
}

}  // namespace

PropertyListXMLText::PropertyListXMLText(std::string_view bytes) {
  using namespace std::string_view_literals;
  if (bytes.starts_with("\xFF\xFE") || bytes.starts_with("\xFE\xFF")) {
    markLength_ = 2;
    readUTF16(bytes, bytes.starts_with("\xFE\xFF"));
  } else if (bytes.starts_with("<\0"sv) || bytes.starts_with("\0<"sv)) {
    readUTF16(bytes, bytes.starts_with("\0<"sv));
  } else {
    const bool hasMark = bytes.starts_with("\xEF\xBB\xBF");
    markLength_ = hasMark ? 3 : 0;
    text_ = bytes.substr(markLength_);
    const auto encoding = declaredEncoding(text_);
    const auto name = lowered(encoding);
    if (hasMark) checkDeclaration(text_, "utf-8");
    if (!name.empty() && name != "utf-8" && name != "utf8") readDeclared(text_, encoding);
  }
  if (PropertyListText::findUnusual(text_) == PropertyListText::npos) return;
  const auto illFormed = PropertyListText::findInvalidUTF8(text_);
  if (illFormed != PropertyListText::npos)
    throw propertyListError(invalidEncoding, {}, documentOffset(illFormed), lineAt(text_, illFormed));
  const auto invalid = PropertyListText::findInvalidXMLCharacter(text_);
  if (invalid != PropertyListText::npos)
    throw propertyListError(invalidCharacter, {}, documentOffset(invalid), lineAt(text_, invalid));
}

void PropertyListXMLText::readUTF16(std::string_view bytes, bool bigEndian) {
  isUTF16_ = true;
  const auto units = bytes.substr(markLength_);
  converted_.reserve(units.size() / 2);
  const auto read = PropertyListText::appendUTF8FromUTF16(converted_, units, bigEndian);
  text_ = converted_;
  if (read != units.size())
    throw propertyListError(
        invalidEncoding, read + 1 == units.size() ? "half a character at the end" : "an unpaired surrogate",
        markLength_ + read, lineAt(text_, text_.size()));
  checkDeclaration(text_, "utf-16");
}

void PropertyListXMLText::readDeclared(std::string_view bytes, std::string_view encoding) {
  const auto name = lowered(encoding);
  if (name == "us-ascii" || name == "ascii") {
    const auto high = PropertyListText::findNonASCII(bytes);
    if (high == PropertyListText::npos) return;
    throw propertyListError(invalidEncoding, {}, markLength_ + high, lineAt(bytes, high));
  }
  if (std::find(std::begin(convertedEncodings), std::end(convertedEncodings), name) ==
      std::end(convertedEncodings))
    throw propertyListError(unsupportedEncoding, encoding, 0, 1);

  UErrorCode status = U_ZERO_ERROR;
  const std::unique_ptr<UConverter, void (*)(UConverter*)> converter(ucnv_open(name.c_str(), &status),
                                                                     ucnv_close);
  ucnv_setToUCallBack(converter.get(), UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &status);
  if (U_FAILURE(status)) throw propertyListError(unsupportedEncoding, encoding, 0, 1);
  const char* source = bytes.data();
  const char* const end = bytes.data() + bytes.size();
  char32_t highSurrogate = 0;
  do {
    char16_t buffer[4096];
    char16_t* target = buffer;
    status = U_ZERO_ERROR;
    ucnv_toUnicode(converter.get(), &target, std::end(buffer), &source, end, nullptr, true, &status);
    for (const char16_t* unit = buffer; unit < target; ++unit) {
      char32_t character = *unit;
      // ICU writes whole characters, but may split a pair between two buffers.
      if (character >= 0xD800 && character < 0xDC00) {
        highSurrogate = character;
        continue;
      }
      if (character >= 0xDC00 && character < 0xE000)
        character = 0x10000 + ((highSurrogate - 0xD800) << 10) + (character - 0xDC00);
      PropertyListText::appendUTF8(converted_, character);
    }
  } while (status == U_BUFFER_OVERFLOW_ERROR);
  text_ = converted_;
  if (U_FAILURE(status))
    throw propertyListError(invalidEncoding, {}, static_cast<std::size_t>(source - bytes.data()),
                            lineAt(text_, text_.size()));
}

std::size_t PropertyListXMLText::documentOffset(std::size_t textOffset) const {
  if (!isUTF16_) return markLength_ + textOffset;
  std::size_t units = 0;
  for (const char c : text_.substr(0, textOffset)) {
    const auto byte = static_cast<unsigned char>(c);
    if ((byte & 0xC0) != 0x80) units += byte >= 0xF0 ? 2 : 1;
  }
  return markLength_ + 2 * units;
}

}  // namespace MarletFoundation
