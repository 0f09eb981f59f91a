#pragma once

#include "MarletFoundation/Logging/LogAspect.h"

namespace MarletFoundation {

/// The channel of everything that reads or writes documents: "MarletFoundation".
const LogAspect& documentLogAspect();

}  // namespace MarletFoundation
