#pragma once

#include <memory>

#include "MarletFoundation/Environment/SearchPath.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// A directory tree that holds compiler libraries. Immutable, and shared freely between threads.
class MARLET_EXPORT Toolchain {
 public:
  explicit Toolchain(URL root) : Toolchain(std::move(root), false) {}

  /// The one that ships in the library's resources, made once. It is a fatal error when it isn't there, since
  /// nothing can be compiled without it.
  static const std::shared_ptr<const Toolchain>& globalToolchain();

  const URL toolchainRoot;
  const bool isGlobalToolchain;

  /// "usr/lib" and "lib" of the root.
  SearchPath librarySearchPath() const;
  /// The toolchain's own library path; for any but the global one followed by the global toolchain's.
  SearchPath effectiveLibrarySearchPath() const;

 private:
  Toolchain(URL root, bool isGlobal) : toolchainRoot(std::move(root)), isGlobalToolchain(isGlobal) {}
};

}  // namespace MarletFoundation
