#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Data/Either.h"
#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// One instruction of a `//#-code-completion(…)` line to whoever offers completions: show or hide a namespace
/// or one name in it. The library only carries it.
struct MARLET_EXPORT LexiportDirective {
  enum class AddOrRemove { Add, Remove };

  enum class LexiportNamespace {
    Everything,
    Module,
    CurrentModule,
    PageAuxiliaryModule,
    ChapterAuxiliaryModule,
    BookAuxiliaryModule,
    Identifier,
    Snippet,
    Keyword,
    ValueLiteral,
  };
  /// The namespace of a raw value, which counts from 0; nothing for any other integer.
  static std::optional<LexiportNamespace> namespaceWithRawValue(std::int64_t rawValue);
  /// "CurrentModule", "Add"
  static std::string_view caseName(LexiportNamespace value);
  static std::string_view caseName(AddOrRemove value);

  /// Nothing when the directive is about a whole namespace.
  std::optional<std::string> identifier;
  AddOrRemove add_or_remove;
  LexiportNamespace namespace_;

  bool operator==(const LexiportDirective&) const = default;
  std::uint64_t hashValue() const;

  /// A key for consumers that look up by name and namespace.
  struct MARLET_EXPORT LXDirPair {
    std::optional<std::string> identifier;
    LexiportNamespace namespace_;
    bool operator==(const LXDirPair&) const = default;
    std::uint64_t hashValue() const;
  };

  /// A key for consumers that look up what a whole namespace is told.
  struct MARLET_EXPORT LXKeyPair {
    LexiportNamespace namespace_;
    bool hide;
    LXKeyPair(bool hides, LexiportNamespace space) : namespace_(space), hide(hides) {}
    bool operator==(const LXKeyPair&) const = default;
    std::uint64_t hashValue() const;
  };

  /// The directives of a line's arguments: a namespace's keyword, "show" or "hide", then names. Left: the
  /// message that says what is wrong.
  static Either<std::string, std::vector<LexiportDirective>> fromArray(const std::vector<std::string>& args);
};

/// The modules that four of the namespaces stand for at some place.
struct ModuleNameSet {
  std::string currentModuleName;
  std::optional<std::string> pageAuxiliaryModuleName;
  std::optional<std::string> chapterAuxiliaryModuleName;
  std::optional<std::string> bookAuxiliaryModuleName;
};

/// The directives of the first `//#-code-completion(…)` in a text that has the form of one and ends its line,
/// or the message that says what is wrong with them; nothing when there is none.
MARLET_EXPORT std::optional<Either<std::string, std::vector<LexiportDirective>>> lexiportDirectivesFromLine(
    std::u16string_view line);

}  // namespace MarletFoundation

template <>
struct std::hash<MarletFoundation::LexiportDirective> {
  std::size_t operator()(const MarletFoundation::LexiportDirective& value) const { return value.hashValue(); }
};
template <>
struct std::hash<MarletFoundation::LexiportDirective::LXDirPair> {
  std::size_t operator()(const MarletFoundation::LexiportDirective::LXDirPair& value) const {
    return value.hashValue();
  }
};
template <>
struct std::hash<MarletFoundation::LexiportDirective::LXKeyPair> {
  std::size_t operator()(const MarletFoundation::LexiportDirective::LXKeyPair& value) const {
    return value.hashValue();
  }
};
