#include "MarletFoundation/Marlet/DocumentLog.h"

namespace MarletFoundation {

const LogAspect& documentLogAspect() {
  static const LogAspect aspect("MarletFoundation");
  return aspect;
}

}  // namespace MarletFoundation
