#pragma once

#include <set>
#include <string>
#include <string_view>

/// The names of what stands for an item while it is replaced, all in the item's own directory.
namespace MarletFoundation {

/// How the name begins of what is built to replace an item, `.NAME.stage.`; letters follow. A name too long to be
/// added to is cut, and told from others by a digest.
std::string stagePrefix(const std::string& name);
std::string newStageName(const std::string& prefix);
bool isStage(std::string_view name, std::string_view prefix);
/// Whether it is a stage of any of the items with these names.
bool isStageOfOneOf(const std::set<std::string, std::less<>>& names, std::string_view name);
/// The name that an item bears while nothing bears its own, `.NAME.displaced`.
std::string displacedName(const std::string& name);

}  // namespace MarletFoundation
