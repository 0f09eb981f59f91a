#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/ExtendedAttributes.h"

namespace MarletFoundation {

/// Which attribute is meant.
struct MLFExtendedAttributeName {
  std::string identifier;
  MLFExtendedAttributeFlags flags = MLFExtendedAttributeFlags::none;
};

// Texts kept with a file, as UTF-8. Nothing is thrown: a name that the system can't take answers as an attribute
// that isn't there.
MARLET_EXPORT bool mlf_extendedAttributeExists(const URL& url, std::string_view name,
                                               MLFExtendedAttributeFlags flags);
/// Whether it could be set.
MARLET_EXPORT bool mlf_setExtendedAttributeValue(const URL& url, std::string_view value,
                                                 std::string_view name, MLFExtendedAttributeFlags flags);
/// Nothing also for bytes that aren't UTF-8.
MARLET_EXPORT std::optional<std::string> mlf_extendedAttributeValue(const URL& url, std::string_view name,
                                                                    MLFExtendedAttributeFlags flags);
/// Sets the value "1".
MARLET_EXPORT bool mlf_setBooleanExtendedAttributeValue(const URL& url, std::string_view name,
                                                        MLFExtendedAttributeFlags flags);
MARLET_EXPORT void mlf_removeExtendedAttribute(const URL& url, std::string_view name,
                                               MLFExtendedAttributeFlags flags);

inline bool extendedAttributeExists(const URL& url, const MLFExtendedAttributeName& name) {
  return mlf_extendedAttributeExists(url, name.identifier, name.flags);
}
inline bool setExtendedAttribute(const URL& url, const MLFExtendedAttributeName& name,
                                 std::string_view value) {
  return mlf_setExtendedAttributeValue(url, value, name.identifier, name.flags);
}
inline std::optional<std::string> extendedAttributeValue(const URL& url,
                                                         const MLFExtendedAttributeName& name) {
  return mlf_extendedAttributeValue(url, name.identifier, name.flags);
}
inline bool setBooleanExtendedAttributeValue(const URL& url, const MLFExtendedAttributeName& name) {
  return mlf_setBooleanExtendedAttributeValue(url, name.identifier, name.flags);
}
inline void removeExtendedAttribute(const URL& url, const MLFExtendedAttributeName& name) {
  mlf_removeExtendedAttribute(url, name.identifier, name.flags);
}

}  // namespace MarletFoundation
