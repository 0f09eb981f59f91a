#include "MarletFoundation/SourceEditor/StringCharacters.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

/// Bytes of the first `count` characters.
std::size_t bytesOfCharacters(std::string_view string, std::int64_t count) {
  if (count < 0) fatalError("a character offset is negative");
  const auto end = graphemeRunEnd(string, 0, count);
  if (end == string.size() && graphemeCount(string) < count)
    fatalError("a character offset lies behind the end of the string");
  return end;
}

}  // namespace

std::int64_t length(std::string_view string) { return graphemeCount(string); }

std::string_view subscript(std::string_view string, const OffsetRange& range) {
  string.remove_prefix(bytesOfCharacters(string, range.lowerBound));
  return string.substr(0, bytesOfCharacters(string, range.upperBound - range.lowerBound));
}

}  // namespace MarletFoundation
