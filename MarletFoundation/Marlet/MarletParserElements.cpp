// What the parser does at each tag: one state, one row of checks.

#include "MarletFoundation/Data/MarletSerializationError.h"
#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Marlet/DocumentLog.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/MarletParser.h"
#include "MarletFoundation/PathUtilities/DocumentNames.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using Attributes = XMLParser::Attributes;

[[noreturn]] void fail(const std::string& what) {
  throw StubMarletSerializationError("Unable to parse contents.wbmarlet" + what);
}

[[noreturn]] void failForRoot(const std::string& name) {
  fail(": the root element is not named 'marlet' (it is named '" + name + "').");
}

[[noreturn]] void failForUnknownChild(const std::string& name, const std::string& parent) {
  fail(": encountered unknown element '" + name + "' as child of '" + parent + "' element.");
}

[[noreturn]] void failForAnyChild(const std::string& name, const std::string& parent) {
  fail(": encountered element '" + name + "' as a child of a '" + parent +
       "' element which should have no children.");
}

[[noreturn]] void failForContents(const std::string& filename) {
  throw StubMarletSerializationError("Unable to load contents of '" + filename + "'.");
}

const std::string* valueOf(const Attributes& attributes, std::string_view name) {
  const auto found = attributes.find(name);
  return found == attributes.end() ? nullptr : &found->second;
}

bool readFlag(const Attributes& attributes, const std::string& name) {
  const auto* value = valueOf(attributes, name);
  if (!value) return false;
  auto lowercase = *value;
  for (char& c : lowercase) c = c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
  if (lowercase == "yes" || lowercase == "true") return true;
  if (lowercase == "no" || lowercase == "false") return false;
  fail(": value of '" + name + "' attribute is invalid (expected yes/true or no/false, but got " + *value +
       ").");
}

std::int64_t readVersionNumber(std::string_view text, const std::string& kind) {
  const auto number = parseDecimalInteger(text);
  if (!number) fail(": the " + kind + " version number cannot be parsed as a decimal number.");
  return *number;
}

struct StateRow {
  std::string_view state;
  std::string_view element;
};

const StateRow& rowOf(MarletParser::ParserState state) {
  static constexpr StateRow rows[] = {
      {"DocumentRoot", ""},
      {"MarletElement", "marlet"},
      {"PagesElement", "pages"},
      {"PageElement", "page"},
      {"SectionsElement", "sections"},
      {"CodeElement", "code"},
      {"TimelineElement", "timeline"},
  };
  return rows[static_cast<std::size_t>(state)];
}

std::string namesOf(const FileWrapper& directory) {
  std::string names;
  if (const auto children = directory.fileWrappers()) {
    for (const auto& child : *children) names += (names.empty() ? "" : ", ") + quoted(child.first);
  }
  return "[" + names + "]";
}

}  // namespace

void MarletParser::parserDidStartDocument(XMLParser&) {
  if (!stateStack_.empty()) fatalError("A marlet's document should only start once!");
  stateStack_.push_back(ParserState::DocumentRoot);
}

void MarletParser::parserDidEndDocument(XMLParser&) {
  if (stateStack_ != std::vector{ParserState::DocumentRoot})
    fatalError("A marlet's document should not end within an element!");
  stateStack_.pop_back();
}

void MarletParser::didStartElement(XMLParser& parser, const std::string& name, const Attributes& attributes) {
  try {
    if (!isOldStyleMarlet_) readVersion(name, attributes);
    *isOldStyleMarlet_ ? didStartOldStyleElement(name, attributes)
                       : didStartNewStyleElement(name, attributes);
  } catch (const ErrorObject& error) {
    parseError_ = error;
    parser.abortParsing();
  }
}

void MarletParser::didEndElement(XMLParser&, const std::string& name) {
  const auto& ended = rowOf(state());
  if (ended.element != name)
    fatalError("Unexpected state for " + std::string(isOldStyleMarlet_.value_or(false) ? "" : "new-style ") +
               "marlet: " + std::string(ended.state));
  // The page itself is made at the end, since sections may go on in another element.
  if (name == "sections" && !singlePageMarletContents_)
    fatalError("A 'sections' element must have at least one 'code' element!");
  stateStack_.pop_back();
}

MarletParser::ParserState MarletParser::state() const {
  if (stateStack_.empty()) fatalError("A marlet's elements should only come within its document!");
  return stateStack_.back();
}

void MarletParser::readVersion(const std::string& rootName, const Attributes& attributes) {
  if (state() != ParserState::DocumentRoot) fatalError("The first element should be the root element!");
  if (rootName != "marlet") failForRoot(rootName);
  const auto* version = valueOf(attributes, "version");
  if (!version) fail(": the 'marlet' element does not specify a version number.");
  const auto components = split(*version, '.');
  if (components.size() < 2)
    fail(": the version of the marlet must contain at least a major and minor component.");
  majorVersion_ = readVersionNumber(components[0], "major");
  minorVersion_ = readVersionNumber(components[1], "minor");
  if (majorVersion_ > 6)
    fail(": the version (" + std::to_string(majorVersion_) + ") of the file is too new.");
  isOldStyleMarlet_ = majorVersion_ <= 4;
}

void MarletParser::didStartOldStyleElement(const std::string& name, const Attributes& attributes) {
  switch (state()) {
    case ParserState::DocumentRoot:
      if (name != "marlet") failForRoot(name);
      readOldStyleRoot(attributes);
      return stateStack_.push_back(ParserState::MarletElement);
    case ParserState::MarletElement:
      if (name == "sections") return stateStack_.push_back(ParserState::SectionsElement);
      if (name == "timeline") return stateStack_.push_back(ParserState::TimelineElement);
      failForUnknownChild(name, "marlet");
    case ParserState::SectionsElement:
      if (name == "documentation") refuseDocumentation();
      if (name != "code") failForUnknownChild(name, "sections");
      readSection(attributes);
      return stateStack_.push_back(ParserState::CodeElement);
    case ParserState::CodeElement:
      failForAnyChild(name, "code");
    case ParserState::TimelineElement:
      failForAnyChild(name, "timeline");
    case ParserState::PagesElement:
    case ParserState::PageElement:
      fatalError("It should not be possible to get into these states in an old-style marlet!");
  }
}

void MarletParser::readOldStyleRoot(const Attributes& attributes) {
  const auto* sdk = valueOf(attributes, "sdk");
  if (!sdk) fail(": the 'marlet' element does not have an 'sdk' attribute.");
  if (sdk->starts_with("slate")) {
    targetPlatform_ = "slateos";
  } else if (sdk->starts_with("deskos")) {
    targetPlatform_ = "desk";
  } else {
    fail(": the 'sdk' attribute requests the " + *sdk + " SDK, but we don't know what platform that is.");
  }
  requiresFullEnvironment_ = readFlag(attributes, "runInFullSimulator");
}

void MarletParser::readSection(const Attributes& attributes) {
  const auto* filename = valueOf(attributes, "source-file-name");
  if (!filename) fail(": 'code' element does not specify 'source-file-name'.");
  const auto file = fileWrapper_.child(*filename);
  if (!file) throw StubMarletSerializationError("Unable to load '" + *filename + "'.");
  const auto data = file->regularFileContents();
  if (!data) failForContents(*filename);
  const auto text = utf16FromUTF8(data->view());
  if (!text)
    throw StubMarletSerializationError("Unable to parse contents of '" + *filename +
                                       "' as UTF-8-encoded text.");
  if (!takes(text->size())) failForContents(*filename);
  if (singlePageMarletContents_) {
    *singlePageMarletContents_ += u'\n' + *text;
  } else {
    singlePageMarletContents_ = *text;
  }
}

void MarletParser::refuseDocumentation() {
  throw ErrorObject(
      std::string(MarletSerializationErrorDomain),
      static_cast<int>(MarletSerializationErrorCode::UnknownError),
      {{std::string(LocalizedDescriptionKey),
        "Marlets containing HTML documentation sections are not supported."},
       {std::string(LocalizedRecoverySuggestionKey),
        "Convert the HTML documentation sections to documentation comments stored in a source code section "
        "instead."}});
}

void MarletParser::didStartNewStyleElement(const std::string& name, const Attributes& attributes) {
  switch (state()) {
    case ParserState::DocumentRoot:
      if (name != "marlet") fail(": root element is not named 'marlet'.");
      readNewStyleRoot(attributes);
      return stateStack_.push_back(ParserState::MarletElement);
    case ParserState::MarletElement:
      if (name == "sections")
        fail(
            ": encountered unexpected element 'sections' as a child of a 'marlet' element in a new-style "
            "marlet.");
      if (name == "timeline") return stateStack_.push_back(ParserState::TimelineElement);
      if (name != "pages") failForUnknownChild(name, "marlet");
      openPageList();
      return stateStack_.push_back(ParserState::PagesElement);
    case ParserState::PagesElement:
      if (name != "page") failForUnknownChild(name, "pages");
      readPage(attributes);
      return stateStack_.push_back(ParserState::PageElement);
    case ParserState::PageElement:
      failForAnyChild(name, "page");
    case ParserState::TimelineElement:
      failForAnyChild(name, "timeline");
    case ParserState::SectionsElement:
      fatalError("We do not expect to see a 'sections' element in a new-style marlet!");
    case ParserState::CodeElement:
      fatalError("Unexpected state for marlet: " + std::string(rowOf(state()).state));
  }
}

void MarletParser::readNewStyleRoot(const Attributes& attributes) {
  const auto* platform = valueOf(attributes, "target-platform");
  if (!platform) fail(": 'marlet' element does not have a 'target-platform' attribute.");
  targetPlatform_ = *platform;
  requiresFullEnvironment_ = readFlag(attributes, "requires-full-environment");
}

void MarletParser::openPageList() {
  if (pages_) fail(": encountered 'pages' element multiple times as a child of a 'marlet' element.");
  const auto directory = fileWrapper_.child("Pages");
  if (!directory) {
    Log([&] { return "File wrappers: " + namesOf(fileWrapper_); }, documentLogAspect(), LogLevel::Critical);
    throw StubMarletSerializationError(
        "Unable to parse marlet: expected to find a Pages directory, but it is missing.");
  }
  if (!directory->isDirectory())
    throw StubMarletSerializationError(
        "Unable to parse marlet: expected to find a Pages directory, but it is not a directory.");
  pages_.emplace();
}

void MarletParser::readPage(const Attributes& attributes) {
  const auto* name = valueOf(attributes, "name");
  if (!name) fail(": 'page' element is missing a valid 'name' attribute.");
  const auto page = fileWrapper_.child("Pages")->child(MarletPageSnapshot::filenameForName(*name));
  if (page) addNamedPage(*page, *name);
}

}  // namespace MarletFoundation
