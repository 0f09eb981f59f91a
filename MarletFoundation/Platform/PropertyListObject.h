#pragma once

#include <memory>

namespace MarletFoundation {

class PropertyListObject;
using PropertyListObjectPointer = std::shared_ptr<const PropertyListObject>;

}  // namespace MarletFoundation
