#pragma once

#include <string>

/// What the command's fatal-error handler throws, so that one document's fatal condition doesn't end the
/// others' check.
struct FatalProblem {
  std::string message;
};
