#pragma once

#include <cstdint>
#include <string_view>
#include <variant>
#include <vector>

#include "MarletFoundation/Platform/Error.h"
#include "MarletFoundation/Platform/Export.h"
#include "MarletFoundation/Platform/TextRange.h"
#include "MarletFoundation/SourceAnnotations/LexiportDirective.h"
#include "MarletFoundation/SourceAnnotations/TagText.h"

namespace MarletFoundation {

/// A mark that a page's author puts into its source as a comment. A line tag fills a line and begins "//#-";
/// an inline tag stands within a line, from "/*#-" to "*/". Nothing of the language around them counts, so a
/// tag in a string literal is a tag.
///
/// All ranges are in UTF-16 units of the text that was handed in. All operations are pure functions, linear in
/// the text.
class MARLET_EXPORT SourceTag {
 public:
  enum class Case {
    multiLineFieldStart,
    inlineFieldStart,
    inlineFieldEnd,
    multiLineCopySourceStart,
    inlineCopySourceStart,
    multiLineCopyDestinationStart,
    inlineCopyDestinationStart,
    codeCompletionDirective,
    multiLineFieldEnd,
    multiLineCopySourceEnd,
    inlineCopySourceEnd,
    multiLineCopyDestinationEnd,
    inlineCopyDestinationEnd,
    hiddenCodeStart,
    hiddenCodeEnd,
  };

  /// An editable field. `inset` is the number of units at that edge of an inline field, 0 or 1, that belong to
  /// a double quote right beside the tag, which is kept out of the editable text.
  struct MultiLineFieldStart {
    TagText placeholder;
    bool operator==(const MultiLineFieldStart&) const = default;
  };
  struct InlineFieldStart {
    TagText placeholder;
    std::int64_t inset;
    bool operator==(const InlineFieldStart&) const = default;
  };
  struct InlineFieldEnd {
    std::int64_t inset;
    bool operator==(const InlineFieldEnd&) const = default;
  };
  /// A stretch that another page may copy.
  template <Case>
  struct CopySourceStart {
    TagText identifier;
    bool operator==(const CopySourceStart&) const = default;
  };
  using MultiLineCopySourceStart = CopySourceStart<Case::multiLineCopySourceStart>;
  using InlineCopySourceStart = CopySourceStart<Case::inlineCopySourceStart>;
  /// A stretch that is filled from a copy source of another page.
  template <Case>
  struct CopyDestinationStart {
    TagText pageReference;
    TagText identifier;
    bool operator==(const CopyDestinationStart&) const = default;
  };
  using MultiLineCopyDestinationStart = CopyDestinationStart<Case::multiLineCopyDestinationStart>;
  using InlineCopyDestinationStart = CopyDestinationStart<Case::inlineCopyDestinationStart>;
  /// What the completion list may offer.
  struct CodeCompletionDirective {
    std::vector<LexiportDirective> directive;
    bool operator==(const CodeCompletionDirective&) const = default;
  };
  /// A tag without payload.
  template <Case>
  struct Plain {
    bool operator==(const Plain&) const = default;
  };

  /// In the order of `Case`.
  using Payload =
      std::variant<MultiLineFieldStart, InlineFieldStart, InlineFieldEnd, MultiLineCopySourceStart,
                   InlineCopySourceStart, MultiLineCopyDestinationStart, InlineCopyDestinationStart,
                   CodeCompletionDirective, Plain<Case::multiLineFieldEnd>,
                   Plain<Case::multiLineCopySourceEnd>, Plain<Case::inlineCopySourceEnd>,
                   Plain<Case::multiLineCopyDestinationEnd>, Plain<Case::inlineCopyDestinationEnd>,
                   Plain<Case::hiddenCodeStart>, Plain<Case::hiddenCodeEnd>>;
  Payload payload;

  Case kind() const { return static_cast<Case>(payload.index()); }
  /// The case's name: "multiLineFieldStart".
  std::string_view caseName() const;

  static bool isInlineTag(Case tag);
  bool isInlineTag() const { return isInlineTag(kind()); }
  bool isLineTag() const { return !isInlineTag(); }
  bool isEditableField() const;
  bool isMultiLineEditableField() const;
  bool isCopySource() const;
  bool isCopyDestination() const;

  bool operator==(const SourceTag&) const = default;

  class ParseError;
  /// A tag and its place.
  struct Located;
  /// The good tags of a text, in its order, and what is wrong with the others.
  struct ParseResult;

  /// The tags of a text, judged line by line only: an inline tag must pair within its line.
  static ParseResult parseStringForTags(std::u16string_view text);
  /// The tags that stand in a legal place of the whole text; the errors of the lines, then those of the text.
  /// A bad tag goes with everything inside it.
  static ParseResult parseStringForValidTags(std::u16string_view text);
  /// Whether `parseStringForValidTags` reports no error. A text without tags is valid.
  static bool hasValidTags(std::u16string_view text);
  /// The tags, of those that a list in text order holds, that stand in a legal place, and the errors of the
  /// others.
  static ParseResult filterForOnlyValidTagsFor(std::vector<Located> tags);

  /// What an editor marks: line tags without those of copy destinations.
  static std::vector<Located> parseStringForLineTagsInSourceEditor(std::u16string_view text);
  /// What an editor marks: inline tags without those of copy destinations.
  static std::vector<Located> parseStringForInlineTagsInSourceEditor(std::u16string_view text);
  /// Both.
  static std::vector<Located> parseLineForTagsInSourceEditor(std::u16string_view line);
};

struct SourceTag::Located {
  TextRange range;
  SourceTag tag;
  bool operator==(const Located&) const = default;
};

/// A mistake in a text's tags. Mistakes are listed, never thrown by the parser.
class MARLET_EXPORT SourceTag::ParseError final : public Error {
 public:
  enum class Case {
    lexiportParseError,
    missingStartTag,
    missingEndTag,
    improperlyNestedTag,
    unknownInlineTag,
    copySourceMalformed,
    copyDestinationMalformed,
  };
  static constexpr std::string_view errorDomain = "MarletFoundation.SourceTag.ParseError";

  Case kind;
  /// In the whole text, with one exception: the location of a malformed line tag counts from the start of its
  /// line.
  TextRange range;
  /// The message of a directive's error, the text of an unknown or malformed tag, or else the misplaced tag.
  std::variant<TagText, SourceTag> payload;

  ParseError(Case c, TextRange place, std::variant<TagText, SourceTag> what)
      : kind(c), range(place), payload(std::move(what)) {}

  std::string_view domain() const override { return errorDomain; }
  int code() const override { return static_cast<int>(kind); }
  std::string_view caseName() const override;
  std::string description() const override;
  ErrorPointer copy() const override;
  [[noreturn]] void raise() const override;
  const char* what() const noexcept override;

  bool operator==(const ParseError& other) const;
};

struct SourceTag::ParseResult {
  std::vector<Located> tags;
  std::vector<ParseError> errors;
  bool operator==(const ParseResult&) const = default;
};

}  // namespace MarletFoundation
