#pragma once

#include <string>

#include "MarletFoundation/Data/PropertyListValue.h"

namespace MarletFoundation {

/// The bytes of a value in each form: the same for the same value. They throw an `ErrorObject` of
/// `PropertyListErrorDomain` for what the form can't carry.
std::string xmlPropertyList(const PropertyListValue& value);
std::string binaryPropertyList(const PropertyListValue& value);

}  // namespace MarletFoundation
