#include "TagProblems.h"

#include <algorithm>

#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"
#include "SourceLines.h"
#include "TagKeywords.h"

using namespace MarletFoundation;

namespace {

using Case = SourceTag::Case;
using TagError = SourceTag::ParseError;

/// Words much longer than a keyword are no misspelt one.
constexpr std::size_t longestWord = 40;
/// Letters that a misspelt word may differ in where it may as well mean something else.
constexpr std::size_t farthestMeant = 2;

std::string code(std::string_view text) {
  constexpr std::size_t longestQuote = 80;
  if (text.size() <= longestQuote) return "`" + std::string(text) + "`";
  auto end = longestQuote;
  while ((static_cast<unsigned char>(text[end]) & 0xC0) == 0x80) --end;
  return "`" + std::string(text.substr(0, end)) + "…`";
}

/// The case of the tag that goes with a start or end tag.
Case partner(Case tag) {
  constexpr std::pair<Case, Case> pairs[] = {
      {Case::multiLineFieldStart, Case::multiLineFieldEnd},
      {Case::inlineFieldStart, Case::inlineFieldEnd},
      {Case::hiddenCodeStart, Case::hiddenCodeEnd},
      {Case::multiLineCopySourceStart, Case::multiLineCopySourceEnd},
      {Case::inlineCopySourceStart, Case::inlineCopySourceEnd},
      {Case::multiLineCopyDestinationStart, Case::multiLineCopyDestinationEnd},
      {Case::inlineCopyDestinationStart, Case::inlineCopyDestinationEnd},
  };
  for (const auto& [start, end] : pairs) {
    if (tag == start) return end;
    if (tag == end) return start;
  }
  return tag;
}

std::string_view legalPlace(Case tag) {
  switch (tag) {
    case Case::multiLineFieldStart:
    case Case::inlineFieldStart:
      return "a field stands by itself, or directly inside one copy source of the same kind";
    case Case::multiLineCopySourceStart:
      return "a copy source stands by itself, or directly inside another one";
    case Case::inlineCopySourceStart:
      return "an inline copy source stands by itself, or directly inside another copy source";
    case Case::multiLineCopyDestinationStart:
      return "it stands directly inside an editable field of whole lines";
    case Case::inlineCopyDestinationStart:
      return "it stands directly inside an inline editable field";
    case Case::codeCompletionDirective:
      return "a directive stands by itself, or in hidden code at top level";
    default:
      return "hidden code stands by itself";
  }
}

/// The word behind the "#-" that a text begins with, as far as letters and hyphens go.
std::string_view keywordIn(std::string_view text) {
  const auto isPart = [](char c) { return c == '-' || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); };
  const auto end = std::find_if_not(text.begin(), text.end(), isPart);
  return text.substr(0, std::min(static_cast<std::size_t>(end - text.begin()), longestWord));
}

std::string mendedInlineTag(std::string_view word) {
  const auto [keyword, distance] = nearestKeyword(word);
  if (keyword.ends_with("hidden-code") || keyword == "code-completion") {
    if (distance <= farthestMeant)
      return "`//#-" + std::string(keyword) + "` has no inline form and fills a line of its own.";
  } else if (word == keyword) {
    return "remove what stands behind `" + std::string(keyword) + "`.";
  } else if (distance <= farthestMeant) {
    return "did you mean `/*#-" + std::string(keyword) + "*/`?";
  }
  return "inline tags are editable-code, copy-source, copy-destination, and each of these behind `end-`.";
}

std::string sentence(const TagError& error) {
  const auto* tag = std::get_if<SourceTag>(&error.payload);
  const std::string written = tag ? code(writtenForm(tag->kind())) : "";
  const std::string other = tag ? code(writtenForm(partner(tag->kind()))) : "";
  const std::string_view text = tag ? std::string_view() : std::get<TagText>(error.payload).view();
  const bool isInline = tag ? tag->isInlineTag() : text.starts_with("/*");
  const std::string end = isInline ? "*/`" : "`";
  switch (error.kind) {
    case TagError::Case::lexiportParseError:
      return std::string(text) +
             ". Write `//#-code-completion(NAMESPACE, show)` or `…(NAMESPACE, hide)`, with names behind it if it "
             "is about these only; the namespace is everything, module, currentmodule, pageauxiliarymodule, "
             "chapterauxiliarymodule, bookauxiliarymodule, identifier, snippet, keyword or literal.";
    case TagError::Case::missingStartTag:
      return written + " closes nothing here: put " + other + " in front of it, or remove it.";
    case TagError::Case::missingEndTag:
      return written + " is never closed: put " + other + " behind it" +
             (isInline ? " on the same line" : "") + ", and close what is inside it first.";
    case TagError::Case::improperlyNestedTag:
      return written + " must not stand here: " + std::string(legalPlace(tag->kind())) + ".";
    case TagError::Case::unknownInlineTag:
      return code(text) + " is no tag: " + mendedInlineTag(keywordIn(text.substr(4)));
    case TagError::Case::copySourceMalformed:
      return code(text) + " names no copy source: write " + (isInline ? "`/*" : "`//") +
             "#-copy-source(IDENTIFIER)" + end + ".";
    case TagError::Case::copyDestinationMalformed:
      return code(text) + " names no page and copy source: write " + (isInline ? "`/*" : "`//") +
             "#-copy-destination(\"PAGE\", IDENTIFIER)" + end + ", with one blank behind the comma.";
  }
  return {};
}

std::u16string_view withoutBlanks(std::u16string_view text) {
  return text.substr(std::min(text.find_first_not_of(u" \t"), text.size()));
}

/// Why a line that looks like a tag is none; nothing for other lines. An inline tag may stand in the line.
std::optional<std::string> reasonNotToBeTag(std::u16string_view line) {
  constexpr std::string_view marker = "#-";
  auto rest = withoutBlanks(line);
  if (!rest.starts_with(u"//")) return std::nullopt;
  const bool isExact = rest.starts_with(u"//#-");
  rest = withoutBlanks(rest.substr(2));
  if (!rest.starts_with(u"#-")) return std::nullopt;
  const auto text = utf8FromUTF16Lossy(rest.substr(0, marker.size() + longestWord)).substr(marker.size());
  const auto word = keywordIn(text);
  const auto [keyword, distance] = nearestKeyword(word);
  if (!isExact && distance > farthestMeant) return std::nullopt;
  if (!isExact || word != keyword) {
    return "This line looks like a tag, but is none. Did you mean `//#-" + std::string(keyword) + "`?";
  }
  if (keyword == "code-completion")
    return "This line is no directive: write `//#-code-completion(NAMESPACE, show)` or `…(NAMESPACE, hide, NAME)`, "
           "with one blank behind each comma and none elsewhere.";
  return "This line is no tag, because of what stands behind `//#-" + std::string(keyword) +
         "`: remove that.";
}

/// Whether an error's location counts from the start of its line.
bool isRelative(const TagError& error) {
  const bool isMalformed = error.kind == TagError::Case::copySourceMalformed ||
                           error.kind == TagError::Case::copyDestinationMalformed;
  return isMalformed && std::get<TagText>(error.payload).view().starts_with("//");
}

bool isLineTag(const SourceTag::Located& located) { return located.tag.isLineTag(); }

Problem problemAt(const TextRange& range, const SourceLines& lines) {
  const auto line = lines.indexAt(range.location);
  Problem problem;
  problem.line = static_cast<std::int64_t>(line) + 1;
  problem.column = range.location - lines.range(line).location + 1;
  problem.length = range.length;
  return problem;
}

Problem problemOf(const TagError& error, const TextRange& range, const SourceLines& lines) {
  auto problem = problemAt(range, lines);
  problem.rule = "tag." + std::string(error.caseName());
  problem.domain = error.domain();
  problem.code = error.code();
  problem.caseName = error.caseName();
  problem.description = sentence(error);
  return problem;
}

Problem warning(std::string rule, std::string description, const TextRange& range, const SourceLines& lines) {
  auto problem = problemAt(range, lines);
  problem.severity = "warning";
  problem.rule = std::move(rule);
  problem.description = std::move(description);
  return problem;
}

/// What only a look at the line itself shows: malformed line tags, whose errors don't tell the line, and lines
/// that are meant to be tags.
void addProblemsOfLine(std::size_t index, const SourceLines& lines, std::vector<Problem>& problems) {
  const auto text = lines.text(index);
  const auto first = static_cast<std::int64_t>(text.size() - withoutBlanks(text).size());
  const auto start = lines.range(index).location;
  const auto scanned = SourceTag::parseStringForTags(text);
  for (const auto& error : scanned.errors) {
    if (!isRelative(error)) continue;
    problems.push_back(problemOf(error, {start + error.range.location, error.range.length}, lines));
    return;
  }
  const bool isTag = std::any_of(scanned.tags.begin(), scanned.tags.end(), isLineTag) ||
                     std::any_of(scanned.errors.begin(), scanned.errors.end(), [](const TagError& error) {
                       return error.kind == TagError::Case::lexiportParseError;
                     });
  if (isTag) return;
  const TextRange range{start + first, static_cast<std::int64_t>(text.size()) - first};
  if (const auto reason = reasonNotToBeTag(text))
    problems.push_back(warning("tag.notATag", *reason, range, lines));
}

}  // namespace

std::vector<Problem> tagProblems(std::u16string_view source) {
  const SourceLines lines(source);
  std::vector<Problem> problems;
  for (const auto& error : SourceTag::parseStringForValidTags(source).errors) {
    if (!isRelative(error)) problems.push_back(problemOf(error, error.range, lines));
  }
  for (std::size_t index = 0; index < lines.count(); ++index) {
    if (withoutBlanks(lines.text(index)).starts_with(u"//")) addProblemsOfLine(index, lines, problems);
  }
  std::stable_sort(problems.begin(), problems.end(), [](const Problem& a, const Problem& b) {
    return std::pair(a.line, a.column) < std::pair(b.line, b.column);
  });
  return problems;
}

std::vector<Problem> copyDestinationProblems(std::u16string_view source, const FindCopySource& find) {
  const SourceLines lines(source);
  std::vector<Problem> problems;
  const auto judge = [&](const TextRange& range, const TagText& page, const TagText& identifier) {
    switch (find(page, identifier)) {
      case CopySourceLookup::found:
        break;
      case CopySourceLookup::noPage:
        problems.push_back(warning("tag.unknownPage", "The book has no page " + code(page) + " to copy from.",
                                   range, lines));
        break;
      case CopySourceLookup::noCopySource:
        problems.push_back(warning("tag.unknownCopySource",
                                   "The page " + code(page) + " has no copy source " + code(identifier) + ".",
                                   range, lines));
        break;
    }
  };
  for (const auto& [range, tag] : SourceTag::parseStringForValidTags(source).tags) {
    if (const auto* destination = std::get_if<SourceTag::MultiLineCopyDestinationStart>(&tag.payload))
      judge(range, destination->pageReference, destination->identifier);
    if (const auto* destination = std::get_if<SourceTag::InlineCopyDestinationStart>(&tag.payload))
      judge(range, destination->pageReference, destination->identifier);
  }
  return problems;
}
