#include "MarletFoundation/SourceAnnotations/TagScanner.h"

#include <algorithm>
#include <optional>

#include "MarletFoundation/Platform/CharacterClass.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/SourceAnnotations/CopyPayload.h"
#include "MarletFoundation/SourceAnnotations/DocumentNode.h"

namespace MarletFoundation {
namespace {

using Case = SourceTag::Case;
using TagError = SourceTag::ParseError;
using LineTagParseResult = std::variant<SourceTag::Located, TagError>;

constexpr std::string_view missingLinePlaceholder = "Tap to enter code";
constexpr std::string_view missingInlinePlaceholder = "Tap to edit";

bool endsUnit(char16_t unit) { return unit == u'\n' || unit == u'\r' || unit == 0x2029; }
bool isIndentation(char16_t unit) { return isSpaceSeparator(unit) || unit == u'\t'; }
/// A tab is not trimmed.
bool isTrimmed(char16_t unit) { return isSpaceSeparator(unit) || isLineTerminator(unit); }

/// Where the payload of a tag must end, with and without the blanks in front of that place.
struct PayloadEnd {
  std::size_t end;
  std::size_t trimmedEnd;

  PayloadEnd(std::u16string_view text, std::size_t end_) : end(end_), trimmedEnd(end_) {
    while (trimmedEnd > 0 && isTrimmed(text[trimmedEnd - 1])) --trimmedEnd;
  }
};

/// The tag that begins at `start` in a unit.
struct Candidate {
  std::u16string_view unit;
  std::size_t start;
  PayloadEnd payloadEnd;

  /// The trimmed payload when the keyword behind the tag's opening is `name`.
  std::optional<std::u16string_view> match(std::u16string_view name) const {
    constexpr std::size_t openingLength = 4;
    if (!unit.substr(start + openingLength).starts_with(name)) return std::nullopt;
    auto at = start + openingLength + name.size();
    if (at == payloadEnd.end) return u"";
    if (unit[at] != u' ' && unit[at] != u'(') return std::nullopt;
    while (at < payloadEnd.trimmedEnd && isTrimmed(unit[at])) ++at;
    return at < payloadEnd.trimmedEnd ? unit.substr(at, payloadEnd.trimmedEnd - at) : u"";
  }

  bool matchesAlone(std::u16string_view name) const {
    const auto payload = match(name);
    return payload && payload->empty();
  }
};

/// A unit in UTF-8, made when a first piece of it is asked for.
class SharedUnit {
 public:
  explicit SharedUnit(std::u16string_view unit) : unit_(unit) {}

  /// `piece` is a view into the unit.
  TagText operator()(std::u16string_view piece) {
    if (!text_) convert();
    const auto start = static_cast<std::size_t>(piece.data() - unit_.data());
    const auto from = byteOffset(start);
    return {text_, std::string_view(*text_).substr(from, byteOffset(start + piece.size()) - from)};
  }

 private:
  void convert() {
    text_ = std::make_shared<const std::string>(utf8FromUTF16Lossy(unit_));
    if (text_->size() == unit_.size()) return;
    byteOffsets_.reserve(unit_.size() + 1);
    std::size_t bytes = 0;
    for (std::size_t at = 0; at < unit_.size();) {
      const auto scalar = scalarAt(unit_, at);
      byteOffsets_.insert(byteOffsets_.end(), unitCount(scalar), bytes);
      bytes += scalar < 0x80 ? 1 : scalar < 0x800 ? 2 : scalar < 0x10000 ? 3 : 4;
      at += unitCount(scalar);
    }
    byteOffsets_.push_back(bytes);
  }

  std::size_t byteOffset(std::size_t offset) const {
    return byteOffsets_.empty() ? offset : byteOffsets_[offset];
  }

  std::u16string_view unit_;
  std::shared_ptr<const std::string> text_;
  /// Of each unit; empty when the text is ASCII.
  std::vector<std::size_t> byteOffsets_;
};

TagText owned(std::u16string_view text) { return TagText(utf8FromUTF16Lossy(text)); }

TagText placeholder(TagText text, std::string_view otherwise) {
  return text.view().empty() ? TagText(nullptr, otherwise) : text;
}

/// The line tag, or what is wrong with it, that begins at the first character of the unit that is no
/// indentation; nothing when the line is no line tag.
std::optional<LineTagParseResult> parseLineAsLineTag(const LineUnit& unit, std::size_t first) {
  const auto text = unit.text.substr(first);
  if (!text.starts_with(u"//#-")) return std::nullopt;
  const Candidate line{text, 0, PayloadEnd(text, text.size())};
  const auto length = static_cast<std::int64_t>(text.size());
  const auto location = static_cast<std::int64_t>(first);
  const TextRange range{unit.location + location, length};
  const auto tag = [&](SourceTag::Payload payload) {
    return SourceTag::Located{range, {std::move(payload)}};
  };
  // Relative to the line, unlike every other range: this is how hosts know it.
  const auto malformed = [&](TagError::Case kind) { return TagError(kind, {location, length}, owned(text)); };

  if (const auto payload = line.match(u"editable-code"))
    return tag(SourceTag::MultiLineFieldStart{placeholder(owned(*payload), missingLinePlaceholder)});
  if (line.matchesAlone(u"end-editable-code")) return tag(SourceTag::Plain<Case::multiLineFieldEnd>{});
  if (line.matchesAlone(u"hidden-code")) return tag(SourceTag::Plain<Case::hiddenCodeStart>{});
  if (line.matchesAlone(u"end-hidden-code")) return tag(SourceTag::Plain<Case::hiddenCodeEnd>{});
  if (const auto payload = line.match(u"code-completion"); payload && !payload->empty()) {
    const auto directives = lexiportDirectivesFromLine(text);
    if (!directives) return std::nullopt;
    return directives->cata(
        [&](const std::string& message) -> LineTagParseResult {
          return TagError(TagError::Case::lexiportParseError, range,
                          TagText("parse error in lexiport directive: " + message));
        },
        [&](const std::vector<LexiportDirective>& list) -> LineTagParseResult {
          return tag(SourceTag::CodeCompletionDirective{list});
        });
  }
  if (const auto payload = line.match(u"copy-source")) {
    const auto identifier = extractCopySourceParts(*payload);
    if (!identifier) return malformed(TagError::Case::copySourceMalformed);
    return tag(SourceTag::MultiLineCopySourceStart{owned(*identifier)});
  }
  if (line.matchesAlone(u"end-copy-source")) return tag(SourceTag::Plain<Case::multiLineCopySourceEnd>{});
  if (const auto payload = line.match(u"copy-destination")) {
    const auto parts = extractCopyDestinationParts(*payload);
    if (!parts) return malformed(TagError::Case::copyDestinationMalformed);
    return tag(SourceTag::MultiLineCopyDestinationStart{owned(parts->pageRef), owned(parts->identifier)});
  }
  if (line.matchesAlone(u"end-copy-destination"))
    return tag(SourceTag::Plain<Case::multiLineCopyDestinationEnd>{});
  return std::nullopt;
}

/// What an inline tag says, or the error that it is.
std::variant<SourceTag::Payload, TagError::Case> parseInlineTag(const Candidate& candidate, std::size_t end,
                                                                SharedUnit& shared) {
  const auto insetAt = [&](std::size_t at) {
    return at < candidate.unit.size() && candidate.unit[at] == u'"' ? 1 : 0;
  };

  if (const auto payload = candidate.match(u"editable-code")) {
    return SourceTag::InlineFieldStart{
        placeholder(payload->empty() ? TagText() : shared(*payload), missingInlinePlaceholder), insetAt(end)};
  }
  if (candidate.matchesAlone(u"end-editable-code"))
    return SourceTag::InlineFieldEnd{candidate.start > 0 ? insetAt(candidate.start - 1) : 0};
  if (const auto payload = candidate.match(u"copy-source")) {
    const auto identifier = extractCopySourceParts(*payload);
    if (!identifier) return TagError::Case::copySourceMalformed;
    return SourceTag::InlineCopySourceStart{shared(*identifier)};
  }
  if (candidate.matchesAlone(u"end-copy-source")) return SourceTag::Plain<Case::inlineCopySourceEnd>{};
  if (const auto payload = candidate.match(u"copy-destination")) {
    const auto parts = extractCopyDestinationParts(*payload);
    if (!parts) return TagError::Case::copyDestinationMalformed;
    return SourceTag::InlineCopyDestinationStart{shared(parts->pageRef), shared(parts->identifier)};
  }
  if (candidate.matchesAlone(u"end-copy-destination"))
    return SourceTag::Plain<Case::inlineCopyDestinationEnd>{};
  return TagError::Case::unknownInlineTag;
}

/// Several tags may share one "*/", so whatever depends on it is found once.
void parseLineForInlineTags(const LineUnit& unit, SourceTag::ParseResult& result) {
  constexpr std::u16string_view opening = u"/*#-";
  constexpr std::u16string_view closing = u"*/";
  const auto text = unit.text;
  SharedUnit shared(text);
  std::vector<SourceTag::Located> tags;
  std::optional<PayloadEnd> payloadEnd;
  for (auto start = text.find(opening); start != text.npos;
       start = text.find(opening, start + opening.size())) {
    if (!payloadEnd || payloadEnd->end < start) {
      const auto close = text.find(closing, start);
      if (close == text.npos) break;
      payloadEnd.emplace(text, close);
    }
    const auto end = payloadEnd->end + closing.size();
    const TextRange range{unit.location + static_cast<std::int64_t>(start),
                          static_cast<std::int64_t>(end - start)};
    auto parsed = parseInlineTag({text, start, *payloadEnd}, end, shared);
    if (const auto* error = std::get_if<TagError::Case>(&parsed)) {
      result.errors.emplace_back(*error, range, shared(text.substr(start, end - start)));
    } else {
      tags.push_back({range, {std::get<SourceTag::Payload>(std::move(parsed))}});
    }
  }
  auto valid = validateInlineTagsFor(text, std::move(tags));
  std::move(valid.tags.begin(), valid.tags.end(), std::back_inserter(result.tags));
  std::move(valid.errors.begin(), valid.errors.end(), std::back_inserter(result.errors));
}

}  // namespace

LineUnit LineUnit::around(std::u16string_view text, std::size_t at) {
  auto start = at;
  while (start > 0 && !endsUnit(text[start - 1])) --start;
  auto end = at;
  while (end < text.size() && !endsUnit(text[end])) ++end;
  const std::size_t lineEnd = end == text.size() ? 0 : text.substr(end).starts_with(u"\r\n") ? 2 : 1;
  return {text.substr(start, end - start), static_cast<std::int64_t>(start),
          static_cast<std::int64_t>(end + lineEnd)};
}

void scanUnit(const LineUnit& unit, SourceTag::ParseResult& result) {
  const auto first = std::find_if_not(unit.text.begin(), unit.text.end(), isIndentation);
  auto lineTag = parseLineAsLineTag(unit, static_cast<std::size_t>(first - unit.text.begin()));
  if (!lineTag) {
    parseLineForInlineTags(unit, result);
  } else if (auto* error = std::get_if<TagError>(&*lineTag)) {
    result.errors.push_back(std::move(*error));
  } else {
    result.tags.push_back(std::get<SourceTag::Located>(std::move(*lineTag)));
  }
}

}  // namespace MarletFoundation
