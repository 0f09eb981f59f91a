#include "MarletFoundation/XML/MLFXMLWriter.h"

#include <libxml/parserInternals.h>
#include <libxml/xmlwriter.h>

#include <algorithm>
#include <memory>
#include <new>

#include "MarletFoundation/Data/MarletSerializationError.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Platform/XMLErrorRoute.h"

namespace MarletFoundation {
namespace {

/// The tree is built by the library's reader, which takes less than ten million bytes in one piece.
constexpr std::size_t pieceLimit = 8 << 20;
/// How deep the reader nests elements.
constexpr unsigned depthLimit = 256;

const xmlChar* characters(const std::string& text) { return reinterpret_cast<const xmlChar*>(text.c_str()); }

std::string shown(std::string_view text) {
  return quoted(text.substr(0, utf8PrefixLength(text.substr(0, 200))));
}

bool isCharacter(char16_t unit) {
  return unit >= 0x20 ? unit < 0xFFFE : unit == '\t' || unit == '\n' || unit == '\r';
}

// What is refused here would be cut short or read as markup without an error, or would get an error that a host
// can't make anything of.

void requireText(std::string_view text, std::size_t sizeInFront = 0) {
  if (text.size() > pieceLimit - sizeInFront)
    throw StubMarletSerializationError("XML takes at most 8 MiB in one piece: " + shown(text) +
                                       " makes it longer.");
  const auto units = utf16FromUTF8(text);
  if (!units || !std::all_of(units->begin(), units->end(), isCharacter))
    throw StubMarletSerializationError("XML has no form for " + shown(text) + ".");
}

void requireName(const std::string& name) {
  requireText(name);
  if (xmlValidateQName(characters(name), 0) != 0)
    throw StubMarletSerializationError("XML has no form for the name " + shown(name) + ".");
}

}  // namespace

/// Makes calls of the library. Its reader looks at what they write, at the latest when the document ends.
template <class Calls>
void MLFXMLWriter::perform(const Calls& calls) noexcept {
  const XMLErrorRoute route(this, keepError);
  calls();
}

/// What is written to while it lives. Its end is written however the block that writes it is left.
class MLFXMLWriter::OpenElement {
 public:
  OpenElement(MLFXMLWriter& writer, const std::string& name, const MLFXMLAttributes& attributes)
      : writer_(writer) {
    ++writer_._depth;
    writer_._textSize = 0;
    writer_.perform([&] {
      xmlTextWriterStartElement(writer_._writer, characters(name));
      for (const auto& [key, value] : attributes)
        xmlTextWriterWriteAttribute(writer_._writer, characters(key), characters(value));
    });
  }
  ~OpenElement() {
    writer_.perform([&] { xmlTextWriterEndElement(writer_._writer); });
    writer_._textSize = 0;
    --writer_._depth;
  }
  OpenElement(const OpenElement&) = delete;
  OpenElement& operator=(const OpenElement&) = delete;

 private:
  MLFXMLWriter& writer_;
};

Data MLFXMLWriter::XMLDataUsingDocumentWriter(const MLFXMLDocumentWriter& documentWriter) {
  MLFXMLWriter writer;
  writer.startDocument();
  documentWriter(writer);
  writer.finishDocument();
  return writer.XMLData();
}

void MLFXMLWriter::writeXMLToURL(const URL& url, const MLFXMLDocumentWriter& documentWriter) {
  FileManager::writeFileAtomically(url, XMLDataUsingDocumentWriter(documentWriter));
}

void MLFXMLWriter::writeXMLToFile(std::string_view path, const MLFXMLDocumentWriter& documentWriter) {
  writeXMLToURL(URL::file(path), documentWriter);
}

MLFXMLWriter::MLFXMLWriter() {
  // The library's own one-time set-up isn't safe from several threads.
  [[maybe_unused]] static const bool ready = (xmlInitParser(), true);
  perform([&] { _writer = xmlNewTextWriterDoc(&_doc, 0); });
  if (!_writer) throw std::bad_alloc();
}

MLFXMLWriter::~MLFXMLWriter() {
  perform([&] {
    xmlFreeTextWriter(_writer);
    xmlFreeDoc(_doc);
  });
}

void MLFXMLWriter::startDocument() {
  perform([&] { xmlTextWriterStartDocument(_writer, "1.0", "UTF-8", nullptr); });
  requireSuccess();
}

void MLFXMLWriter::finishDocument() {
  perform([&] { xmlTextWriterEndDocument(_writer); });
  requireSuccess();
}

Data MLFXMLWriter::XMLData() const {
  requireSuccess();
  xmlChar* bytes = nullptr;
  int size = 0;
  const XMLErrorRoute route(nullptr, [](void*, xmlError*) {});
  performBlockWithCustomTreeIndentString(
      [&] { xmlDocDumpFormatMemoryEnc(_doc, &bytes, &size, "UTF-8", xmlIndentTreeOutput); });
  if (!bytes) throw std::bad_alloc();
  std::shared_ptr<const void> owner(bytes, [](xmlChar* buffer) { xmlFree(buffer); });
  return {std::move(owner), {bytes, static_cast<std::size_t>(size)}};
}

void MLFXMLWriter::writeToURL(const URL& url) const { FileManager::writeFileAtomically(url, XMLData()); }

void MLFXMLWriter::performBlockWithCustomTreeIndentString(const std::function<void()>& block) {
  struct Restorer {
    const char* former = xmlTreeIndentString;
    ~Restorer() { xmlTreeIndentString = former; }
  } const restorer;
  xmlTreeIndentString = "    ";
  block();
}

void MLFXMLWriter::addComment(std::string_view text) {
  requireText(text);
  if (text.find("--") != std::string_view::npos || text.ends_with('-'))
    throw StubMarletSerializationError("XML has no form for the comment " + shown(text) + ".");
  const std::string terminated(text);
  _textSize = 0;
  perform([&] { xmlTextWriterWriteComment(_writer, characters(terminated)); });
  requireSuccess();
}

void MLFXMLWriter::addText(std::string_view text) {
  requireText(text, _textSize);
  const std::string terminated(text);
  _textSize += text.size();
  perform([&] { xmlTextWriterWriteString(_writer, characters(terminated)); });
  requireSuccess();
}

void MLFXMLWriter::addChildElementWithName(const std::string& name, const MLFXMLAttributes& attributes,
                                           const MLFXMLElementWriter& elementWriter) {
  requireName(name);
  for (const auto& [key, value] : attributes) {
    requireName(key);
    requireText(value);
  }
  if (_depth == depthLimit)
    throw StubMarletSerializationError("XML elements nest more than 256 levels deep at " + shown(name) + ".");
  {
    const OpenElement element(*this, name, attributes);
    requireSuccess();
    if (elementWriter) elementWriter(*this);
  }
  requireSuccess();
}

void MLFXMLWriter::createRootElementWithName(const std::string& name, const MLFXMLAttributes& attributes,
                                             const MLFXMLElementWriter& elementWriter) {
  if (_didAddRootElement)
    fatalError(
        "!_didAddRootElement && \"-createRootElementWithName:attributes:usingElementWriter: may only be "
        "called once per document!\"");
  _didAddRootElement = true;
  addChildElementWithName(name, attributes, elementWriter);
}

void MLFXMLWriter::keepError(void* self, xmlError* error) noexcept {
  auto& kept = static_cast<MLFXMLWriter*>(self)->_error;
  // A prefix may be declared where the document is put to use.
  if (kept || error->level < XML_ERR_ERROR || error->code == XML_NS_ERR_UNDEFINED_NAMESPACE) return;
  try {
    if (error->code == XML_ERR_NO_MEMORY) throw std::bad_alloc();
    std::string words = error->message ? error->message : "it isn't well-formed";
    words.erase(words.find_last_not_of('\n') + 1);
    throw StubMarletSerializationError("The XML document can't be written: " + words + ".");
  } catch (...) {
    kept = std::current_exception();
  }
}

void MLFXMLWriter::requireSuccess() const {
  if (_error) std::rethrow_exception(_error);
}

}  // namespace MarletFoundation
