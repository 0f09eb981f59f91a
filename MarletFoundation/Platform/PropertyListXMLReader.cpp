#include <algorithm>
#include <optional>
#include <vector>

#include "MarletFoundation/Platform/PropertyListEvents.h"
#include "MarletFoundation/Platform/PropertyListScalars.h"
#include "MarletFoundation/Platform/PropertyListText.h"
#include "MarletFoundation/Platform/PropertyListXMLCursor.h"

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

enum class Element { plist, array, dict, key, string, data, date, integer, real, trueElement, falseElement };

constexpr std::string_view elementNames[] = {"plist", "array",   "dict", "key",  "string", "data",
                                             "date",  "integer", "real", "true", "false"};

std::string_view nameOf(Element element) { return elementNames[static_cast<std::size_t>(element)]; }

std::optional<Element> elementNamed(std::string_view name) {
  const auto* const found = std::find(std::begin(elementNames), std::end(elementNames), name);
  if (found == std::end(elementNames)) return std::nullopt;
  return static_cast<Element>(found - elementNames);
}

std::string_view trimmed(std::string_view text) {
  while (!text.empty() && PropertyListXMLCursor::isBlank(text.front())) text.remove_prefix(1);
  while (!text.empty() && PropertyListXMLCursor::isBlank(text.back())) text.remove_suffix(1);
  return text;
}

struct OpenElement {
  Element element;
  // In a dictionary: a key waits for its value.
  bool hasKey;
};

class XMLReader {
 public:
  XMLReader(const PropertyListXMLText& document, PropertyListEvents& events)
      : cursor_(document), events_(events) {}

  void read();

 private:
  void readMarkup();
  void readStartTag(const char* tag);
  void readEndTag(const char* tag);
  void skipDeclaration(const char* tag);

  void beginRoot(const char* tag);
  void beginContainer(Element element, const char* tag);
  void endContainer(const char* tag);
  void beginKey(const char* tag);
  void beginValue(const char* tag);
  void readScalar(Element element, bool isEmpty, const char* tag);
  void sendInteger(std::string_view text, const char* tag);

  template <std::size_t Size>
  std::string_view readText(Element element, const char (&endTag)[Size]);
  std::string_view readMixedText(Element element);
  /// The first tag, reference or carriage return from `place` on, or the end.
  const char* nextTag(const char* place) { return next('<', place, nextTag_); }
  const char* nextReference(const char* place) { return next('&', place, nextReference_); }
  const char* nextReturn(const char* place) { return next('\r', place, nextReturn_); }
  const char* next(char character, const char* place, const char*& known) {
    if (known < place) known = cursor_.find(character, place);
    return known;
  }
  void appendText(const char* from, const char* to);
  void appendReference();
  bool acceptEndTag(std::string_view name);

  [[noreturn]] void fail(PropertyListErrorCode code, const char* where, std::string_view detail = {}) const {
    cursor_.fail(code, where, detail);
  }

  PropertyListXMLCursor cursor_;
  PropertyListEvents& events_;
  std::vector<OpenElement> open_;
  std::string scratch_;
  // As far as they are known, so that what lies before them is searched for them once.
  const char* nextTag_ = cursor_.place();
  const char* nextReference_ = cursor_.place();
  const char* nextReturn_ = cursor_.place();
  bool hasRoot_ = false;
  bool hasDocumentType_ = false;
  bool hasPlist_ = false;
};

void XMLReader::read() {
  cursor_.skipDeclaration();
  while (true) {
    cursor_.skipBlanks();
    if (cursor_.isAtEnd()) break;
    if (cursor_.next() != '<') fail(misplacedText, cursor_.place());
    readMarkup();
  }
  if (!open_.empty()) fail(unexpectedEnd, cursor_.end());
  if (!hasRoot_) fail(missingRoot, cursor_.end());
}

// Tags are mostly written in their shortest form, which is known at a glance. Any other is left to the functions
// that take a tag apart.
void XMLReader::readMarkup() {
  const char* const tag = cursor_.place();
  switch (cursor_.rest().size() > 1 ? tag[1] : '\0') {
    case 'k':
      if (!cursor_.accept("<key>")) break;
      beginKey(tag);
      return events_.key(readText(Element::key, "</key>"));
    case 's':
      if (!cursor_.accept("<string>")) break;
      beginValue(tag);
      return events_.string(readText(Element::string, "</string>"));
    case 'i':
      if (!cursor_.accept("<integer>")) break;
      beginValue(tag);
      return sendInteger(readText(Element::integer, "</integer>"), tag);
    case 't':
      if (!cursor_.accept("<true/>")) break;
      beginValue(tag);
      return events_.boolean(true);
    case 'f':
      if (!cursor_.accept("<false/>")) break;
      beginValue(tag);
      return events_.boolean(false);
    case 'd':
      if (!cursor_.accept("<dict>")) break;
      return beginContainer(Element::dict, tag);
    case 'a':
      if (!cursor_.accept("<array>")) break;
      return beginContainer(Element::array, tag);
    case '/':
      return readEndTag(tag);
    case '?':
      return cursor_.skipInstruction();
    case '!':
      return skipDeclaration(tag);
    default:
      break;
  }
  readStartTag(tag);
}

void XMLReader::skipDeclaration(const char* tag) {
  if (cursor_.startsWith("<!--", tag)) return cursor_.skipComment();
  if (cursor_.startsWith("<![CDATA[", tag)) fail(misplacedText, tag);
  if (!cursor_.startsWith("<!DOCTYPE", tag) || !open_.empty() || hasRoot_ || hasPlist_ || hasDocumentType_)
    fail(malformedMarkup, tag);
  hasDocumentType_ = true;
  cursor_.skipDocumentType();
}

void XMLReader::readStartTag(const char* tag) {
  cursor_.moveTo(tag + 1);
  const auto name = cursor_.readName();
  const auto element = elementNamed(name);
  if (!element) fail(name.empty() ? malformedMarkup : unknownElement, tag, name);
  const bool isEmpty = cursor_.skipAttributes(tag);
  switch (*element) {
    case Element::plist:
      beginRoot(tag);
      if (isEmpty) fail(missingRoot, tag);
      return;
    case Element::array:
    case Element::dict:
      beginContainer(*element, tag);
      if (isEmpty) endContainer(tag);
      return;
    default:
      return readScalar(*element, isEmpty, tag);
  }
}

void XMLReader::readEndTag(const char* tag) {
  const auto element = open_.empty() ? Element::plist : open_.back().element;
  if ((element == Element::dict && cursor_.accept("</dict>")) ||
      (element == Element::array && cursor_.accept("</array>"))) {
    return endContainer(tag);
  }
  cursor_.moveTo(tag + 2);
  const auto name = cursor_.readName();
  if (open_.empty() || name != nameOf(element)) fail(mismatchedTag, tag, name);
  cursor_.skipBlanks();
  if (!cursor_.accept(">")) fail(malformedMarkup, tag);
  endContainer(tag);
}

void XMLReader::beginRoot(const char* tag) {
  if (!open_.empty()) fail(misplacedElement, tag, nameOf(Element::plist));
  if (hasRoot_) fail(secondRoot, tag);
  hasPlist_ = true;
  open_.push_back({Element::plist, false});
}

void XMLReader::beginContainer(Element element, const char* tag) {
  beginValue(tag);
  open_.push_back({element, false});
  if (element == Element::array) {
    events_.beginArray();
  } else {
    events_.beginDictionary();
  }
}

void XMLReader::endContainer(const char* tag) {
  const auto [element, hasKey] = open_.back();
  if (hasKey) fail(missingValue, tag);
  open_.pop_back();
  if (element != Element::plist) {
    events_.end();
  } else if (!hasRoot_) {
    fail(missingRoot, tag);
  }
}

inline void XMLReader::beginValue(const char* tag) {
  if (open_.empty() || open_.back().element == Element::plist) {
    if (hasRoot_ || (open_.empty() && hasPlist_)) fail(secondRoot, tag);
    hasRoot_ = true;
  } else if (open_.back().element == Element::dict) {
    if (!open_.back().hasKey) fail(missingKey, tag);
    open_.back().hasKey = false;
  }
}

inline void XMLReader::beginKey(const char* tag) {
  if (open_.empty() || open_.back().element != Element::dict)
    fail(misplacedElement, tag, nameOf(Element::key));
  if (open_.back().hasKey) fail(missingValue, tag);
  open_.back().hasKey = true;
}

void XMLReader::readScalar(Element element, bool isEmpty, const char* tag) {
  if (element == Element::key) {
    beginKey(tag);
  } else {
    beginValue(tag);
  }
  const auto text = isEmpty ? std::string_view() : readMixedText(element);
  switch (element) {
    case Element::key:
      return events_.key(text);
    case Element::string:
      return events_.string(text);
    case Element::integer:
      return sendInteger(text, tag);
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

void XMLReader::sendInteger(std::string_view text, const char* tag) {
  const auto reading = PropertyListScalars::parseInteger(trimmed(text));
  if (!reading.number) fail(reading.wellFormed ? integerOutOfRange : invalidInteger, tag, trimmed(text));
  events_.integer(*reading.number);
}

// The text up to the end tag of the element that was just opened. Mostly it has neither references nor markup
// and is given as it stands.
template <std::size_t Size>
inline std::string_view XMLReader::readText(Element element, const char (&endTag)[Size]) {
  const char* const start = cursor_.place();
  const char* const tag = nextTag(start);
  if (nextReference(start) < tag || nextReturn(start) < tag || !cursor_.startsWith(endTag, tag))
    return readMixedText(element);
  cursor_.moveTo(tag + Size - 1);
  return {start, static_cast<std::size_t>(tag - start)};
}

std::string_view XMLReader::readMixedText(Element element) {
  scratch_.clear();
  while (!cursor_.isAtEnd()) {
    const char* const start = cursor_.place();
    if (*start == '&') {
      appendReference();
    } else if (*start != '<') {
      cursor_.moveTo(std::min(nextTag(start), nextReference(start)));
      appendText(start, cursor_.place());
    } else if (cursor_.accept("<![CDATA[")) {
      const char* const text = cursor_.place();
      cursor_.skipPast("]]>", start);
      appendText(text, cursor_.place() - 3);
    } else if (cursor_.startsWith("<!--", start)) {
      cursor_.skipComment();
    } else if (cursor_.startsWith("<?", start)) {
      cursor_.skipInstruction();
    } else if (acceptEndTag(nameOf(element))) {
      return scratch_;
    } else {
      fail(cursor_.startsWith("</", start) ? mismatchedTag : misplacedElement, start);
    }
  }
  fail(unexpectedEnd, cursor_.end());
}

bool XMLReader::acceptEndTag(std::string_view name) {
  const char* const tag = cursor_.place();
  if (!cursor_.accept("</")) return false;
  if (cursor_.readName() != name) {
    cursor_.moveTo(tag);
    return false;
  }
  cursor_.skipBlanks();
  if (!cursor_.accept(">")) fail(malformedMarkup, tag);
  return true;
}

// A line ends in a line feed, however the document ends it.
void XMLReader::appendText(const char* from, const char* to) {
  while (true) {
    const char* const carriageReturn = std::min(nextReturn(from), to);
    scratch_.append(from, carriageReturn);
    if (carriageReturn == to) return;
    scratch_.push_back('\n');
    from = carriageReturn + 1;
    if (from < to && *from == '\n') ++from;
  }
}

void XMLReader::appendReference() {
  const char* const start = cursor_.place();
  cursor_.moveTo(start + 1);
  // Long enough for every entity and, with some leading zeros, every character.
  const auto window = cursor_.rest().substr(0, 32);
  const auto name = window.substr(0, window.find(';'));
  if (name.size() == window.size()) fail(malformedMarkup, start, "a reference without end");
  cursor_.moveTo(start + 1 + name.size() + 1);
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
  static constexpr std::pair<std::string_view, char> entities[] = {
      {"lt", '<'}, {"gt", '>'}, {"amp", '&'}, {"apos", '\''}, {"quot", '"'}};
  for (const auto& [entity, character] : entities) {
    if (name == entity) return scratch_.push_back(character);
  }
  fail(unknownEntity, start, name);
}

}  // namespace

void readXMLPropertyList(std::string_view bytes, PropertyListEvents& events) {
  const PropertyListXMLText document(bytes);
  XMLReader(document, events).read();
}

}  // namespace MarletFoundation
