#include "MarletFoundation/XML/MLFXMLWriter.h"

#include <libxml/parserInternals.h>
#include <libxml/xmlwriter.h>

#include <algorithm>
#include <memory>
#include <new>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

/// The tree is built by the library's reader, which doesn't take pieces of ten million bytes.
constexpr std::size_t pieceLimit = 8 << 20;

const xmlChar* characters(const std::string& text) { return reinterpret_cast<const xmlChar*>(text.c_str()); }

[[noreturn]] void refuse(std::string_view text) {
  const auto shown = text.substr(0, utf8PrefixLength(text.substr(0, 200)));
  throw ErrorObject::withMessage(MarletSerializationErrorDomain, 0,
                                 "XML has no form for " + quoted(shown) + ".");
}

bool isCharacter(char16_t unit) {
  return unit >= 0x20 ? unit < 0xFFFE : unit == '\t' || unit == '\n' || unit == '\r';
}

// The library's calls answer no usable result, and what goes wrong in one loses the rest of the document: so
// each is only given what it can write.

void requireText(std::string_view text) {
  const auto units = text.size() <= pieceLimit ? utf16FromUTF8(text) : std::nullopt;
  if (!units || !std::all_of(units->begin(), units->end(), isCharacter)) refuse(text);
}

void requireName(const std::string& name) {
  requireText(name);
  if (xmlValidateNCName(characters(name), 0) != 0) refuse(name);
}

/// Runs `block` while trees are indented by four blanks.
template <class Block>
void performBlockWithCustomTreeIndentString(Block block) {
  const auto* former = xmlTreeIndentString;
  xmlTreeIndentString = "    ";
  block();
  xmlTreeIndentString = former;
}

}  // namespace

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
  _writer = xmlNewTextWriterDoc(&_doc, 0);
  if (!_writer) throw std::bad_alloc();
}

MLFXMLWriter::~MLFXMLWriter() {
  // What an exception left open would be complained about on standard error.
  finishDocument();
  xmlFreeTextWriter(_writer);
  xmlFreeDoc(_doc);
}

void MLFXMLWriter::startDocument() { xmlTextWriterStartDocument(_writer, "1.0", "UTF-8", nullptr); }

void MLFXMLWriter::finishDocument() { xmlTextWriterEndDocument(_writer); }

Data MLFXMLWriter::XMLData() const {
  xmlChar* bytes = nullptr;
  int size = 0;
  performBlockWithCustomTreeIndentString(
      [&] { xmlDocDumpFormatMemoryEnc(_doc, &bytes, &size, "UTF-8", xmlIndentTreeOutput); });
  if (!bytes) throw std::bad_alloc();
  std::shared_ptr<const void> owner(bytes, [](xmlChar* buffer) { xmlFree(buffer); });
  return {std::move(owner), {bytes, static_cast<std::size_t>(size)}};
}

void MLFXMLWriter::writeToURL(const URL& url) const { FileManager::writeFileAtomically(url, XMLData()); }

void MLFXMLWriter::addComment(std::string_view text) {
  if (text.find("--") != std::string_view::npos || text.ends_with('-')) refuse(text);
  requireText(text);
  xmlTextWriterWriteComment(_writer, characters(std::string(text)));
}

void MLFXMLWriter::addText(std::string_view text) {
  requireText(text);
  xmlTextWriterWriteString(_writer, characters(std::string(text)));
}

void MLFXMLWriter::addChildElementWithName(const std::string& name, const MLFXMLAttributes& attributes,
                                           const MLFXMLElementWriter& elementWriter) {
  requireName(name);
  for (const auto& [key, value] : attributes) {
    requireName(key);
    requireText(value);
  }
  xmlTextWriterStartElement(_writer, characters(name));
  for (const auto& [key, value] : attributes)
    xmlTextWriterWriteAttribute(_writer, characters(key), characters(value));
  if (elementWriter) elementWriter(*this);
  xmlTextWriterEndElement(_writer);
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

}  // namespace MarletFoundation
