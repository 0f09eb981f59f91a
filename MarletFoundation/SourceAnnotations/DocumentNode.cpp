#include "MarletFoundation/SourceAnnotations/DocumentNode.h"

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using Case = SourceTag::Case;
using Type = NestedNodeType;

/// What a tag does to the tree: it opens a node of a type, or it closes one, or neither.
struct Role {
  Type opens = Type::leaf;
  Type closes = Type::leaf;
};

Role role(Case tag) {
  switch (tag) {
    case Case::multiLineFieldStart:
      return {.opens = Type::multiLineField};
    case Case::inlineFieldStart:
      return {.opens = Type::inlineField};
    case Case::hiddenCodeStart:
      return {.opens = Type::hiddenCode};
    case Case::multiLineCopySourceStart:
      return {.opens = Type::multiLineCopySource};
    case Case::inlineCopySourceStart:
      return {.opens = Type::inlineCopySource};
    case Case::multiLineCopyDestinationStart:
      return {.opens = Type::multiLineCopyDestination};
    case Case::inlineCopyDestinationStart:
      return {.opens = Type::inlineCopyDestination};
    case Case::multiLineFieldEnd:
      return {.closes = Type::multiLineField};
    case Case::inlineFieldEnd:
      return {.closes = Type::inlineField};
    case Case::hiddenCodeEnd:
      return {.closes = Type::hiddenCode};
    case Case::multiLineCopySourceEnd:
      return {.closes = Type::multiLineCopySource};
    case Case::inlineCopySourceEnd:
      return {.closes = Type::inlineCopySource};
    case Case::multiLineCopyDestinationEnd:
      return {.closes = Type::multiLineCopyDestination};
    case Case::inlineCopyDestinationEnd:
      return {.closes = Type::inlineCopyDestination};
    case Case::codeCompletionDirective:
      return {};
  }
  return {};
}

bool isTopLevel(const DocumentNode& node) { return node.depth == 1; }

/// Directly in a node of that type, which itself is at top level.
bool isOnlyIn(Type type, const DocumentNode& node) { return node.depth == 2 && node.parentType == type; }

bool isLegalInDocument(Case tag, const DocumentNode& node) {
  const auto parent = node.parentType;
  switch (tag) {
    case Case::multiLineFieldStart:
      return isTopLevel(node) || isOnlyIn(Type::multiLineCopySource, node);
    case Case::inlineFieldStart:
      return isTopLevel(node) || isOnlyIn(Type::inlineCopySource, node);
    case Case::multiLineCopySourceStart:
      return isTopLevel(node) || parent == Type::multiLineCopySource;
    case Case::inlineCopySourceStart:
      return isTopLevel(node) || parent == Type::multiLineCopySource || parent == Type::inlineCopySource;
    case Case::multiLineCopyDestinationStart:
      return parent == Type::multiLineField;
    case Case::inlineCopyDestinationStart:
      return parent == Type::inlineField;
    case Case::codeCompletionDirective:
      return isTopLevel(node) || isOnlyIn(Type::hiddenCode, node);
    case Case::hiddenCodeStart:
      return isTopLevel(node);
    case Case::hiddenCodeEnd:
      return isOnlyIn(Type::hiddenCode, node);
    case Case::inlineFieldEnd:
    case Case::multiLineFieldEnd:
    case Case::multiLineCopySourceEnd:
    case Case::inlineCopySourceEnd:
    case Case::multiLineCopyDestinationEnd:
    case Case::inlineCopyDestinationEnd:
      return parent == role(tag).closes;
  }
  return false;
}

/// The tags are those of one line, so what encloses the line is unknown: a copy destination may stand alone
/// here, and only an inline copy source can be seen around another.
bool isLegalInLine(Case tag, const DocumentNode& node) {
  if (tag == Case::inlineCopySourceStart)
    return isTopLevel(node) || node.parentType == Type::inlineCopySource;
  if (tag == Case::inlineCopyDestinationStart)
    return isTopLevel(node) || node.parentType == Type::inlineField;
  return isLegalInDocument(tag, node);
}

template <class IsLegal>
SourceTag::ParseResult walk(std::vector<SourceTag::Located> tags, const IsLegal& isLegal) {
  using TagError = SourceTag::ParseError;
  SourceTag::ParseResult result;
  const auto nodes = DocumentNode::nodes(tags);
  auto end = tags.begin();
  for (std::size_t i = 0; i < nodes.size();) {
    const auto kind = tags[i].tag.kind();
    const auto fail = [&](TagError::Case error) {
      result.errors.emplace_back(error, tags[i].range, std::move(tags[i].tag));
      i = nodes[i].end;
    };
    if (!nodes[i].isComplete) {
      fail(TagError::Case::missingEndTag);
    } else if (!isLegal(kind, nodes[i])) {
      fail(role(kind).closes == Type::leaf ? TagError::Case::improperlyNestedTag
                                           : TagError::Case::missingStartTag);
    } else {
      if (const auto tag = tags.begin() + static_cast<std::ptrdiff_t>(i); tag != end) *end = std::move(*tag);
      ++end;
      ++i;
    }
  }
  tags.erase(end, tags.end());
  result.tags = std::move(tags);
  return result;
}

}  // namespace

std::vector<DocumentNode> DocumentNode::nodes(const std::vector<SourceTag::Located>& tags) {
  std::vector<DocumentNode> nodes;
  nodes.reserve(tags.size());
  std::vector<std::size_t> open;
  for (std::size_t i = 0; i < tags.size(); ++i) {
    const auto [opens, closes] = role(tags[i].tag.kind());
    const auto parentType = open.empty() ? Type::root : nodes[open.back()].type;
    const bool isLeaf = opens == Type::leaf;
    nodes.push_back({opens, parentType, open.size() + 1, isLeaf ? i + 1 : tags.size(), isLeaf});
    if (!isLeaf) {
      open.push_back(i);
    } else if (closes != Type::leaf && closes == parentType) {
      nodes[open.back()].end = i + 1;
      nodes[open.back()].isComplete = true;
      open.pop_back();
    }
  }
  return nodes;
}

SourceTag::ParseResult SourceTag::filterForOnlyValidTagsFor(std::vector<Located> tags) {
  return walk(std::move(tags), isLegalInDocument);
}

SourceTag::ParseResult validateInlineTagsFor(std::u16string_view line,
                                             std::vector<SourceTag::Located> inlineTags) {
  return walk(std::move(inlineTags), [&](Case tag, const DocumentNode& node) {
    if (SourceTag::isInlineTag(tag)) return isLegalInLine(tag, node);
    fatalError("Should not have received multiline tag while validating inline tags for line: " +
               utf8FromUTF16Lossy(line));
  });
}

}  // namespace MarletFoundation
