#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {

/// The domain of what ends a parse.
inline constexpr std::string_view XMLParserErrorDomain = "XMLParser";

/// A streaming XML parser: calls its delegate as it goes. It opens no network connection and no file. Names
/// are taken as they stand, prefix included, and attribute values with their references replaced.
///
/// What is refused, besides ill-formed XML: a document that declares anything of a document type within
/// itself (entities above all) or uses an entity that isn't XML's own, nests more than 256 elements, has more
/// than 256 attributes on one, has different names of more than a megabyte together, or declares an encoding
/// other than UTF-8, UTF-16, ISO-8859-1, US-ASCII or windows-1252. The delegate sees what stands in front of
/// the refused place.
class MARLET_EXPORT XMLParser {
 public:
  using Attributes = std::map<std::string, std::string, std::less<>>;

  class MARLET_EXPORT Delegate {
   public:
    virtual ~Delegate() = default;
    virtual void parserDidStartDocument(XMLParser&) {}
    /// Only called when the whole document was read.
    virtual void parserDidEndDocument(XMLParser&) {}
    virtual void didStartElement(XMLParser&, const std::string& /*name*/, const Attributes&) {}
    virtual void didEndElement(XMLParser&, const std::string& /*name*/) {}
    virtual void foundCharacters(XMLParser&, std::string_view) {}
  };

  explicit XMLParser(Data data) : data_(std::move(data)) {}

  /// Held without ownership; may be null.
  Delegate* delegate = nullptr;

  /// Runs the parse to its end, the first error or an abort. What a delegate throws ends the parse and comes
  /// out here. True when the whole document was read.
  bool parse();
  /// To be called from a delegate: no further callback comes, and `parse` answers false.
  void abortParsing() { aborted_ = true; }
  /// What ended the last parse, with its line under `LineKey`; nothing after a success. An abort has an error
  /// of its own.
  const std::optional<ErrorObject>& parserError() const { return error_; }

 private:
  friend struct XMLParserEvents;
  Data data_;
  bool aborted_ = false;
  std::optional<ErrorObject> error_;
};

}  // namespace MarletFoundation
