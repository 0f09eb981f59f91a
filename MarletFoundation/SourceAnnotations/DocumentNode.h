#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/SourceAnnotations/SourceTag.h"

namespace MarletFoundation {

enum class NestedNodeType {
  root,
  multiLineField,
  inlineField,
  hiddenCode,
  multiLineCopySource,
  inlineCopySource,
  multiLineCopyDestination,
  inlineCopyDestination,
  leaf,
};

/// A region that a start tag opens, or any other tag as a leaf. The tree of a text is the list of its nodes in
/// the order of their tags, each with the place where its own tags end: however deep tags nest, no step of
/// building, walking and freeing it goes deeper.
struct DocumentNode {
  NestedNodeType type;
  NestedNodeType parentType;
  /// Number of nodes around this one; 1 directly below the root.
  std::size_t depth;
  /// Index behind the last node inside this one.
  std::size_t end;
  bool isComplete;

  /// One node a tag. An end tag closes the innermost open node or none; it lies inside what it closes.
  static std::vector<DocumentNode> nodes(const std::vector<SourceTag::Located>& tags);
};

/// The tags of one line that pair within it and stand in a legal place, and the errors of the others. A line
/// tag among them is a fatal condition.
MARLET_EXPORT SourceTag::ParseResult validateInlineTagsFor(std::u16string_view line,
                                                           std::vector<SourceTag::Located> inlineTags);

}  // namespace MarletFoundation
