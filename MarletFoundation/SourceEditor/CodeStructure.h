#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "MarletFoundation/SourceEditor/SourceEditorRange.h"

namespace MarletFoundation {

/// The vocabulary in which a language service outlines a text: constructs with the ranges of their parts. In
/// each, `range` is the whole construct.
namespace CodeStructures {

template <int tag>
struct Body {
  SourceEditorRange range, bodyRange;
  bool operator==(const Body&) const = default;
};
using Class = Body<0>;
using Struct = Body<1>;
using ProtocolStructure = Body<2>;
using Extension = Body<3>;
using BraceStmt = Body<4>;
using ForStmt = Body<5>;
using WhileStmt = Body<6>;
using CallParameterClosure = Body<7>;

struct Function {
  struct Parameters {
    SourceEditorRange range, bodyRange;
    std::vector<SourceEditorRange> elements;
    bool operator==(const Parameters&) const = default;
  };
  struct Return {
    SourceEditorRange range, typeRange;
    bool operator==(const Return&) const = default;
  };
  SourceEditorRange range, nameRange;
  Parameters parameters;
  std::optional<Return> returnRange;
  SourceEditorRange bodyRange;
  bool operator==(const Function&) const = default;
};

struct FunctionParamList {
  SourceEditorRange range, bodyRange;
  std::vector<SourceEditorRange> elements;
  bool operator==(const FunctionParamList&) const = default;
};

struct ArrayLiteral {
  SourceEditorRange range, bodyRange;
  std::vector<SourceEditorRange> elements;
  bool operator==(const ArrayLiteral&) const = default;
};

struct DictionaryLiteral {
  struct Element {
    SourceEditorRange keyRange, valueRange;
    bool operator==(const Element&) const = default;
  };
  SourceEditorRange range, bodyRange;
  std::vector<Element> elements;
  bool operator==(const DictionaryLiteral&) const = default;
};

struct IfStmt {
  struct ElseIf {
    SourceEditorRange range, bodyRange;
    bool operator==(const ElseIf&) const = default;
  };
  SourceEditorRange range;
  std::optional<SourceEditorRange> ifBodyRange;
  std::vector<ElseIf> elseIfRanges;
  std::optional<SourceEditorRange> elseRange;
  bool operator==(const IfStmt&) const = default;
};

struct SwitchStmt {
  struct Case {
    SourceEditorRange range;
    std::optional<SourceEditorRange> patternRange;
    bool operator==(const Case&) const = default;
  };
  SourceEditorRange range;
  std::vector<Case> caseRanges;
  bool operator==(const SwitchStmt&) const = default;
};

struct ObjectLiteral {
  struct Parameter {
    std::string name;
    SourceEditorRange valueRange;
    bool operator==(const Parameter&) const = default;
  };
  SourceEditorRange range;
  std::string name;
  std::vector<Parameter> parameters;
  bool operator==(const ObjectLiteral&) const = default;
};

struct VarDecl {
  SourceEditorRange range, nameRange;
  std::optional<std::string> typeName;
  bool operator==(const VarDecl&) const = default;
};

struct CallExpr {
  SourceEditorRange range, nameRange, bodyRange;
  bool operator==(const CallExpr&) const = default;
};

}  // namespace CodeStructures

using CodeStructure =
    std::variant<CodeStructures::Class, CodeStructures::Struct, CodeStructures::ProtocolStructure,
                 CodeStructures::Extension, CodeStructures::Function, CodeStructures::FunctionParamList,
                 CodeStructures::BraceStmt, CodeStructures::ArrayLiteral, CodeStructures::DictionaryLiteral,
                 CodeStructures::IfStmt, CodeStructures::SwitchStmt, CodeStructures::ForStmt,
                 CodeStructures::WhileStmt, CodeStructures::ObjectLiteral, CodeStructures::VarDecl,
                 CodeStructures::CallExpr, CodeStructures::CallParameterClosure>;

/// What kind of construct a place is in.
enum class CodeStructureContext { Expr, Stmt, Type, TopLevel };

}  // namespace MarletFoundation
