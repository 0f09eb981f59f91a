#pragma once

/// What the command ends with; scripts hang on the numbers.
enum class ExitStatus {
  good = 0,
  /// A valid answer that is a no: problems found, a difference asked for.
  negative = 1,
  wrongUsage = 2,
  unreadablePath = 3,
  /// Nothing was changed.
  failedWrite = 4,
};
