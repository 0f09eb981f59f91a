#pragma once

#include <functional>
#include <string>

#include "ErrorWords.h"
#include "ExitStatus.h"
#include "Terminal.h"

/// What ends a command: a sentence and a status.
struct CommandFailure {
  ExitStatus status;
  std::string sentence;
};

/// Runs a command's work, and complains about what it throws; a library error or a fatal condition of the
/// document at `path` ends in `ExitStatus::negative`, all behind a commit in `ExitStatus::changeMade`.
ExitStatus guarded(const std::string& path, const Terminal& terminal,
                   const std::function<ExitStatus()>& work);

/// Throws `CommandFailure` when the output so far can't be printed: before a change that it reports.
void requirePrinted();

/// Runs work whose library errors end the command with `status`.
template <class Work>
auto orFailWith(ExitStatus status, const std::string& path, Work work) {
  try {
    return work();
  } catch (const MarletFoundation::Error& error) {
    throw CommandFailure{status, path + ": " + wordsWithSuggestion(error)};
  }
}
