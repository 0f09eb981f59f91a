#pragma once

#include <string>
#include <string_view>

#include "SafeText.h"

/// How the command speaks: results on standard output, everything else on standard error.
struct Terminal {
  enum class Color { automatic, always, never };

  bool quiet = false;
  bool verbose = false;
  Color color = Color::automatic;

  /// A line for the person at the terminal, made `printable`, unless quiet.
  void note(std::string_view line) const;
  /// What went wrong with the command itself, as a sentence, made `printable`; printed even when quiet.
  void complain(std::string_view sentence) const;

  enum class Style { bold, red, yellow, green, dim };
  /// `text` in a style where the given stream (1 or 2) shows colour.
  std::string styled(Style style, std::string_view text, int stream = 1) const;
};

/// All that the command itself tells a terminal: the styles in their order, back to none, and to begin the line anew.
inline constexpr std::string_view terminalSequences[] = {"\033[1m", "\033[31m", "\033[33m", "\033[32m",
                                                         "\033[2m", "\033[0m",  "\r\033[K"};
inline constexpr std::string_view plainStyle = terminalSequences[5];
inline constexpr std::string_view newLineStart = terminalSequences[6];
