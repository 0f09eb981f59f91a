#include "MarletFoundation/Environment/Toolchain.h"

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {
namespace {

URL globalToolchainRoot() {
  const auto resources = libraryResourcesURL();
  if (!resources) fatalError("The global toolchain is not available: the library's resources were not found");
  auto root = resources->appendingPathComponent("Toolchain", true);
  std::string problem = "not reachable";
  try {
    if (FileManager::resourceIsReachable(root)) return root;
  } catch (const Error& error) {
    problem = error.description();
  }
  fatalError("The global toolchain is not available: " + problem);
}

}  // namespace

const std::shared_ptr<const Toolchain>& Toolchain::globalToolchain() {
  // Never destroyed: other static objects may still ask while the process ends.
  static const auto& toolchain =
      *new std::shared_ptr<const Toolchain>(new Toolchain(globalToolchainRoot(), true));
  return toolchain;
}

SearchPath Toolchain::librarySearchPath() const {
  return SearchPath({toolchainRoot.appendingPathComponent("usr/lib", true),
                     toolchainRoot.appendingPathComponent("lib", true)});
}

SearchPath Toolchain::effectiveLibrarySearchPath() const {
  const auto own = librarySearchPath();
  if (isGlobalToolchain) return own;
  auto paths = own.searchPaths();
  const auto global = globalToolchain()->librarySearchPath();
  paths.insert(paths.end(), global.searchPaths().begin(), global.searchPaths().end());
  return SearchPath(std::move(paths));
}

}  // namespace MarletFoundation
