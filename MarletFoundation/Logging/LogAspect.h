#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// How much is said. Ordered by raw value, so that the most severe level is the smallest.
enum class LogLevel { Verbose = 3, Normal = 2, Critical = 1 };

/// The level of any raw value: `Critical` below 2, `Verbose` above.
MARLET_EXPORT LogLevel logLevelFromRawValue(std::int64_t rawValue);
/// "Verbose", "Normal" or "Critical".
MARLET_EXPORT std::string_view description(LogLevel level);

struct LogAspect;

/// A sink of log messages. It is called on any thread.
class MARLET_EXPORT Logger {
 public:
  virtual ~Logger() = default;
  virtual void log(std::string_view message, const LogAspect& logAspect, LogLevel logLevel) = 0;
};

/// A named channel of log output.
struct MARLET_EXPORT LogAspect {
  using Loggers = std::vector<std::shared_ptr<Logger>>;

  std::string name;
  /// Messages at this level or a more severe one pass.
  LogLevel activeLevel;
  /// Where messages go; the default sink when absent, nowhere when empty.
  std::optional<Loggers> loggers;

  /// The registered aspect of that name. When there is none, one is registered whose level stands under the
  /// user default named `<name>LogLevel`, and is `Critical` without one; so a later change of the default is
  /// not seen.
  explicit LogAspect(std::string_view name);
  /// A new aspect. With `registers`, it takes the place of any registered one of its name.
  LogAspect(std::string name, LogLevel logLevel, std::optional<Loggers> loggers, bool registers);
  LogAspect(std::string name, LogLevel logLevel, bool registers);

  /// Delivers to the sinks whatever the level.
  void _log(std::string_view message, LogLevel logLevel) const;
};

}  // namespace MarletFoundation
