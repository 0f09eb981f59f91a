#pragma once

#include "MarletFoundation/Environment/Target.h"

namespace MarletFoundation {

/// Makes the target that "TargetInfo.plist" in the directory at `url` describes. Null when the file is
/// missing or any of it is wrong; that has no message of its own.
TargetPointer loadTargetInfo(const URL& url);

}  // namespace MarletFoundation
