#include "MarletFoundation/PathUtilities/ExtendedAttributeAccess.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

using Flags = MLFExtendedAttributeFlags;

bool mlf_extendedAttributeExists(const URL& url, std::string_view name, Flags flags) {
  const auto attribute = ExtendedAttributes::attributeNameWithFlags(name, flags);
  return attribute && ExtendedAttributes::exists(url, *attribute);
}

bool mlf_setExtendedAttributeValue(const URL& url, std::string_view value, std::string_view name,
                                   Flags flags) {
  const auto attribute = ExtendedAttributes::attributeNameWithFlags(name, flags);
  return attribute && ExtendedAttributes::setValue(url, *attribute, value);
}

std::optional<std::string> mlf_extendedAttributeValue(const URL& url, std::string_view name, Flags flags) {
  const auto attribute = ExtendedAttributes::attributeNameWithFlags(name, flags);
  auto value = attribute ? ExtendedAttributes::value(url, *attribute) : std::nullopt;
  return value && isValidUTF8(*value) ? value : std::nullopt;
}

bool mlf_setBooleanExtendedAttributeValue(const URL& url, std::string_view name, Flags flags) {
  return mlf_setExtendedAttributeValue(url, "1", name, flags);
}

void mlf_removeExtendedAttribute(const URL& url, std::string_view name, Flags flags) {
  if (const auto attribute = ExtendedAttributes::attributeNameWithFlags(name, flags))
    ExtendedAttributes::remove(url, *attribute);
}

}  // namespace MarletFoundation
