#pragma once

#include <memory>
#include <optional>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/KeyedCoder.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// A file's URL together with a grant to read it, which travels from one process to another. The one that issues it
/// doesn't start access; the one that decodes it does, and holds it as long as the object lives.
class MARLET_EXPORT MLFSandboxedResource {
 public:
  /// Absent when access could not be started, as with a stale or forged token: ask before use.
  const std::optional<URL> resourceURL;
  /// The token's text with a NUL behind it.
  const Data sandboxExtensionToken;
  /// Whether this object started access, which it will end.
  const bool accessingSecurityScopedResource;

  /// Issues a grant, or takes over the one that the URL carries. Throws an `ErrorObject`: of
  /// `MarletFoundationErrorDomain` for a symbolic link (code 1) and for what can't be looked at (code 0), of the POSIX
  /// domain when no grant can be issued.
  explicit MLFSandboxedResource(const URL& contentsOfURL);
  explicit MLFSandboxedResource(const KeyedCoder& coder);
  /// Takes what `propertyListObject` answers; anything else gives an object without a URL.
  explicit MLFSandboxedResource(const PropertyListValue& propertyListObject);
  ~MLFSandboxedResource();
  MLFSandboxedResource(const MLFSandboxedResource&) = delete;
  MLFSandboxedResource& operator=(const MLFSandboxedResource&) = delete;

  /// Without a URL, nothing of it is encoded.
  void encodeWithCoder(KeyedCoder& coder) const;
  PropertyListValue propertyListObject() const;
  /// A new one issued for the same URL; null when that fails.
  std::unique_ptr<MLFSandboxedResource> copy() const;

 private:
  MLFSandboxedResource(std::optional<URL> url, Data token);
};

}  // namespace MarletFoundation
