#include "MarletFoundation/Environment/TargetInfo.h"

#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace MarletFoundation {
namespace {

struct BadTargetInfo {};

const std::string& string(const PropertyListDictionary& info, std::string_view key) {
  const auto* value = info.find(key);
  if (!value || !value->string()) throw BadTargetInfo{};
  return *value->string();
}

URL beneath(const URL& directory, const std::string& path) {
  if (path.empty() || path.starts_with('/')) throw BadTargetInfo{};
  return directory.appendingPathComponent(path, true);
}

TargetPointer makeTarget(const URL& directory, const PropertyListDictionary& info) {
  const auto& identifier = string(info, "TargetIdentifier");
  auto SDKRoot = beneath(directory, string(info, "SDKRoot"));
  const auto& SDKVersion = string(info, "SDKVersion");
  const auto& deploymentTarget = string(info, "DeploymentTarget");
  std::optional<URL> toolchain;
  if (info.contains("ToolchainPath")) toolchain = beneath(directory, string(info, "ToolchainPath"));
  const auto& targetOS = string(info, "TargetOS");
  const auto* executables = info.find("ExecutableSearchPath");
  if (!executables || !executables->array()) throw BadTargetInfo{};
  std::vector<URL> executableSearchPath;
  for (const auto& path : *executables->array()) {
    if (!path.string()) throw BadTargetInfo{};
    executableSearchPath.push_back(beneath(directory, *path.string()));
  }

  return std::make_shared<const Target>(
      identifier, std::move(SDKRoot), SDKVersion, deploymentTarget, std::move(toolchain),
      SearchPath(std::move(executableSearchPath)),
      SearchPath({directory.appendingPathComponent("Frameworks", true)}),
      SearchPath({directory.appendingPathComponent("PrivateFrameworks", true)}), targetOS);
}

}  // namespace

TargetPointer loadTargetInfo(const URL& url) {
  try {
    const auto info =
        fromContentsOfPropertyListAtURL<PropertyListValue>(url.appendingPathComponent("TargetInfo.plist"));
    return info.dictionary() ? makeTarget(url, *info.dictionary()) : nullptr;
  } catch (const Error&) {
    return nullptr;
  } catch (const BadTargetInfo&) {
    return nullptr;
  }
}

}  // namespace MarletFoundation
