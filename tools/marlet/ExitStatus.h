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
  /// What failed came behind the change, which is made.
  changeMade = 5,
  /// No answer at all. Nothing was changed, but for what was extracted before.
  outOfMemory = 6,
};

/// The statuses in the words of the manual page and the help.
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
    {ExitStatus::changeMade,
     "The change is made, but something failed behind it, such as the printing of the report."},
    {ExitStatus::outOfMemory,
     "There was not enough memory; nothing was changed, but for what unzip had extracted."},
};
