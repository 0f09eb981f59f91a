#include "Terminal.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <iostream>

void Terminal::note(std::string_view line) const {
  if (!quiet) std::cerr << line << "\n";
}

void Terminal::complain(std::string_view sentence) const { std::cerr << "marlet: " << sentence << "\n"; }

std::string Terminal::styled(Style style, std::string_view text, int stream) const {
  const char* noColor = std::getenv("NO_COLOR");
  const bool wanted =
      color == Color::always || (color == Color::automatic && !(noColor && *noColor) && ::isatty(stream));
  if (!wanted) return std::string(text);
  static constexpr const char* codes[] = {"1", "31", "33", "32", "2"};
  return std::string("\033[") + codes[static_cast<int>(style)] + "m" + std::string(text) + "\033[0m";
}

std::string printable(std::string_view text) {
  std::string result;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const auto byte = static_cast<unsigned char>(text[i]);
    // The C1 controls are C2 80 to C2 9F in UTF-8.
    const bool isC1 = byte == 0xC2 && i + 1 < text.size() && static_cast<unsigned char>(text[i + 1]) < 0xA0;
    if (byte >= 0x20 && byte != 0x7F && !isC1) {
      result += text[i];
      continue;
    }
    char escape[8];
    std::snprintf(escape, sizeof escape, "\\x%02X", isC1 ? static_cast<unsigned char>(text[++i]) : byte);
    result += escape;
  }
  return result;
}
