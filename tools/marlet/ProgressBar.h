#pragma once

#include "Terminal.h"

/// A bar in the last line of a terminal, on standard error; none where that is no terminal, and none when the
/// command is to be quiet.
class ProgressBar {
 public:
  explicit ProgressBar(const Terminal& terminal);

  bool isShown() const { return isShown_; }
  void show(double fraction);
  /// Before something else is printed, and at the end.
  void clear();

 private:
  bool isShown_;
};
