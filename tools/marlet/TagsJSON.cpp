#include "TagsJSON.h"

#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Utils/Overloaded.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

ordered_json json(const SourceTag::Located& located);
ordered_json json(const SourceTag::ParseError& error);
ordered_json json(const EditorPlaceholder& placeholder);

ordered_json json(const TextRange& range) { return {{"location", range.location}, {"length", range.length}}; }

ordered_json json(const LexiportDirective& directive) {
  return {{"identifier", directive.identifier ? ordered_json(*directive.identifier) : ordered_json(nullptr)},
          {"addOrRemove", LexiportDirective::caseName(directive.add_or_remove)},
          {"namespace", LexiportDirective::caseName(directive.namespace_)}};
}

template <class List>
ordered_json jsonArray(const List& list) {
  auto array = ordered_json::array();
  for (const auto& element : list) array.push_back(json(element));
  return array;
}

ordered_json json(const SourceTag::Located& located) {
  auto result = json(located.range);
  result["case"] = located.tag.caseName();
  std::visit(
      overloaded{
          [&](const SourceTag::MultiLineFieldStart& tag) { result["placeholder"] = tag.placeholder.view(); },
          [&](const SourceTag::InlineFieldStart& tag) {
            result["placeholder"] = tag.placeholder.view();
            result["inset"] = tag.inset;
          },
          [&](const SourceTag::InlineFieldEnd& tag) { result["inset"] = tag.inset; },
          [&]<SourceTag::Case source>(const SourceTag::CopySourceStart<source>& tag) {
            result["identifier"] = tag.identifier.view();
          },
          [&]<SourceTag::Case destination>(const SourceTag::CopyDestinationStart<destination>& tag) {
            result["pageReference"] = tag.pageReference.view();
            result["identifier"] = tag.identifier.view();
          },
          [&](const SourceTag::CodeCompletionDirective& tag) {
            result["directives"] = jsonArray(tag.directive);
          },
          []<SourceTag::Case plain>(const SourceTag::Plain<plain>&) {},
      },
      located.tag.payload);
  return result;
}

ordered_json json(const SourceTag::ParseError& error) {
  ordered_json result{{"code", error.code()},
                      {"case", error.caseName()},
                      {"location", error.range.location},
                      {"length", error.range.length}};
  if (const auto* tag = std::get_if<SourceTag>(&error.payload)) {
    result["tag"] = tag->caseName();
  } else {
    const bool isMessage = error.kind == SourceTag::ParseError::Case::lexiportParseError;
    result[isMessage ? "message" : "text"] = std::get<TagText>(error.payload).view();
  }
  return result;
}

ordered_json json(const EditorPlaceholder& placeholder) {
  auto result = json(placeholder.range);
  result["case"] = placeholder.metadata.caseName();
  using Metadata = PlaceholderMetadata;
  const auto put = [&](const std::string& description, const std::string& type) {
    result["tokenDescription"] = description;
    result["tokenType"] = type;
  };
  std::visit(overloaded{
                 [&](const Metadata::Unknown& token) { result["tokenDescription"] = token.tokenDescription; },
                 [&](const Metadata::TypedToken& token) { put(token.tokenDescription, token.tokenType); },
                 [&](const Metadata::TypedTokenExtra& token) {
                   put(token.tokenDescription, token.tokenType);
                   result["extra"] = token.extra;
                 },
                 [&](const Metadata::TypedTokenAlias& token) {
                   put(token.tokenDescription, token.tokenType);
                   result["extra"] = token.extra;
                   result["actualtype"] = token.actualtype;
                 },
             },
             placeholder.metadata.payload);
  return result;
}

}  // namespace

ordered_json tagsJSON(std::u16string_view source) {
  const auto valid = SourceTag::parseStringForValidTags(source);
  const auto scanned = SourceTag::parseStringForTags(source);
  return {{"tags", jsonArray(valid.tags)},
          {"errors", jsonArray(valid.errors)},
          {"scanned", jsonArray(scanned.tags)},
          {"scannedErrors", jsonArray(scanned.errors)},
          {"editableRanges", jsonArray(editableRanges(source))},
          {"placeholders", jsonArray(parseStringForPlaceholders(source))}};
}
