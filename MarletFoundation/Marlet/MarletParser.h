#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Marlet/MarletPageSnapshot.h"
#include "MarletFoundation/Platform/XMLParser.h"

namespace MarletFoundation {

/// Reads a classic document's manifest, "contents.wbmarlet", in any of its versions, and the pages that belong
/// to it. Up to version 4 a document is one page that is assembled from sections, which the caller gets as one
/// page without a name; from version 5 on, a page is a directory. One object serves one parse.
class MARLET_EXPORT MarletParser final : public XMLParser::Delegate {
 public:
  /// The element that the parser stands in.
  enum class ParserState {
    DocumentRoot,
    MarletElement,
    PagesElement,
    PageElement,
    SectionsElement,
    CodeElement,
    TimelineElement,
  };

  struct Document {
    std::string targetPlatform;
    bool requiresFullEnvironment;
    std::vector<MarletPageSnapshot> pages;
  };

  MarletParser(FileWrapper fileWrapper, URL baseURL)
      : fileWrapper_(std::move(fileWrapper)), baseURL_(std::move(baseURL)) {}

  /// Throws the `ErrorObject` of the first failure: of `MarletSerializationErrorDomain`, or the XML parser's
  /// own. A `sections` element without any `code` is a fatal error. A source with which all
  /// of the document have more than 2^28 UTF-16 units is refused as one that can't be read.
  Document parse();

  /// Whether the document is of version 4 or less; nothing before the root element has been seen.
  std::optional<bool> isOldStyleMarlet() const { return isOldStyleMarlet_; }
  /// Whether the one page was assembled from sections.
  bool didJoinSections() const { return singlePageMarletContents_.has_value(); }
  std::int64_t majorVersion() const { return majorVersion_; }
  std::int64_t minorVersion() const { return minorVersion_; }

  /// Reads a page from its directory, which lies at `baseURL`. Throws as `parse` does.
  static MarletPageSnapshot pageSnapshotFromFileWrapper(const FileWrapper& fileWrapper, const URL& baseURL,
                                                        std::optional<std::string> name);

  void parserDidStartDocument(XMLParser& parser) override;
  void didStartElement(XMLParser& parser, const std::string& name,
                       const XMLParser::Attributes& attributes) override;
  void didEndElement(XMLParser& parser, const std::string& name) override;
  void parserDidEndDocument(XMLParser& parser) override;

 private:
  using Attributes = XMLParser::Attributes;
  using Pages = std::vector<MarletPageSnapshot>;

  ParserState state() const;
  void readVersion(const std::string& rootName, const Attributes& attributes);
  void didStartOldStyleElement(const std::string& name, const Attributes& attributes);
  void readOldStyleRoot(const Attributes& attributes);
  void readSection(const Attributes& attributes);
  [[noreturn]] static void refuseDocumentation();
  void didStartNewStyleElement(const std::string& name, const Attributes& attributes);
  void readNewStyleRoot(const Attributes& attributes);
  void openPageList();
  void readPage(const Attributes& attributes);

  void addPageOfSections();
  void addPagesOmittedByList();
  void addPagesOfDirectory(const FileWrapper& directory);
  void addRootAsPage();
  void addNamedPage(const FileWrapper& directory, const std::string& name);
  void addPage(const FileWrapper& directory, const URL& url, std::optional<std::string> name);
  /// False once the document's sources are too large.
  bool takes(std::size_t sourceUnits);

  FileWrapper fileWrapper_;
  URL baseURL_;
  std::optional<bool> isOldStyleMarlet_;
  std::int64_t majorVersion_ = 0;
  std::int64_t minorVersion_ = 0;
  std::optional<std::string> targetPlatform_;
  std::optional<bool> requiresFullEnvironment_;
  /// Nothing as long as the document has declared no page list.
  std::optional<Pages> pages_;
  std::optional<std::u16string> singlePageMarletContents_;
  std::vector<ParserState> stateStack_;
  std::optional<ErrorObject> parseError_;
  /// A manifest may name one large source thousands of times; so what is read is counted.
  std::size_t sourceUnitsLeft_ = std::size_t{1} << 28;
};

}  // namespace MarletFoundation
