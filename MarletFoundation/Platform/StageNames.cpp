#include "MarletFoundation/Platform/StageNames.h"

#include <algorithm>
#include <climits>

#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view StageMark = ".stage.";
constexpr std::string_view DisplacedMark = ".displaced";
constexpr std::size_t StageLetters = 6;
/// What the system takes for a name, less the longest that is put around one.
constexpr std::size_t LongestName = NAME_MAX - 1 - StageMark.size() - StageLetters;

std::string hiddenName(const std::string& name) {
  if (name.size() <= LongestName) return "." + name;
  MD5 digest;
  digest.update(name);
  std::string digits;
  for (const auto byte : digest.final()) {
    digits += "0123456789abcdef"[byte >> 4];
    digits += "0123456789abcdef"[byte & 15];
  }
  return "." + name.substr(0, LongestName - digits.size()) + digits;
}

}  // namespace

std::string stagePrefix(const std::string& name) { return hiddenName(name) + std::string(StageMark); }

std::string newStageName(const std::string& prefix) {
  auto letters = randomUUIDString();
  std::erase(letters, '-');
  return prefix + letters.substr(0, StageLetters);
}

bool isStage(std::string_view name, std::string_view prefix) {
  return name.size() == prefix.size() + StageLetters && name.starts_with(prefix);
}

bool isStageOfOneOf(const std::set<std::string, std::less<>>& names, std::string_view name) {
  if (name.size() <= 1 + StageMark.size() + StageLetters) return false;
  const auto mark = name.size() - StageLetters - StageMark.size();
  if (name[0] != '.' || name.substr(mark, StageMark.size()) != StageMark) return false;
  const auto item = name.substr(1, mark - 1);
  if (item.size() < LongestName) return names.contains(item);
  const auto prefix = name.substr(0, mark + StageMark.size());
  return std::any_of(names.begin(), names.end(),
                     [&](const std::string& known) { return stagePrefix(known) == prefix; });
}

std::string displacedName(const std::string& name) { return hiddenName(name) + std::string(DisplacedMark); }

}  // namespace MarletFoundation
