#include "MarletFoundation/Environment/Target.h"

#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {

Target::Target(std::string identifier_, URL SDKRoot_, std::string SDKVersion_, std::string deploymentTarget_,
               std::optional<URL> toolchainURL, SearchPath executableSearchPath_,
               SearchPath frameworkSearchPath_, SearchPath privateFrameworkSearchPath_, std::string targetOS_)
    : identifier(std::move(identifier_)),
      SDKRoot(std::move(SDKRoot_)),
      SDKVersion(std::move(SDKVersion_)),
      deploymentTarget(std::move(deploymentTarget_)),
      toolchain(toolchainURL ? std::make_shared<const Toolchain>(*toolchainURL) : nullptr),
      executableSearchPath(std::move(executableSearchPath_)),
      frameworkSearchPath(std::move(frameworkSearchPath_)),
      privateFrameworkSearchPath(std::move(privateFrameworkSearchPath_)),
      targetOS(std::move(targetOS_)) {}

SearchPath Target::librarySearchPath() const {
  return (toolchain ? toolchain : Toolchain::globalToolchain())->effectiveLibrarySearchPath();
}

std::string Target::targetTriple(std::string_view architecture) const {
  return std::string(architecture) + "-quorvex-" + targetOS;
}

std::string Target::targetTripleForHostArchitecture() const {
  return targetTriple(MLFGetHostArchitectureName());
}

}  // namespace MarletFoundation
