#pragma once

#include <string>
#include <string_view>

namespace ArcCopierImplementation {

/// What stands against one entry: an errno, and a sentence without a full stop.
struct Problem {
  int error = 0;
  const char* reason = nullptr;

  explicit operator bool() const { return error != 0; }
};

/// An entry's name, decoded.
struct EntryPath {
  /// UTF-8, without a slash at its end. With U+FFFD for a NUL, and where it isn't what it claims to be.
  std::string shown;
  /// The way below the destination, without "." and doubled slashes; empty for the destination itself and
  /// where there is a problem.
  std::string normalized;
  bool isDirectory;
  Problem problem;
};

/// A name that isn't marked as UTF-8 is taken for it all the same when it reads as such, since many writers
/// don't mark theirs, and else for one of code page 437.
EntryPath entryPath(std::string_view name, bool isMarkedUTF8);

}  // namespace ArcCopierImplementation
