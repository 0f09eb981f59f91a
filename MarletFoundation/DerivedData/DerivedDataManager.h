#pragma once

#include <string_view>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// Where compilers leave what they make and keep: shared between the processes of an app group, or private to this
/// one. All of it is wiped when the library or the SDK has changed. Any thread.
class MARLET_EXPORT DerivedDataManager {
 public:
  const URL containerURL;
  const URL derivedDataURL;
  const URL privateDerivedDataURL;
  const URL moduleCacheURL;
  const URL codeCompletionCacheURL;

  /// The process's own, made at first use.
  static const DerivedDataManager& sharedDerivedDataManager();

  /// Wipes what another version of the library or the SDK has made; failures are logged. Without a group container or
  /// an application-support directory (`HostEnvironment`) this is a fatal error.
  DerivedDataManager();

  // A document's directories. With `createIfNecessary` they are made; a failure is logged, and the URL answered all
  // the same.
  URL derivedDataDirectoryURLForMarletWithName(std::string_view name, std::string_view uniquifier,
                                               bool createIfNecessary = true, bool shared = true) const;
  URL buildDirectoryURLForMarletWithName(std::string_view name, std::string_view uniquifier,
                                         bool createIfNecessary = true, bool shared = true) const;
  URL resourcesBundlesDirectoryURLForMarletWithName(std::string_view name, std::string_view uniquifier,
                                                    bool createIfNecessary = true) const;

 private:
  URL infoURL() const;
  bool mustReset() const;
  void resetDerivedDataIfNecessary() const;
  void writeInfo() const;
  URL subdirectoryURL(const URL& directory, std::string_view name, bool createIfNecessary) const;
};

}  // namespace MarletFoundation
