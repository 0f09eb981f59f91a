// JSON, through objects to values; what is written of it must read as the same value again.

#include <cstdint>

#include "MarletFoundation/Data/JSON.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/JSONSerialization.h"

using namespace MarletFoundation;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  PropertyListObjectPointer object;
  try {
    object = JSONSerialization::read(Data(std::vector(bytes, bytes + size)));
  } catch (const ErrorObject&) {
    return 0;
  }
  if (JSON(*object) != JSON(Data(JSONSerialization::write(*object)))) __builtin_trap();
  return 0;
}
