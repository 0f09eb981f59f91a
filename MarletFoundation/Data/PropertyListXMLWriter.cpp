#include <algorithm>
#include <array>

#include "MarletFoundation/Data/PropertyListChildren.h"
#include "MarletFoundation/Data/PropertyListWriters.h"
#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListScalars.h"
#include "MarletFoundation/Platform/PropertyListText.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

// What stands for a character that can't stand for itself.
constexpr auto references = [] {
  std::array<std::string_view, 256> table;
  table['&'] = "&amp;";
  table['<'] = "&lt;";
  table['>'] = "&gt;";
  // Readers take a carriage return as it stands for a line feed.
  table['\r'] = "&#13;";
  return table;
}();

// Deeper lines are indented no further, so that the output grows with the value alone.
constexpr std::size_t deepestIndentation = 512;

class XMLWriter {
 public:
  std::string write(const PropertyListValue& value) {
    text_ = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n";
    writeValue(value);
    while (!open_.empty()) writeNextChild();
    text_ += "</plist>\n";
    return std::move(text_);
  }

 private:
  void writeValue(const PropertyListValue& value);
  void open(const PropertyListValue& container);
  void writeNextChild();
  void writeText(std::string_view text);
  static void checkText(std::string_view text);
  void writeWithReferences(std::string_view text);
  void indent() { text_.append(std::min(open_.size(), deepestIndentation), '\t'); }

  std::string text_;
  std::vector<PropertyListChildren> open_;
};

void XMLWriter::writeValue(const PropertyListValue& value) {
  indent();
  if (const auto* string = value.string()) {
    text_ += "<string>";
    writeText(*string);
    text_ += "</string>\n";
  } else if (const auto* integer = value.integer()) {
    text_ += "<integer>";
    PropertyListScalars::appendInteger(text_, *integer);
    text_ += "</integer>\n";
  } else if (const auto* real = value.floatingPoint()) {
    text_ += "<real>";
    PropertyListScalars::appendReal(text_, *real);
    text_ += "</real>\n";
  } else if (const auto* boolean = value.boolean()) {
    text_ += *boolean ? "<true/>\n" : "<false/>\n";
  } else if (const auto* date = value.date()) {
    text_ += "<date>";
    if (!PropertyListScalars::appendDate(text_, *date))
      throw propertyListError(unwritableDate, "XML has a form for the years 0 to 9999 only");
    text_ += "</date>\n";
  } else if (const auto* data = value.data()) {
    text_ += "<data>";
    PropertyListScalars::appendBase64(text_, data->view());
    text_ += "</data>\n";
  } else {
    open(value);
  }
}

void XMLWriter::open(const PropertyListValue& container) {
  const PropertyListChildren children(container);
  if (children.atEnd()) {
    text_ += children.isDictionary() ? "<dict/>\n" : "<array/>\n";
    return;
  }
  text_ += children.isDictionary() ? "<dict>\n" : "<array>\n";
  open_.push_back(children);
}

void XMLWriter::writeNextChild() {
  auto& container = open_.back();
  if (container.atEnd()) {
    const bool isDictionary = container.isDictionary();
    open_.pop_back();
    indent();
    text_ += isDictionary ? "</dict>\n" : "</array>\n";
    return;
  }
  if (container.isDictionary()) {
    indent();
    text_ += "<key>";
    writeText(container.key());
    text_ += "</key>\n";
  }
  writeValue(container.next());
}

void XMLWriter::writeText(std::string_view text) {
  // Most texts need neither a look at their characters nor references. One loop without branches tells.
  std::uint8_t suspect = 0;
  std::uint8_t special = 0;
  for (const char c : text) {
    const auto byte = static_cast<std::uint8_t>(c);
    suspect |= static_cast<std::uint8_t>((byte < 0x20) | (byte > 0x7F));
    special |= static_cast<std::uint8_t>((c == '&') | (c == '<') | (c == '>') | (c == '\r'));
  }
  if (suspect) checkText(text);
  if (special) return writeWithReferences(text);
  text_ += text;
}

void XMLWriter::checkText(std::string_view text) {
  if (PropertyListText::findInvalidUTF8(text) != PropertyListText::npos)
    throw propertyListError(unwritableText, "it is not valid UTF-8");
  if (PropertyListText::findInvalidXMLCharacter(text) != PropertyListText::npos)
    throw propertyListError(unwritableText, "XML has no form for a character in " + quoted(text));
}

void XMLWriter::writeWithReferences(std::string_view text) {
  std::size_t written = 0;
  for (std::size_t place = 0; place < text.size(); ++place) {
    const auto reference = references[static_cast<std::uint8_t>(text[place])];
    if (reference.empty()) continue;
    text_.append(text, written, place - written).append(reference);
    written = place + 1;
  }
  text_.append(text, written);
}

}  // namespace

std::string xmlPropertyList(const PropertyListValue& value) { return XMLWriter().write(value); }

}  // namespace MarletFoundation
