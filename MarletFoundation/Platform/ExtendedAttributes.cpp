#include "MarletFoundation/Platform/ExtendedAttributes.h"

#include <linux/limits.h>
#include <sys/xattr.h>

#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation::ExtendedAttributes {

std::optional<std::string> attributeNameWithFlags(std::string_view name, MLFExtendedAttributeFlags flags) {
  constexpr std::string_view letters = "XCNS";
  const auto bits = static_cast<unsigned>(flags);
  if (name.empty() || name.find('\0') != std::string_view::npos || bits >> letters.size())
    return std::nullopt;
  auto attributeName = "user." + std::string(name);
  if (bits) attributeName += '#';
  for (std::size_t i = 0; i < letters.size(); ++i) {
    if (bits >> i & 1) attributeName += letters[i];
  }
  return attributeName.size() <= XATTR_NAME_MAX ? std::optional(attributeName) : std::nullopt;
}

std::optional<std::string> value(const URL& url, const std::string& attributeName) {
  const auto path = fileSystemPath(url);
  const auto size = path ? ::getxattr(path->c_str(), attributeName.c_str(), nullptr, 0) : -1;
  if (size < 0) return std::nullopt;
  std::string bytes(static_cast<std::size_t>(size), '\0');
  // A size of 0 would ask for the size once more.
  if (size > 0 && ::getxattr(path->c_str(), attributeName.c_str(), bytes.data(), bytes.size()) != size)
    return std::nullopt;
  return bytes;
}

bool exists(const URL& url, const std::string& attributeName) {
  const auto path = fileSystemPath(url);
  return path && ::getxattr(path->c_str(), attributeName.c_str(), nullptr, 0) >= 0;
}

bool setValue(const URL& url, const std::string& attributeName, std::string_view value) {
  const auto path = fileSystemPath(url);
  return path && ::setxattr(path->c_str(), attributeName.c_str(), value.data(), value.size(), 0) == 0;
}

void remove(const URL& url, const std::string& attributeName) {
  if (const auto path = fileSystemPath(url)) ::removexattr(path->c_str(), attributeName.c_str());
}

}  // namespace MarletFoundation::ExtendedAttributes
