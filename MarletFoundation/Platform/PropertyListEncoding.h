#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace MarletFoundation {

/// The text of an XML document in UTF-8: the document's own bytes where they are UTF-8 already, else a
/// conversion of them.
class PropertyListXMLText {
 public:
  /// Knows UTF-8 and UTF-16 by mark or first bytes, others by their declaration. Throws an `ErrorObject` of
  /// `PropertyListErrorDomain` for an encoding it doesn't know, text that isn't valid in its encoding, and
  /// characters that XML has none of.
  explicit PropertyListXMLText(std::string_view bytes);
  PropertyListXMLText(const PropertyListXMLText&) = delete;
  PropertyListXMLText& operator=(const PropertyListXMLText&) = delete;

  /// Without a byte-order mark.
  std::string_view view() const { return text_; }
  /// The offset in the document's bytes of an offset in the text. For an encoding that is neither UTF-8 nor
  /// UTF-16, the offset in the converted text.
  std::size_t documentOffset(std::size_t textOffset) const;

 private:
  void readUTF16(std::string_view bytes, bool bigEndian);
  void readDeclared(std::string_view bytes, std::string_view encoding);

  std::string converted_;
  std::string_view text_;
  std::size_t markLength_ = 0;
  bool isUTF16_ = false;
};

}  // namespace MarletFoundation
