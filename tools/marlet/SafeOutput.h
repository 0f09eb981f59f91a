#pragma once

#include <streambuf>
#include <string>
#include <string_view>

/// A standard stream's way out: whatever is printed passes `printableOutput`, so that no text is unsafe because a
/// place that prints it forgot.
class SafeBuffer : public std::streambuf {
 public:
  explicit SafeBuffer(int descriptor) : descriptor_(descriptor) {}
  /// Prints what was held back, then the bytes as they are. False when that fails.
  bool putAsIs(std::string_view bytes);

 protected:
  int_type overflow(int_type character) override;
  std::streamsize xsputn(const char* characters, std::streamsize count) override;
  int sync() override;

 private:
  int descriptor_;
  std::string held_;
};

/// While it lives, `std::cout` and `std::cerr` are safe. Who prints flushes: nothing is at the end. A standard
/// descriptor that the command was started without is taken, so that no file it opens gets the output.
class SafeOutput {
 public:
  SafeOutput();
  ~SafeOutput();
  SafeOutput(const SafeOutput&) = delete;
  SafeOutput& operator=(const SafeOutput&) = delete;

 private:
  SafeBuffer out_, errors_;
  std::streambuf* originalOut_;
  std::streambuf* originalErrors_;
};

/// Prints a text that is a result by itself, as a file's: to a program or a file as it stands, to a terminal safely.
void printText(std::string_view text);
