#pragma once

#include "MarletFoundation/Logging/LogAspect.h"

namespace MarletFoundation {

/// The sink of all aspects without sinks of their own. It writes to the system log: "THREAD ASPECT: MESSAGE",
/// where THREAD is "[MT]" on the main thread, else the thread's name, else "[?T]".
Logger& DefaultLogger();

}  // namespace MarletFoundation
