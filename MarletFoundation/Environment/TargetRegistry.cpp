#include <map>
#include <unordered_map>

#include "MarletFoundation/Environment/Target.h"
#include "MarletFoundation/Environment/TargetInfo.h"
#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/PathUtilities/URLExtensions.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Utils/Locks.h"

namespace MarletFoundation {
namespace {

struct Registry {
  /// By `directoryURL`.
  std::unordered_map<URL, TargetPointer> urlToTargetMap;
  std::map<std::string, TargetPointer, std::less<>> identifierToTargetMap;
  std::vector<TargetPointer> allTargets;
  ReaderWriterDispatchLock targetRegistryLock{"Target registry reader/writer lock"};

  TargetPointer targetForURL(const URL& url) {
    return targetRegistryLock.read([&] {
      const auto found = urlToTargetMap.find(directoryURL(url));
      return found == urlToTargetMap.end() ? nullptr : found->second;
    });
  }

  void add(const TargetPointer& target, const std::optional<URL>& url) {
    targetRegistryLock.write([&] {
      if (url) urlToTargetMap[directoryURL(*url)] = target;
      identifierToTargetMap[target->identifier] = target;
      allTargets.push_back(target);
    });
  }
};

Registry& registry() {
  // Never destroyed: other static objects may still ask while the process ends.
  static auto& registry = *new Registry;
  return registry;
}

void report(const std::string& message) {
  Log([&] { return message; }, LogAspect("Targets"), LogLevel::Critical);
}

/// Registers every target of the library's resources, sorted by name. A failure ends the load where it
/// stands.
bool loadBundledTargets() {
  const auto resources = libraryResourcesURL();
  if (!resources) {
    report("Failed to load contents of 'Targets': the library's resources were not found");
    return false;
  }
  const auto directory = resources->appendingPathComponent("Targets", true);
  std::vector<std::string> names;
  try {
    names = FileManager::contentsOfDirectory(directory, true);
  } catch (const Error& error) {
    report("Failed to load contents of '" + directory.path() + "': " + error.description());
    return false;
  }
  for (const auto& name : names) {
    const auto url = directory.appendingPathComponent(name, true);
    if (url.pathExtension() != "target" || registry().targetForURL(url)) continue;
    const auto target = Target::loadFrom(url, false);
    if (!target) {
      report("Failed to load target at path: '" + url.path() + "': nil");
      return false;
    }
    registry().add(target, url);
  }
  return true;
}

bool didInitialLoad() {
  static const bool didLoad = loadBundledTargets();
  return didLoad;
}

}  // namespace

std::vector<TargetPointer> Target::allTargets() {
  if (!didInitialLoad())
    report("Warning: Looking up all targets may fail as we were not able to load bundled targets.");
  return registry().targetRegistryLock.read([] { return registry().allTargets; });
}

TargetPointer Target::targetWithIdentifier(std::string_view identifier) {
  if (!didInitialLoad()) {
    report("Warning: Looking up target with identifier '" + std::string(identifier) +
           "' may fail as we were not able to load bundled targets.");
  }
  return registry().targetRegistryLock.read([&] {
    const auto found = registry().identifierToTargetMap.find(identifier);
    return found == registry().identifierToTargetMap.end() ? nullptr : found->second;
  });
}

TargetPointer Target::loadFrom(const URL& url, bool registerTarget) {
  if (auto known = registry().targetForURL(url)) return known;
  auto target = loadTargetInfo(url);
  if (target && registerTarget) registry().add(target, url);
  return target;
}

bool Target::registerTarget(const TargetPointer& target, const std::optional<URL>& url) {
  if (!target) fatalError("A null target can't be registered.");
  const bool isKnown = registry().targetRegistryLock.read([&] {
    return (url && registry().urlToTargetMap.contains(directoryURL(*url))) ||
           registry().identifierToTargetMap.contains(target->identifier);
  });
  if (!isKnown) registry().add(target, url);
  return !isKnown;
}

void Target::_resetTargetRegistry() {
  registry().targetRegistryLock.write([] {
    registry().urlToTargetMap.clear();
    registry().identifierToTargetMap.clear();
    registry().allTargets.clear();
  });
}

}  // namespace MarletFoundation
