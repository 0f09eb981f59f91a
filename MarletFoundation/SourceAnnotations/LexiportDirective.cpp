#include "MarletFoundation/SourceAnnotations/LexiportDirective.h"

#include <algorithm>
#include <array>

#include "MarletFoundation/Platform/CharacterClass.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Utils/Functional.h"

namespace MarletFoundation {
namespace {

struct NamespaceRow {
  std::string_view name;
  std::string_view keyword;
};

/// In the order of the raw values.
constexpr std::array<NamespaceRow, 10> namespaces = {{
    {"Everything", "everything"},
    {"Module", "module"},
    {"CurrentModule", "currentmodule"},
    {"PageAuxiliaryModule", "pageauxiliarymodule"},
    {"ChapterAuxiliaryModule", "chapterauxiliarymodule"},
    {"BookAuxiliaryModule", "bookauxiliarymodule"},
    {"Identifier", "identifier"},
    {"Snippet", "snippet"},
    {"Keyword", "keyword"},
    {"ValueLiteral", "literal"},
}};

std::uint64_t hash(const std::optional<std::string>& text) {
  return text ? std::hash<std::string>()(*text) : 0;
}

std::uint64_t rawValue(LexiportDirective::LexiportNamespace value) {
  return static_cast<std::uint64_t>(value);
}

bool isArgumentUnit(char16_t unit) { return unit != u',' && !isWhiteSpace(unit); }

std::size_t wordEnd(std::u16string_view text, std::size_t at) {
  while (at < text.size()) {
    const auto scalar = scalarAt(text, at);
    if (!isWordCharacter(scalar)) break;
    at += unitCount(scalar);
  }
  return at;
}

/// Reads `(word, argument, …) *` up to the end of a line.
struct ArgumentReader {
  std::u16string_view text;
  /// Behind "//#-code-completion(" at first; where a failed attempt ended afterwards.
  std::size_t at;
  std::vector<std::string> arguments = {};

  bool read() {
    if (!take(wordEnd(text, at))) return false;
    while (text.substr(at).starts_with(u", ")) {
      at += 2;
      const auto end = static_cast<std::size_t>(
          std::find_if_not(text.begin() + static_cast<std::ptrdiff_t>(at), text.end(), isArgumentUnit) -
          text.begin());
      if (end < text.size() && text[end] == u',') {
        if (!take(end)) return false;
        continue;
      }
      const bool isClosed = end > at && text[end - 1] == u')' && take(end - 1);
      at = std::min(text.find_first_not_of(u' ', end), text.size());
      return isClosed && (at == text.size() || isLineTerminator(text[at]));
    }
    return false;
  }

 private:
  bool take(std::size_t end) {
    if (end == at) return false;
    arguments.push_back(utf8FromUTF16Lossy(text.substr(at, end - at)));
    at = end;
    return true;
  }
};

}  // namespace

std::optional<LexiportDirective::LexiportNamespace> LexiportDirective::namespaceWithRawValue(
    std::int64_t rawValue) {
  if (rawValue < 0 || rawValue >= static_cast<std::int64_t>(namespaces.size())) return std::nullopt;
  return static_cast<LexiportNamespace>(rawValue);
}

std::string_view LexiportDirective::caseName(LexiportNamespace value) {
  return namespaces[rawValue(value)].name;
}

std::string_view LexiportDirective::caseName(AddOrRemove value) {
  return value == AddOrRemove::Add ? "Add" : "Remove";
}

std::uint64_t LexiportDirective::hashValue() const {
  return combiningHash(LXDirPair{identifier, namespace_}.hashValue(),
                       add_or_remove == AddOrRemove::Add ? 0 : 1);
}

std::uint64_t LexiportDirective::LXDirPair::hashValue() const {
  return combiningHash(hash(identifier), rawValue(namespace_));
}

std::uint64_t LexiportDirective::LXKeyPair::hashValue() const {
  return combiningHash(hide ? 1 : 0, rawValue(namespace_));
}

Either<std::string, std::vector<LexiportDirective>> LexiportDirective::fromArray(
    const std::vector<std::string>& args) {
  using Result = Either<std::string, std::vector<LexiportDirective>>;
  if (args.size() < 2) return Result::left("Requires 2 or more args");
  const auto row = std::find_if(namespaces.begin(), namespaces.end(),
                                [&](const NamespaceRow& r) { return r.keyword == args[0]; });
  if (row == namespaces.end()) return Result::left("Invalid namespace: " + args[0]);
  if (args[1] != "show" && args[1] != "hide") return Result::left("Invalid hide or show: " + args[1]);
  const auto space = static_cast<LexiportNamespace>(row - namespaces.begin());
  const auto action = args[1] == "show" ? AddOrRemove::Add : AddOrRemove::Remove;
  if (args.size() == 2) return Result::right({{std::nullopt, action, space}});
  std::vector<LexiportDirective> directives;
  for (auto name = args.begin() + 2; name != args.end(); ++name) directives.push_back({*name, action, space});
  return Result::right(std::move(directives));
}

/// The language of `\/\/#-code-completion\(([^,\W]+)((?:, [^,\s]+)+)\) *$`, anchors at line ends, which a
/// backtracking engine takes forever to refuse. Arguments hold neither comma nor white space, so each is a
/// whole run, the last one less its ")". A form that begins inside another one reads the same last runs and so
/// fails with it: the search goes on where the attempt ended.
std::optional<Either<std::string, std::vector<LexiportDirective>>> lexiportDirectivesFromLine(
    std::u16string_view line) {
  constexpr std::u16string_view opening = u"//#-code-completion(";
  for (auto start = line.find(opening); start != line.npos;) {
    ArgumentReader reader{line, start + opening.size()};
    if (reader.read()) return LexiportDirective::fromArray(reader.arguments);
    start = line.find(opening, reader.at);
  }
  return std::nullopt;
}

}  // namespace MarletFoundation
