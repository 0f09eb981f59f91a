#pragma once

#include <cstring>
#include <string_view>

#include "MarletFoundation/Platform/PropertyListEncoding.h"
#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListWork.h"

namespace MarletFoundation {

/// A place in an XML document that only moves on, and what stands around a property list's elements there.
/// Functions throw an `ErrorObject` of `PropertyListErrorDomain` for what isn't well-formed.
class PropertyListXMLCursor {
 public:
  /// The document must outlive the cursor.
  explicit PropertyListXMLCursor(const PropertyListXMLText& document)
      : document_(document),
        begin_(document.view().data()),
        end_(begin_ + document.view().size()),
        place_(begin_) {}
  PropertyListXMLCursor(const PropertyListXMLCursor&) = delete;
  PropertyListXMLCursor& operator=(const PropertyListXMLCursor&) = delete;
  ~PropertyListXMLCursor() { countPropertyListWork(searched_); }

  const char* place() const { return place_; }
  const char* end() const { return end_; }
  bool isAtEnd() const { return place_ == end_; }
  /// The next byte, NUL at the end.
  char next() const { return isAtEnd() ? '\0' : *place_; }
  std::string_view rest() const { return {place_, static_cast<std::size_t>(end_ - place_)}; }
  std::string_view from(const char* start) const { return {start, static_cast<std::size_t>(place_ - start)}; }
  void moveTo(const char* place) { place_ = place; }

  /// Whether the document goes on with `literal` at `place`.
  template <std::size_t Size>
  bool startsWith(const char (&literal)[Size], const char* place) const {
    // Of a constant size, so that it compiles to a comparison or two.
    constexpr auto length = Size - 1;
    return static_cast<std::size_t>(end_ - place) >= length && std::memcmp(place, literal, length) == 0;
  }
  template <std::size_t Size>
  bool accept(const char (&literal)[Size]) {
    if (!startsWith(literal, place_)) return false;
    place_ += Size - 1;
    return true;
  }

  /// The text has no control characters but blanks.
  static bool isBlank(char c) { return static_cast<unsigned char>(c) <= ' '; }
  void skipBlanks() {
    while (place_ < end_ && isBlank(*place_)) ++place_;
  }
  /// The next `character` from `from` on, or the end.
  const char* find(char character, const char* from) const;
  /// A name of any kind, empty when there is none.
  std::string_view readName();

  /// Moves behind the rest of a start tag after its name; true for the tag of an empty element.
  bool skipAttributes(const char* tag);
  void skipDeclaration();
  void skipComment();
  void skipInstruction();
  /// A document type without an internal subset.
  void skipDocumentType();

  /// Throws the error with what it found and its place in the document.
  [[noreturn]] void fail(PropertyListErrorCode code, const char* where, std::string_view detail = {}) const;

  /// Moves behind the next `text`.
  void skipPast(std::string_view text, const char* start);

 private:
  void skipQuoted();

  const PropertyListXMLText& document_;
  const char* const begin_;
  const char* const end_;
  const char* place_;
  // Bytes, beyond what lies near.
  mutable std::size_t searched_ = 0;
};

}  // namespace MarletFoundation
