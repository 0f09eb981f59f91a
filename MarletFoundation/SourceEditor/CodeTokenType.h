#pragma once

#include <memory>
#include <optional>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// What a language's lexer calls a token.
enum class TokenSyntaxType {
  Identifier,
  TypeIdentifier,
  Keyword,
  AttributeId,
  AttributeBuiltIn,
  Number,
  Boolean,
  String,
  Comment,
  CommentUrl,
  DocComment,
  DocCommentKeyword,
  BuildConfigKeyword,
  BuildConfigId,
  Placeholder,
  ObjectLiteral,
};

/// What an editor colours a token as.
class MARLET_EXPORT CodeTokenType {
 public:
  enum class Kind {
    Placeholder,
    Identifier,
    TypeName,
    Keyword,
    AttributeId,
    AttributeBuiltIn,
    Number,
    Boolean,
    VarLet,
    String,
    Comment,
    CommentUrl,
    DocComment,
    DocCommentKeyword,
    BuildConfigKeyword,
    BuildConfigId,
    ColorLiteral,
    ImageLiteral,
    FileLiteral,
    ComparisonOperator,
    AsConversionOperator,
    AssignmentOperator,
    BinaryOperator,
  };

  /// A `Placeholder` made in this way holds nothing.
  CodeTokenType(Kind kind) : kind_(kind) {}
  /// A placeholder for a token of type `held`.
  static CodeTokenType placeholder(const CodeTokenType& held);
  CodeTokenType(const CodeTokenType&) = default;
  CodeTokenType& operator=(const CodeTokenType&) = default;
  ~CodeTokenType();

  Kind kind() const { return kind_; }
  /// What a placeholder stands for; null where that isn't known, and for all other kinds.
  const CodeTokenType* held() const { return held_.get(); }

  /// "Keyword", "Comparison Operator"; "Placeholder", whatever it holds.
  std::string_view description() const;
  /// The same kind; of placeholders, holding equals or both nothing.
  bool operator==(const CodeTokenType& other) const;

 private:
  Kind kind_;
  std::shared_ptr<CodeTokenType> held_;
};

}  // namespace MarletFoundation
