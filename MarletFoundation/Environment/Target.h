#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Environment/SearchPath.h"
#include "MarletFoundation/Environment/Toolchain.h"

namespace MarletFoundation {

class Target;
/// Targets are made once, live as long as someone holds them, and are shared between threads; equal is the
/// same object.
using TargetPointer = std::shared_ptr<const Target>;

/// One platform that code can be compiled for. Immutable.
class MARLET_EXPORT Target {
 public:
  Target(std::string identifier, URL SDKRoot, std::string SDKVersion, std::string deploymentTarget,
         std::optional<URL> toolchainURL, SearchPath executableSearchPath, SearchPath frameworkSearchPath,
         SearchPath privateFrameworkSearchPath, std::string targetOS);
  Target(const Target&) = delete;
  Target& operator=(const Target&) = delete;

  const std::string identifier;
  const URL SDKRoot;
  const std::string SDKVersion;
  const std::string deploymentTarget;
  /// The target's own toolchain; null where the global one serves.
  const std::shared_ptr<const Toolchain> toolchain;
  const SearchPath executableSearchPath;
  const SearchPath frameworkSearchPath;
  const SearchPath privateFrameworkSearchPath;
  const std::string targetOS;

  /// The effective library path of the target's toolchain, or of the global one.
  SearchPath librarySearchPath() const;
  /// "arm64" gives "arm64-quorvex-slateos10.0" for a `targetOS` of "slateos10.0".
  std::string targetTriple(std::string_view architecture) const;
  std::string targetTripleForHostArchitecture() const;

  /// All registered targets, in the order in which they were registered; the first look-up loads the bundled
  /// ones.
  static std::vector<TargetPointer> allTargets();
  /// The target registered under `identifier`, or null.
  static TargetPointer targetWithIdentifier(std::string_view identifier);
  /// The target registered for a directory, with or without the mark of one, else one loaded from it and, if
  /// asked, registered. Null when the directory holds no good one; that has no message.
  static TargetPointer loadFrom(const URL& url, bool registerTarget);
  /// False, with nothing changed, when the URL or the target's identifier is registered. Null is a fatal error.
  static bool registerTarget(const TargetPointer& target, const std::optional<URL>& url);
  /// For diagnostics: forgets every target. The bundled ones are not loaded again.
  static void _resetTargetRegistry();
};

}  // namespace MarletFoundation
