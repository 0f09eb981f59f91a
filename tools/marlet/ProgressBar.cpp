#include "ProgressBar.h"

#include <unistd.h>

#include <iostream>
#include <string>

namespace {

constexpr std::size_t Width = 40;

}  // namespace

ProgressBar::ProgressBar(const Terminal& terminal) : isShown_(!terminal.quiet && ::isatty(STDERR_FILENO)) {}

void ProgressBar::show(double fraction) {
  if (!isShown_) return;
  const auto filled = static_cast<std::size_t>(fraction * Width);
  std::cerr << newLineStart << "[" << std::string(filled, '#') << std::string(Width - filled, ' ') << "] "
            << static_cast<int>(fraction * 100) << " %" << std::flush;
}

void ProgressBar::clear() {
  if (isShown_) std::cerr << newLineStart << std::flush;
}
