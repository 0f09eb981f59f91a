#include "MarletFoundation/PathUtilities/MLFSandboxedResource.h"

#include <cerrno>
#include <cstring>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/SecurityScope.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view urlKey = "resourceURL";
constexpr std::string_view tokenKey = "sandboxExtensionToken";
constexpr int unknownKindCode = 0;
constexpr int symbolicLinkCode = 1;

void refuseSymbolicLink(const URL& url) {
  const auto path = fileSystemPath(url);
  const auto isLink = path ? SecurityScope::isSymbolicLink(*path) : std::nullopt;
  if (!isLink) {
    const auto underlying = ErrorObject::posix(path ? errno : EINVAL, url.path());
    throw ErrorObject::withMessage(MarletFoundationErrorDomain, unknownKindCode,
                                   "Unable to determine if file is a symlink", underlying.copy());
  }
  // A link could be pointed elsewhere after the grant.
  if (*isLink)
    throw ErrorObject(
        std::string(MarletFoundationErrorDomain), symbolicLinkCode,
        {{std::string(LocalizedDescriptionKey), "Unable to create sandbox extension for symlink"},
         {std::string(LocalizedFailureReasonKey),
          "Sandbox extensions cannot be issued for symlinks for security purposes."}});
}

std::string issuedToken(const URL& url) {
  if (auto token = SecurityScope::copySecurityScope(url)) return *token;
  refuseSymbolicLink(url);
  const auto path = url.path();
  if (auto token = SecurityScope::issueSandboxExtension(path)) return *token;
  const int code = errno;
  throw ErrorObject::withMessage(
      PosixErrorDomain, code,
      "Cannot issue a sandbox extension for file \"" + path + "\": " + std::strerror(code));
}

Data withNUL(std::string token) {
  token += '\0';
  return Data(std::move(token));
}

/// The URL with the token, when that starts access.
std::optional<URL> accessed(const std::optional<URL>& url, const Data& token) {
  const auto text = token.view();
  if (!url || text.empty() || text.back() != '\0') return std::nullopt;
  auto scoped = SecurityScope::attachSecurityScope(*url, std::string(text.substr(0, text.size() - 1)));
  return SecurityScope::startAccessingSecurityScopedResource(scoped) ? std::optional(scoped) : std::nullopt;
}

const PropertyListValue* valueAt(const PropertyListValue& object, std::string_view key) {
  const auto* dictionary = object.dictionary();
  return dictionary ? dictionary->find(key) : nullptr;
}

std::optional<URL> urlIn(const PropertyListValue& object) {
  const auto* value = valueAt(object, urlKey);
  return value && value->string() ? URL::parse(*value->string()) : std::nullopt;
}

Data tokenIn(const PropertyListValue& object) {
  const auto* value = valueAt(object, tokenKey);
  return value && value->data() ? *value->data() : Data();
}

}  // namespace

MLFSandboxedResource::MLFSandboxedResource(const URL& contentsOfURL)
    : resourceURL(contentsOfURL),
      sandboxExtensionToken(withNUL(issuedToken(contentsOfURL))),
      accessingSecurityScopedResource(false) {}

MLFSandboxedResource::MLFSandboxedResource(const KeyedCoder& coder)
    : MLFSandboxedResource(coder.decodeURL(urlKey), coder.decodeData(tokenKey).value_or(Data())) {}

MLFSandboxedResource::MLFSandboxedResource(const PropertyListValue& object)
    : MLFSandboxedResource(urlIn(object), tokenIn(object)) {}

MLFSandboxedResource::MLFSandboxedResource(std::optional<URL> url, Data token)
    : resourceURL(accessed(url, token)),
      sandboxExtensionToken(std::move(token)),
      accessingSecurityScopedResource(resourceURL.has_value()) {}

MLFSandboxedResource::~MLFSandboxedResource() {
  if (accessingSecurityScopedResource) SecurityScope::stopAccessingSecurityScopedResource(*resourceURL);
}

void MLFSandboxedResource::encodeWithCoder(KeyedCoder& coder) const {
  if (resourceURL) coder.encodeURL(*resourceURL, urlKey);
  coder.encodeData(sandboxExtensionToken, tokenKey);
}

PropertyListValue MLFSandboxedResource::propertyListObject() const {
  PropertyListDictionary dictionary{{tokenKey, sandboxExtensionToken}};
  if (resourceURL) dictionary[urlKey] = resourceURL->absoluteString();
  return dictionary;
}

std::unique_ptr<MLFSandboxedResource> MLFSandboxedResource::copy() const {
  if (!resourceURL) return nullptr;
  try {
    return std::make_unique<MLFSandboxedResource>(*resourceURL);
  } catch (const ErrorObject&) {
    return nullptr;
  }
}

}  // namespace MarletFoundation
