#pragma once

#include <string>
#include <vector>

#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/SourceAnnotations/SourceTag.h"
#include "MarletFoundation/Utils/Overloaded.h"

namespace MarletFoundation::test {

inline std::string dump(const TextRange& range) {
  return std::to_string(range.location) + "+" + std::to_string(range.length);
}

inline std::string dump(const LexiportDirective& directive) {
  return std::string(LexiportDirective::caseName(directive.add_or_remove)) + "." +
         std::string(LexiportDirective::caseName(directive.namespace_)) +
         (directive.identifier ? "." + *directive.identifier : "");
}

/// `inlineFieldStart@4+20[Tap to edit,1]`
inline std::string dump(const SourceTag::Located& located) {
  const auto bracketed = [](const std::string& text) { return "[" + text + "]"; };
  const auto payload = std::visit(
      overloaded{
          [&](const SourceTag::MultiLineFieldStart& tag) { return bracketed(std::string(tag.placeholder)); },
          [&](const SourceTag::InlineFieldStart& tag) {
            return bracketed(std::string(tag.placeholder) + "," + std::to_string(tag.inset));
          },
          [&](const SourceTag::InlineFieldEnd& tag) { return bracketed(std::to_string(tag.inset)); },
          [&]<SourceTag::Case c>(const SourceTag::CopySourceStart<c>& tag) {
            return bracketed(std::string(tag.identifier));
          },
          [&]<SourceTag::Case c>(const SourceTag::CopyDestinationStart<c>& tag) {
            return bracketed(std::string(tag.pageReference) + "," + std::string(tag.identifier));
          },
          [&](const SourceTag::CodeCompletionDirective& tag) {
            std::string list;
            for (const auto& directive : tag.directive) list += (list.empty() ? "" : ",") + dump(directive);
            return bracketed(list);
          },
          []<SourceTag::Case c>(const SourceTag::Plain<c>&) { return std::string(); },
      },
      located.tag.payload);
  return std::string(located.tag.caseName()) + "@" + dump(located.range) + payload;
}

/// `!unknownInlineTag@4+12[/*#-bogus*/]`
inline std::string dump(const SourceTag::ParseError& error) {
  const auto* tag = std::get_if<SourceTag>(&error.payload);
  const auto payload = tag ? tag->caseName() : std::get<TagText>(error.payload).view();
  return "!" + std::string(error.caseName()) + "@" + dump(error.range) + "[" + std::string(payload) + "]";
}

/// Tags, then errors, with blanks between.
inline std::string dump(const SourceTag::ParseResult& result) {
  std::string text;
  for (const auto& tag : result.tags) text += (text.empty() ? "" : " ") + dump(tag);
  for (const auto& error : result.errors) text += (text.empty() ? "" : " ") + dump(error);
  return text;
}

inline std::u16string wide(const std::string& text) { return utf16FromUTF8(text).value(); }

}  // namespace MarletFoundation::test
