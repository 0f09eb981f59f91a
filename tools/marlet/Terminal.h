#pragma once

#include <string>
#include <string_view>

/// How the command speaks: results on standard output, everything else on standard error.
struct Terminal {
  enum class Color { automatic, always, never };

  bool quiet = false;
  bool verbose = false;
  Color color = Color::automatic;

  /// A line for the person at the terminal, unless quiet.
  void note(std::string_view line) const;
  /// What went wrong with the command itself, as a sentence; printed even when quiet.
  void complain(std::string_view sentence) const;

  enum class Style { bold, red, yellow, green, dim };
  /// `text` in a style where the given stream (1 or 2) shows colour.
  std::string styled(Style style, std::string_view text, int stream = 1) const;
};

/// Text of a document on its way to a terminal: control characters, which could steer the terminal, as
/// escapes.
std::string printable(std::string_view text);
