#include "Terminal.h"

#include <unistd.h>

#include <cstdlib>
#include <iostream>

void Terminal::note(std::string_view line) const {
  if (!quiet) std::cerr << printable(line) << "\n";
}

void Terminal::complain(std::string_view sentence) const {
  std::cerr << "marlet: " << printable(sentence) << "\n";
}

std::string Terminal::styled(Style style, std::string_view text, int stream) const {
  const char* noColor = std::getenv("NO_COLOR");
  const bool wanted =
      color == Color::always || (color == Color::automatic && !(noColor && *noColor) && ::isatty(stream));
  if (!wanted) return std::string(text);
  return std::string(terminalSequences[static_cast<std::size_t>(style)]).append(text).append(plainStyle);
}
