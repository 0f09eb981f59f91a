#pragma once

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/URL.h"

/// What the file layer's own sources share over the system's descriptors. Functions return as the system
/// does, a negative value and errno, unless they say that they throw.
namespace MarletFoundation {

/// An open file descriptor, closed at the end.
class Descriptor {
 public:
  Descriptor() = default;
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(Descriptor&& other) noexcept : number_(other.release()) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(number_, other.number_);
    return *this;
  }
  ~Descriptor();

  int get() const { return number_; }
  int release() { return std::exchange(number_, -1); }
  explicit operator bool() const { return number_ >= 0; }

 private:
  int number_ = -1;
};

/// Calls again for as long as a signal interrupts the call.
template <class Call>
auto retrying(Call call) {
  while (true) {
    const auto result = call();
    if (result >= 0 || errno != EINTR) return result;
  }
}

/// Walks along a path once more when it led nowhere: a document on the way may have been exchanged, and the old one
/// removed, while the first walk was inside.
template <class Call>
auto walkingAgain(Call call) {
  const auto result = retrying(call);
  return result < 0 && errno == ENOENT ? retrying(call) : result;
}

inline bool isSameItem(const struct stat& a, const struct stat& b) {
  return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

/// Whether a directory can hold an entry of that name.
inline bool isFileName(std::string_view name) {
  return !name.empty() && name != "." && name != ".." &&
         std::none_of(name.begin(), name.end(), [](char c) { return c == '/' || c == '\0'; });
}

/// How foreign files are opened: waiting for nobody, and never becoming anybody's terminal.
inline constexpr int ReadingFlags = O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;
inline constexpr int DirectoryFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;

/// The most bytes that are read into memory as one file; a larger one fails with EFBIG.
inline constexpr off_t LargestContents = off_t{1} << 30;

/// A file's bytes, or the errno that tells why there are none.
struct FileContents {
  Data data;
  int error = 0;
};

/// Reads an open file to its end, wherever that lies by then. `expectedSize` is its size as of a look
/// that found a regular file. When as many bytes come, that was it, at the price of this one read.
/// Otherwise, and with no expected size, the descriptor is looked at first: nothing but a regular file is
/// read (EINVAL).
FileContents readToEnd(int descriptor, std::optional<off_t> expectedSize);

/// Writes all bytes.
int writeAll(int descriptor, std::string_view bytes);

/// Copies what is left to read of an open file, sharing its blocks where the file system can.
int copyBytes(int from, int to);

/// The path of a file URL for the system. Nothing when the URL is no file's or the path holds a NUL.
std::optional<std::string> fileSystemPath(const URL& url);
/// The same, but throws EINVAL.
std::string systemPath(const URL& url);

[[noreturn]] void throwPosix(int errorNumber, std::string_view path);
/// With a sentence of ours in place of the system's words, which say too little.
[[noreturn]] void throwPosix(int errorNumber, std::string_view path, std::string_view sentence);
/// EISDIR for a directory, EINVAL for anything else.
[[noreturn]] void throwNoRegularFile(const struct stat& status, std::string_view path);

}  // namespace MarletFoundation
