#include <algorithm>
#include <cstring>
#include <optional>
#include <vector>

#include "MarletFoundation/Platform/PropertyListEncoding.h"
#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListEvents.h"
#include "MarletFoundation/Platform/PropertyListScalars.h"
#include "MarletFoundation/Platform/PropertyListText.h"

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

enum class Element { plist, array, dict, key, string, data, date, integer, real, trueElement, falseElement };

constexpr std::string_view elementNames[] = {"plist", "array",   "dict", "key",  "string", "data",
                                             "date",  "integer", "real", "true", "false"};

// A short name as one number, so that it is found by one comparison. Longer names give 0.
constexpr std::uint64_t packed(std::string_view name) {
  if (name.size() > 8) return 0;
  std::uint64_t number = 0;
  for (const char c : name) number = number << 8 | static_cast<std::uint8_t>(c);
  return number;
}

std::optional<Element> elementNamed(std::string_view name) {
  switch (packed(name)) {
    case packed("key"):
      return Element::key;
    case packed("string"):
      return Element::string;
    case packed("integer"):
      return Element::integer;
    case packed("dict"):
      return Element::dict;
    case packed("array"):
      return Element::array;
    case packed("true"):
      return Element::trueElement;
    case packed("false"):
      return Element::falseElement;
    case packed("real"):
      return Element::real;
    case packed("date"):
      return Element::date;
    case packed("data"):
      return Element::data;
    case packed("plist"):
      return Element::plist;
    default:
      return std::nullopt;
  }
}

bool isBlank(char c) { return c == ' ' || c == '\n' || c == '\t' || c == '\r'; }

bool endsName(char c) { return c == '>' || isBlank(c) || c == '/' || c == '=' || c == '<'; }

bool isNameCharacter(char c) {
  const bool isLetter = (c | 0x20) >= 'a' && (c | 0x20) <= 'z';
  return isLetter || (c >= '0' && c <= '9') || c == '_' || c == '-' || c == '.' || c == ':' ||
         static_cast<std::uint8_t>(c) > 0x7F;
}

std::string_view trimmed(std::string_view text) {
  while (!text.empty() && isBlank(text.front())) text.remove_prefix(1);
  while (!text.empty() && isBlank(text.back())) text.remove_suffix(1);
  return text;
}

struct OpenElement {
  Element element;
  // In a dictionary: a key waits for its value.
  bool hasKey = false;
};

class XMLReader {
 public:
  XMLReader(const PropertyListXMLText& document, PropertyListEvents& events)
      : document_(document),
        begin_(document.view().data()),
        end_(begin_ + document.view().size()),
        place_(begin_),
        events_(events) {}

  void read();

 private:
  std::string_view rest() const { return {place_, static_cast<std::size_t>(end_ - place_)}; }
  /// The next `character` from `from` on, or the end.
  const char* find(char character, const char* from) const;
  bool accept(std::string_view text);
  void skipBlanks();
  /// Moves behind the next `text`.
  void skipPast(std::string_view text, const char* start);

  void skipComment();
  void skipInstruction();
  void skipDocumentType();
  void skipQuoted();

  void readMarkup();
  void readStartTag();
  void readEndTag();
  std::string_view readName();
  bool skipAttributes(const char* tag);
  void readScalar(Element element, bool isEmpty, const char* tag);

  std::string_view readText(std::string_view name);
  std::string_view readMixedText(std::string_view name);
  void appendText(const char* from, const char* to);
  void appendReference();
  bool acceptEndTag(std::string_view name);

  void beginValue(const char* tag);
  void push(Element element, const char* tag);

  [[noreturn]] void fail(PropertyListErrorCode code, const char* where, std::string_view detail = {}) const;

  const PropertyListXMLText& document_;
  const char* const begin_;
  const char* const end_;
  const char* place_;
  PropertyListEvents& events_;
  std::vector<OpenElement> open_;
  std::string scratch_;
  // The first reference and carriage return at or behind a place that was passed, so that texts without them
  // are not searched for them one by one.
  const char* nextReference_ = begin_;
  const char* nextReturn_ = begin_;
  bool hasRoot_ = false;
  bool hasDocumentType_ = false;
  bool hasPlist_ = false;
};

void XMLReader::read() {
  if (rest().size() > 5 && rest().starts_with("<?xml") && isBlank(place_[5])) skipPast("?>", place_);
  while (true) {
    skipBlanks();
    if (place_ == end_) break;
    if (*place_ != '<') fail(misplacedText, place_);
    readMarkup();
  }
  if (!open_.empty()) fail(unexpectedEnd, end_);
  if (!hasRoot_) fail(missingRoot, end_);
}

void XMLReader::readMarkup() {
  const char next = place_ + 1 < end_ ? place_[1] : '\0';
  if (next == '/') {
    readEndTag();
  } else if (next == '?') {
    skipInstruction();
  } else if (next == '!') {
    if (rest().starts_with("<!--")) {
      skipComment();
    } else if (rest().starts_with("<!DOCTYPE")) {
      skipDocumentType();
    } else {
      fail(rest().starts_with("<![CDATA[") ? misplacedText : malformedMarkup, place_);
    }
  } else {
    readStartTag();
  }
}

void XMLReader::readStartTag() {
  const char* const tag = place_++;
  const auto name = readName();
  const auto element = elementNamed(name);
  if (!element) fail(name.empty() ? malformedMarkup : unknownElement, tag, name);
  const bool isEmpty = skipAttributes(tag);
  switch (*element) {
    case Element::plist:
      if (!open_.empty()) fail(misplacedElement, tag, name);
      if (hasRoot_) fail(secondRoot, tag);
      if (isEmpty) fail(missingRoot, tag);
      hasPlist_ = true;
      open_.push_back({Element::plist});
      break;
    case Element::array:
    case Element::dict:
      beginValue(tag);
      push(*element, tag);
      if (isEmpty) {
        open_.pop_back();
        events_.end();
      }
      break;
    default:
      readScalar(*element, isEmpty, tag);
  }
}

void XMLReader::push(Element element, const char* tag) {
  if (open_.size() - hasPlist_ == PropertyListDepthLimit) fail(tooDeep, tag);
  open_.push_back({element});
  if (element == Element::array) {
    events_.beginArray();
  } else {
    events_.beginDictionary();
  }
}

void XMLReader::beginValue(const char* tag) {
  if (open_.empty() || open_.back().element == Element::plist) {
    if (hasRoot_ || (open_.empty() && hasPlist_)) fail(secondRoot, tag);
    hasRoot_ = true;
  } else if (open_.back().element == Element::dict) {
    if (!open_.back().hasKey) fail(missingKey, tag);
    open_.back().hasKey = false;
  }
}

void XMLReader::readEndTag() {
  const char* const tag = place_;
  place_ += 2;
  const auto name = readName();
  if (open_.empty() || name != elementNames[static_cast<std::size_t>(open_.back().element)])
    fail(mismatchedTag, tag, name);
  skipBlanks();
  if (!accept(">")) fail(malformedMarkup, tag);
  const auto [element, hasKey] = open_.back();
  if (hasKey) fail(missingValue, tag);
  open_.pop_back();
  if (element != Element::plist) {
    events_.end();
  } else if (!hasRoot_) {
    fail(missingRoot, tag);
  }
}

void XMLReader::readScalar(Element element, bool isEmpty, const char* tag) {
  if (element == Element::key) {
    if (open_.empty() || open_.back().element != Element::dict) fail(misplacedElement, tag, "key");
    if (open_.back().hasKey) fail(missingValue, tag);
    open_.back().hasKey = true;
  } else {
    beginValue(tag);
  }
  const auto text = isEmpty ? std::string_view() : readText(elementNames[static_cast<std::size_t>(element)]);
  switch (element) {
    case Element::key:
      return events_.key(text);
    case Element::string:
      return events_.string(text);
    case Element::integer: {
      const auto reading = PropertyListScalars::parseInteger(trimmed(text));
      if (!reading.number) fail(reading.wellFormed ? integerOutOfRange : invalidInteger, tag, trimmed(text));
      return events_.integer(*reading.number);
    }
    case Element::real: {
      const auto number = PropertyListScalars::parseReal(trimmed(text));
      if (!number) fail(invalidReal, tag, trimmed(text));
      return events_.real(*number);
    }
    case Element::date: {
      const auto date = PropertyListScalars::parseDate(trimmed(text));
      if (!date) fail(invalidDate, tag, trimmed(text));
      return events_.date(*date);
    }
    case Element::data: {
      std::string bytes;
      if (!PropertyListScalars::appendFromBase64(bytes, text)) fail(invalidData, tag);
      return events_.data(PropertyListText::copiedData(bytes));
    }
    default:
      if (!trimmed(text).empty()) fail(misplacedText, tag);
      return events_.boolean(element == Element::trueElement);
  }
}

std::string_view XMLReader::readName() {
  const char* const start = place_;
  while (place_ < end_ && !endsName(*place_)) ++place_;
  return {start, static_cast<std::size_t>(place_ - start)};
}

// Moves behind the tag; true for the tag of an empty element.
bool XMLReader::skipAttributes(const char* tag) {
  if (place_ < end_ && *place_ == '>') {
    ++place_;
    return false;
  }
  while (true) {
    const char* const before = place_;
    skipBlanks();
    if (accept(">")) return false;
    if (accept("/>")) return true;
    if (place_ == end_) fail(unexpectedEnd, end_);
    const auto name = readName();
    if (name.empty() || before == name.data()) fail(malformedMarkup, tag);
    skipBlanks();
    if (!accept("=")) fail(malformedMarkup, tag);
    skipBlanks();
    const char* const value = place_;
    skipQuoted();
    if (std::find(value, place_, '<') != place_) fail(malformedMarkup, tag);
  }
}

// The text up to the end tag of the element that was just opened. Mostly it has neither references nor markup
// and is given as it stands.
std::string_view XMLReader::readText(std::string_view name) {
  const char* const start = place_;
  const char* const tag = find('<', start);
  if (nextReference_ < start) nextReference_ = find('&', start);
  if (nextReturn_ < start) nextReturn_ = find('\r', start);
  if (nextReference_ > tag && nextReturn_ > tag) {
    place_ = tag;
    if (acceptEndTag(name)) return {start, static_cast<std::size_t>(tag - start)};
    place_ = start;
  }
  return readMixedText(name);
}

bool XMLReader::acceptEndTag(std::string_view name) {
  const auto tail = rest();
  if (tail.size() < name.size() + 3 || tail[0] != '<' || tail[1] != '/' ||
      tail.substr(2, name.size()) != name)
    return false;
  const char* const tag = place_;
  place_ += 2 + name.size();
  if (*place_ != '>') {
    if (!endsName(*place_)) fail(mismatchedTag, tag);
    skipBlanks();
    if (place_ == end_ || *place_ != '>') fail(malformedMarkup, tag);
  }
  ++place_;
  return true;
}

std::string_view XMLReader::readMixedText(std::string_view name) {
  scratch_.clear();
  while (place_ < end_) {
    if (*place_ == '&') {
      appendReference();
    } else if (*place_ != '<') {
      const char* const from = place_;
      while (place_ < end_ && *place_ != '<' && *place_ != '&') ++place_;
      appendText(from, place_);
    } else if (rest().starts_with("<![CDATA[")) {
      const char* const tag = place_;
      const char* const from = place_ + 9;
      skipPast("]]>", tag);
      appendText(from, place_ - 3);
    } else if (rest().starts_with("<!--")) {
      skipComment();
    } else if (rest().starts_with("<?")) {
      skipInstruction();
    } else if (acceptEndTag(name)) {
      return scratch_;
    } else {
      fail(rest().starts_with("</") ? mismatchedTag : misplacedElement, place_);
    }
  }
  fail(unexpectedEnd, end_);
}

// A line ends in a line feed, however the document ends it.
void XMLReader::appendText(const char* from, const char* to) {
  while (true) {
    const char* const carriageReturn = std::find(from, to, '\r');
    scratch_.append(from, carriageReturn);
    if (carriageReturn == to) return;
    scratch_.push_back('\n');
    from = carriageReturn + 1;
    if (from < to && *from == '\n') ++from;
  }
}

void XMLReader::appendReference() {
  const char* const start = place_++;
  // Long enough for every entity and, with some leading zeros, every character.
  const auto name = rest().substr(0, rest().substr(0, 32).find(';'));
  if (name.size() == std::min<std::size_t>(rest().size(), 32))
    fail(malformedMarkup, start, "a reference without end");
  place_ += name.size() + 1;
  if (name.starts_with('#')) {
    const bool hexadecimal = name.starts_with("#x");
    const auto digits = name.substr(hexadecimal ? 2 : 1);
    // A sign is none of a reference's characters.
    const auto reading =
        digits.empty() || digits[0] == '-' || digits[0] == '+' || digits.starts_with("0x")
            ? PropertyListScalars::IntegerText()
            : PropertyListScalars::parseInteger((hexadecimal ? "0x" : "") + std::string(digits));
    if (!reading.number || *reading.number > 0x10FFFF ||
        !PropertyListText::isXMLCharacter(static_cast<char32_t>(*reading.number)))
      fail(invalidCharacterReference, start, name);
    PropertyListText::appendUTF8(scratch_, static_cast<char32_t>(*reading.number));
    return;
  }
  if (name == "lt") {
    scratch_.push_back('<');
  } else if (name == "gt") {
    scratch_.push_back('>');
  } else if (name == "amp") {
    scratch_.push_back('&');
  } else if (name == "apos") {
    scratch_.push_back('\'');
  } else if (name == "quot") {
    scratch_.push_back('"');
  } else {
    fail(unknownEntity, start, name);
  }
}

const char* XMLReader::find(char character, const char* from) const {
  if (from == end_) return end_;
  const auto* const found = std::memchr(from, character, static_cast<std::size_t>(end_ - from));
  return found ? static_cast<const char*>(found) : end_;
}

bool XMLReader::accept(std::string_view text) {
  if (!rest().starts_with(text)) return false;
  place_ += text.size();
  return true;
}

void XMLReader::skipBlanks() {
  while (place_ < end_ && isBlank(*place_)) ++place_;
}

void XMLReader::skipPast(std::string_view text, const char* start) {
  const auto found = rest().find(text);
  if (found == std::string_view::npos) fail(unexpectedEnd, start);
  place_ += found + text.size();
}

void XMLReader::skipComment() {
  const char* const start = place_;
  place_ += 4;
  skipPast("--", start);
  if (!accept(">")) fail(malformedMarkup, start, "two hyphens in a comment");
}

void XMLReader::skipInstruction() {
  const char* const start = place_;
  place_ += 2;
  const char* const target = place_;
  while (place_ < end_ && isNameCharacter(*place_)) ++place_;
  const auto length = place_ - target;
  const bool isReserved =
      length == 3 && (target[0] | 0x20) == 'x' && (target[1] | 0x20) == 'm' && (target[2] | 0x20) == 'l';
  const bool isEnded = place_ < end_ && (isBlank(*place_) || *place_ == '?');
  if (length == 0 || isReserved || !isEnded) fail(malformedMarkup, start);
  skipPast("?>", start);
}

void XMLReader::skipDocumentType() {
  const char* const start = place_;
  if (!open_.empty() || hasRoot_ || hasPlist_ || hasDocumentType_) fail(malformedMarkup, start);
  hasDocumentType_ = true;
  place_ += 9;
  const char* const blanks = place_;
  skipBlanks();
  if (place_ == blanks || readName().empty()) fail(malformedMarkup, start);
  skipBlanks();
  const bool isPublic = accept("PUBLIC");
  if (isPublic || accept("SYSTEM")) {
    skipBlanks();
    skipQuoted();
    skipBlanks();
    if (isPublic) skipQuoted();
    skipBlanks();
  }
  if (place_ < end_ && *place_ == '[') fail(entityDeclaration, start);
  if (!accept(">")) fail(malformedMarkup, start);
}

void XMLReader::skipQuoted() {
  const char* const start = place_;
  if (place_ == end_ || (*place_ != '"' && *place_ != '\'')) fail(malformedMarkup, start);
  ++place_;
  skipPast({start, 1}, start);
}

void XMLReader::fail(PropertyListErrorCode code, const char* where, std::string_view detail) const {
  const auto line = 1 + static_cast<std::size_t>(std::count(begin_, where, '\n'));
  constexpr std::size_t longest = 40;
  std::string shown(detail);
  if (shown.size() > longest) {
    // Not within a character.
    auto end = longest;
    while ((shown[end] & 0xC0) == 0x80) --end;
    shown.resize(end);
    shown += "...";
  }
  throw propertyListError(code, shown, document_.documentOffset(static_cast<std::size_t>(where - begin_)),
                          line);
}

}  // namespace

void readXMLPropertyList(std::string_view bytes, PropertyListEvents& events) {
  const PropertyListXMLText document(bytes);
  XMLReader(document, events).read();
}

}  // namespace MarletFoundation
