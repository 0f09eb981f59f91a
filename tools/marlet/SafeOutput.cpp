#include "SafeOutput.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <iostream>

#include "SafeText.h"

namespace {

constexpr std::size_t mostHeld = 1 << 16;

bool writeAll(int descriptor, std::string_view bytes) {
  while (!bytes.empty()) {
    const auto written = ::write(descriptor, bytes.data(), bytes.size());
    if (written < 0 && errno == EAGAIN) {
      // Whoever shares the descriptor made it one that doesn't wait.
      pollfd writable{descriptor, POLLOUT, 0};
      ::poll(&writable, 1, -1);
    } else if (written < 0 && errno != EINTR) {
      return false;
    }
    if (written > 0) bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

/// Opened the wrong way round, so that reading and writing fail as they do without a descriptor.
void takeIfClosed(int descriptor) {
  if (::fcntl(descriptor, F_GETFD) >= 0) return;
  const int opened = ::open("/dev/null", descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY);
  if (opened >= 0 && opened != descriptor) {
    ::dup2(opened, descriptor);
    ::close(opened);
  }
}

}  // namespace

SafeBuffer::int_type SafeBuffer::overflow(int_type character) {
  if (traits_type::eq_int_type(character, traits_type::eof())) return traits_type::not_eof(character);
  const char one = traits_type::to_char_type(character);
  return xsputn(&one, 1) == 1 ? character : traits_type::eof();
}

std::streamsize SafeBuffer::xsputn(const char* characters, std::streamsize count) {
  held_.append(characters, static_cast<std::size_t>(count));
  // A character whose bytes come one by one is whole at the end of a line.
  if (held_.size() >= mostHeld && held_.ends_with('\n') && sync() != 0) return 0;
  return count;
}

int SafeBuffer::sync() {
  const auto output = printableOutput(held_);
  held_.clear();
  return writeAll(descriptor_, output) ? 0 : -1;
}

bool SafeBuffer::putAsIs(std::string_view bytes) { return sync() == 0 && writeAll(descriptor_, bytes); }

SafeOutput::SafeOutput() : out_(STDOUT_FILENO), errors_(STDERR_FILENO) {
  for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) takeIfClosed(descriptor);
  originalOut_ = std::cout.rdbuf(&out_);
  originalErrors_ = std::cerr.rdbuf(&errors_);
}

SafeOutput::~SafeOutput() {
  std::cout.rdbuf(originalOut_);
  std::cerr.rdbuf(originalErrors_);
}

void printText(std::string_view text) {
  if (::isatty(STDOUT_FILENO)) {
    std::cout << printableLines(text);
  } else if (auto* const buffer = dynamic_cast<SafeBuffer*>(std::cout.rdbuf()); !buffer->putAsIs(text)) {
    std::cout.setstate(std::ios::badbit);
  }
}
