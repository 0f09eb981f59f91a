#include "MarletFoundation/SourceEditor/CodeTokenType.h"

#include "MarletFoundation/Platform/SharedRelease.h"

namespace MarletFoundation {

CodeTokenType CodeTokenType::placeholder(const CodeTokenType& held) {
  CodeTokenType type(Kind::Placeholder);
  type.held_ = std::make_shared<CodeTokenType>(held);
  return type;
}

CodeTokenType::~CodeTokenType() { releaseWithoutStack(std::move(held_)); }

std::string_view CodeTokenType::description() const {
  static constexpr std::string_view descriptions[] = {
      "Placeholder",
      "Identifier",
      "TypeName",
      "Keyword",
      "AttributeId",
      "AttributeBuiltIn",
      "Number",
      "Boolean",
      "VarLet",
      "String",
      "Comment",
      "CommentUrl",
      "DocComment",
      "DocCommentKeyword",
      "BuildConfigKeyword",
      "BuildConfigId",
      "ColorLiteral",
      "ImageLiteral",
      "FileLiteral",
      "Comparison Operator",
      "Conversion Operator",
      "Assignment Operator",
      "Binary Operator",
  };
  return descriptions[static_cast<std::size_t>(kind_)];
}

bool CodeTokenType::operator==(const CodeTokenType& other) const {
  const auto* left = this;
  const auto* right = &other;
  for (; left && right; left = left->held(), right = right->held())
    if (left->kind_ != right->kind_) return false;
  return left == right;
}

}  // namespace MarletFoundation
