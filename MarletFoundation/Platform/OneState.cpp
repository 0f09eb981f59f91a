#include "MarletFoundation/Platform/OneState.h"

#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation {

void throwUnsettled(std::string_view path) {
  throwPosix(ESTALE, path, "It changes faster than it can be read.");
}

}  // namespace MarletFoundation
