#pragma once

#include <string>

#include "MarletFoundation/Platform/PropertyListObject.h"

namespace MarletFoundation {

/// What a JSON `null` is read as. Equal to every other.
class MARLET_EXPORT NullObject final : public PropertyListObject {
 public:
  bool isEqual(const PropertyListObject& other) const override {
    return dynamic_cast<const NullObject*>(&other);
  }
  std::size_t hash() const override { return 0; }
};

/// Objects from and to JSON: strings, arrays, dictionaries, null, and numbers. Those that are read have the type
/// codes "c" for a boolean, "q" for an integer and "d" for a real.
namespace JSONSerialization {

/// What a number is by its type code: "c", "C" and "B" tell a boolean, "f" and "d" a real, all others an integer.
enum class NumberKind { boolean, integer, real };
MARLET_EXPORT NumberKind kindOf(const NumberObject& number);

/// The domain of what goes wrong here.
inline constexpr std::string_view ErrorDomain = "MarletFoundation.JSONSerialization";
/// How deep arrays and dictionaries may lie in each other.
inline constexpr int DepthLimit = 512;

/// Reads UTF-8. Of equal keys the last wins; a whole number that 64 bits with a sign can't hold is a real.
/// Throws an `ErrorObject` that says what is wrong and at which byte.
MARLET_EXPORT PropertyListObjectPointer read(const Data& data);
/// The object on one line, a dictionary's entries in its own order. Throws an `ErrorObject` for kinds that
/// JSON has no form for, keys that aren't strings, numbers that aren't finite, ill-formed UTF-8 and what lies
/// too deep.
MARLET_EXPORT std::string write(const PropertyListObject& object);

}  // namespace JSONSerialization
}  // namespace MarletFoundation
