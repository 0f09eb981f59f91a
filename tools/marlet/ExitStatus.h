#pragma once

/// What the command ends with; scripts hang on the numbers.
enum class ExitStatus {
  good = 0,
  /// A valid answer that is a no: problems found, a difference asked for.
  negative = 1,
  wrongUsage = 2,
  unreadablePath = 3,
  /// Nothing was changed, but for what was extracted before.
  failedWrite = 4,
};

/// The statuses in the words of the manual page.
struct ExitStatusWords {
  ExitStatus status;
  const char* words;
};

inline constexpr ExitStatusWords exitStatusWords[] = {
    {ExitStatus::good, "All is well."},
    {ExitStatus::negative,
     "A valid answer that is a no: problems were found, or a difference that was asked for."},
    {ExitStatus::wrongUsage, "Wrong usage."},
    {ExitStatus::unreadablePath, "A path can't be read."},
    {ExitStatus::failedWrite, "A write failed; nothing was changed, but for what unzip had extracted."},
};
