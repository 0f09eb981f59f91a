#include "MarletFoundation/Marlet/DocumentLog.h"

namespace MarletFoundation {

const LogAspect& documentLogAspect() {
  // Never destroyed: other static objects may still log while the process ends.
  static const auto& aspect = *new LogAspect("MarletFoundation");
  return aspect;
}

}  // namespace MarletFoundation
