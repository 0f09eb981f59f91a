#include "MarletFoundation/Logging/LogAspect.h"

#include <map>

#include "MarletFoundation/Logging/ConsoleLogger.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Utils/Locks.h"

namespace MarletFoundation {
namespace {

struct Registry {
  std::map<std::string, LogAspect, std::less<>> registeredLogAspects;
  ReaderWriterDispatchLock logAspectRegistrationLock{"LogAspect registration lock"};
};

Registry& registry() {
  // Never destroyed: queues may log until the very end of the process.
  static auto& registry = *new Registry;
  return registry;
}

LogLevel defaultLevel(std::string_view name) {
  const auto& userDefault = HostEnvironment::current().userDefault;
  const auto value = userDefault ? userDefault(std::string(name) + "LogLevel") : std::nullopt;
  return value ? logLevelFromRawValue(*value) : LogLevel::Critical;
}

LogAspect registeredLogAspect(std::string_view name) {
  auto& [aspects, lock] = registry();
  const auto known = lock.read([&aspects = aspects, name]() -> std::optional<LogAspect> {
    const auto found = aspects.find(name);
    return found == aspects.end() ? std::nullopt : std::optional(found->second);
  });
  if (known) return *known;
  // The host is asked outside of the lock, so that it may log. An aspect that was registered meanwhile stays.
  LogAspect made(std::string(name), defaultLevel(name), false);
  return lock.write(
      [&aspects = aspects, &made] { return aspects.try_emplace(made.name, made).first->second; });
}

}  // namespace

LogLevel logLevelFromRawValue(std::int64_t rawValue) {
  if (rawValue < 2) return LogLevel::Critical;
  return rawValue == 2 ? LogLevel::Normal : LogLevel::Verbose;
}

std::string_view description(LogLevel level) {
  switch (level) {
    case LogLevel::Verbose:
      return "Verbose";
    case LogLevel::Normal:
      return "Normal";
    case LogLevel::Critical:
      return "Critical";
  }
  return {};
}

LogAspect::LogAspect(std::string_view aspectName) : LogAspect(registeredLogAspect(aspectName)) {}

LogAspect::LogAspect(std::string aspectName, LogLevel logLevel, std::optional<Loggers> aspectLoggers,
                     bool registers)
    : name(std::move(aspectName)), activeLevel(logLevel), loggers(std::move(aspectLoggers)) {
  if (!registers) return;
  auto& [aspects, lock] = registry();
  lock.write([&aspects = aspects, this] { aspects.insert_or_assign(name, *this); });
}

LogAspect::LogAspect(std::string aspectName, LogLevel logLevel, bool registers)
    : LogAspect(std::move(aspectName), logLevel, std::nullopt, registers) {}

void LogAspect::_log(std::string_view message, LogLevel logLevel) const {
  if (!loggers) return DefaultLogger().log(message, *this, logLevel);
  for (const auto& logger : *loggers) logger->log(message, *this, logLevel);
}

}  // namespace MarletFoundation
