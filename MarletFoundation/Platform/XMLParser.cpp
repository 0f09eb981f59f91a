#include "MarletFoundation/Platform/XMLParser.h"

#include <libxml/parser.h>
#include <libxml/parserInternals.h>

#include <algorithm>
#include <exception>
#include <limits>
#include <memory>

#include "MarletFoundation/Platform/XMLErrorRoute.h"
#include "MarletFoundation/Platform/XMLText.h"

namespace MarletFoundation {
namespace {

constexpr int depthLimit = 256;
/// Bytes of all different names together. The reader's table of names becomes slow with more.
constexpr std::size_t nameLimit = 1 << 20;

struct ContextCloser {
  void operator()(xmlParserCtxt* context) const { xmlFreeParserCtxt(context); }
};
using Context = std::unique_ptr<xmlParserCtxt, ContextCloser>;

const char* text(const xmlChar* characters) { return reinterpret_cast<const char*>(characters); }

std::int64_t lastLine(std::string_view utf8) { return 1 + std::count(utf8.begin(), utf8.end(), '\n'); }

std::int64_t line(const ErrorObject& error) {
  return std::get<std::int64_t>(error.userInfo().find(LineKey)->second);
}

}  // namespace

/// One run of a parser: receives the reader's events and calls the delegate. Nothing is thrown through the
/// reader; an exception waits here until it has returned.
struct XMLParserEvents {
  XMLParser& parser;
  xmlParserCtxt* context = nullptr;
  int depth = 0;
  std::exception_ptr thrown;

  explicit XMLParserEvents(XMLParser& p) : parser(p) {}

  static XMLParserEvents& of(void* self) { return *static_cast<XMLParserEvents*>(self); }

  void fail(int code, std::string message, std::int64_t line) {
    if (parser.error_) return;
    UserInfo info{{std::string(LocalizedDescriptionKey), std::move(message)}, {std::string(LineKey), line}};
    parser.error_.emplace(std::string(XMLParserErrorDomain), code, std::move(info));
  }
  /// Keeps what `work` throws, which also is what finds no memory.
  template <class Work>
  void keepThrown(const Work& work) noexcept {
    try {
      work();
    } catch (...) {
      if (!thrown) thrown = std::current_exception();
      parser.aborted_ = true;
    }
  }
  /// Ends the run from within an event.
  void stop(int code, std::string_view message) {
    keepThrown(
        [&] { fail(code, std::string(message), context && context->input ? context->input->line : 1); });
    if (context) xmlStopParser(context);
  }

  template <class Call>
  void tellDelegate(const Call& call) {
    if (!parser.delegate || parser.error_ || thrown) return;
    keepThrown([&] { call(*parser.delegate); });
    if (parser.aborted_) stop(XML_ERR_USER_STOP, "The parse was aborted.");
  }

  static void startElement(void* self, const xmlChar* name, const xmlChar** attributes) {
    auto& events = of(self);
    if (++events.depth > depthLimit)
      return events.stop(XML_ERR_INTERNAL_ERROR, "The document nests more than 256 elements.");
    events.tellDelegate([&](XMLParser::Delegate& delegate) {
      XMLParser::Attributes values;
      for (; attributes && attributes[0]; attributes += 2) {
        values.emplace(text(attributes[0]), attributes[1] ? text(attributes[1]) : "");
      }
      delegate.didStartElement(events.parser, text(name), values);
    });
  }

  static void endElement(void* self, const xmlChar* name) {
    auto& events = of(self);
    --events.depth;
    events.tellDelegate(
        [&](XMLParser::Delegate& delegate) { delegate.didEndElement(events.parser, text(name)); });
  }

  static void characters(void* self, const xmlChar* start, int length) {
    auto& events = of(self);
    events.tellDelegate([&](XMLParser::Delegate& delegate) {
      delegate.foundCharacters(events.parser, {text(start), static_cast<std::size_t>(length)});
    });
  }

  /// Called behind the name of the document type, in front of what is declared within the document.
  static void documentType(void* self, const xmlChar*, const xmlChar*, const xmlChar*) {
    auto& events = of(self);
    if (*events.context->input->cur == '[')
      events.stop(XML_ERR_ENTITY_PROCESSING, "The document declares a document type of its own.");
  }
  /// Asked for all but the five entities of XML itself. Beside a document type the reader would only warn.
  static xmlEntity* entity(void* self, const xmlChar* name) {
    auto& events = of(self);
    events.keepThrown([&] {
      events.fail(XML_ERR_UNDECLARED_ENTITY, std::string("The entity '") + text(name) + "' isn't declared.",
                  events.context->input->line);
    });
    xmlStopParser(events.context);
    return nullptr;
  }

  static void error(void* self, xmlError* error) {
    auto& events = of(self);
    if (error->level < XML_ERR_FATAL) return;
    events.keepThrown([&] {
      std::string message = error->message ? error->message : "The document isn't well-formed.";
      message.erase(message.find_last_not_of('\n') + 1);
      if (error->code == XML_ERR_NO_MEMORY) message = "The document's names take more than a megabyte.";
      events.fail(error->code, std::move(message), error->line);
    });
    // The reader goes on to report every further error. Its buffers are in use, so it can't be stopped as
    // from an event, only made to leave its loops.
    events.context->instate = XML_PARSER_EOF;
    events.context->disableSAX = 1;
  }

  static xmlSAXHandler handlers() {
    xmlSAXHandler sax{};
    // The events without namespaces, which keep names as they stand.
    sax.initialized = 1;
    sax.startElement = startElement;
    sax.endElement = endElement;
    sax.characters = characters;
    sax.ignorableWhitespace = characters;
    sax.internalSubset = documentType;
    sax.getEntity = entity;
    return sax;
  }

  void read(std::string_view utf8) {
    if (utf8.empty()) return fail(XML_ERR_DOCUMENT_EMPTY, "The document is empty.", 1);
    if (utf8.size() > std::numeric_limits<int>::max())
      return fail(XML_ERR_INTERNAL_ERROR, "The document is larger than two gigabytes.", 1);
    const Context owner(xmlCreateMemoryParserCtxt(utf8.data(), static_cast<int>(utf8.size())));
    if (!owner) throw std::bad_alloc();
    context = owner.get();
    *context->sax = handlers();
    context->userData = this;
    const XMLErrorRoute route(this, error);
    // Only the entities of XML itself are ever replaced, since no other comes to exist.
    // The reader's limits on size give way to ours, as theirs depend on where its buffer happens to end.
    xmlCtxtUseOptions(context, XML_PARSE_NONET | XML_PARSE_NOENT | XML_PARSE_IGNORE_ENC | XML_PARSE_HUGE);
    xmlDictSetLimit(context->dict, nameLimit);
    xmlParseDocument(context);
    if (!context->wellFormed) fail(XML_ERR_DOCUMENT_END, "The document isn't well-formed.", 1);
    context = nullptr;
  }
};

bool XMLParser::parse() {
  // The reader's own one-time set-up isn't safe from several threads.
  [[maybe_unused]] static const bool ready = (xmlInitParser(), true);
  aborted_ = false;
  error_.reset();

  const auto document = xmlText(data_);
  const auto utf8 = document.utf8.view();
  XMLParserEvents events(*this);
  events.tellDelegate([&](Delegate& d) { d.parserDidStartDocument(*this); });
  if (!error_ && !events.thrown) events.read(utf8);
  if (document.refusal && !aborted_ && (!error_ || line(*error_) >= lastLine(utf8))) {
    // Where the text was cut, the cut's reason tells more than that the text ends too early.
    error_.reset();
    events.fail(XML_ERR_DOCUMENT_END, std::string(*document.refusal), lastLine(utf8));
  }
  if (!error_ && !events.thrown) events.tellDelegate([&](Delegate& d) { d.parserDidEndDocument(*this); });
  if (events.thrown) std::rethrow_exception(events.thrown);
  return !error_;
}

}  // namespace MarletFoundation
