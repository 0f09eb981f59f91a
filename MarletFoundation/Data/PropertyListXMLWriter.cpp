#include <array>

#include "MarletFoundation/Data/PropertyListWriters.h"
#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListEvents.h"
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

class XMLWriter {
 public:
  std::string write(const PropertyListValue& value) {
    text_ = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n";
    writeValue(value);
    text_ += "</plist>\n";
    return std::move(text_);
  }

 private:
  void writeValue(const PropertyListValue& value);
  void writeArray(const PropertyListValue::Array& array);
  void writeDictionary(const PropertyListDictionary& dictionary);
  void writeText(std::string_view text);
  static void checkText(std::string_view text);
  void writeWithReferences(std::string_view text);
  void open();
  void close();
  void indent() { text_.append(depth_, '\t'); }

  std::string text_;
  std::size_t depth_ = 0;
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
  } else if (const auto* array = value.array()) {
    writeArray(*array);
  } else {
    writeDictionary(*value.dictionary());
  }
}

void XMLWriter::writeArray(const PropertyListValue::Array& array) {
  open();
  if (array.empty()) {
    text_ += "<array/>\n";
  } else {
    text_ += "<array>\n";
    for (const auto& child : array) writeValue(child);
  }
  close();
  if (array.empty()) return;
  indent();
  text_ += "</array>\n";
}

void XMLWriter::writeDictionary(const PropertyListDictionary& dictionary) {
  open();
  if (dictionary.empty()) {
    text_ += "<dict/>\n";
  } else {
    text_ += "<dict>\n";
    for (const auto& [key, child] : dictionary) {
      indent();
      text_ += "<key>";
      writeText(key);
      text_ += "</key>\n";
      writeValue(child);
    }
  }
  close();
  if (dictionary.empty()) return;
  indent();
  text_ += "</dict>\n";
}

void XMLWriter::open() {
  if (depth_++ == PropertyListDepthLimit) throw propertyListError(tooDeep);
}

void XMLWriter::close() { --depth_; }

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
