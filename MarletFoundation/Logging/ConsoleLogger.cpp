#include "MarletFoundation/Logging/ConsoleLogger.h"

#include "MarletFoundation/Logging/SystemLog.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {
namespace {

std::string threadMark() {
  if (isMainThread()) return "[MT]";
  auto name = currentThreadName();
  return name.empty() ? "[?T]" : name;
}

class ConsoleLogger final : public Logger {
 public:
  void log(std::string_view message, const LogAspect& logAspect, LogLevel) override {
    auto line = threadMark() + " " + logAspect.name + ": ";
    line += message;
    MarletFoundation::log(line);
  }
};

}  // namespace

Logger& DefaultLogger() {
  static Logger& logger = *new ConsoleLogger;
  return logger;
}

}  // namespace MarletFoundation
