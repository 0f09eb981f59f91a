#pragma once

#include <sys/types.h>

#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Descriptor.h"

namespace ArcCopierImplementation {

using MarletFoundation::Descriptor;

/// The directory that everything is created in. Paths are relative to it, without "." and "..", and no
/// symbolic link on them is followed. Functions return 0 or an errno.
class Destination {
 public:
  /// Makes the directory with those above it when missing, and opens it.
  int open(const std::string& path);

  /// Whether something bears that name.
  bool exists(const std::string& path);
  /// Makes a directory with those above it; one that is there already will do, but EEXIST for anything else.
  int makeDirectory(const std::string& path, mode_t mode);

  /// A file that is being written; removed unless it was finished.
  class File {
   public:
    File() = default;
    ~File();
    File(const File&) = delete;
    File& operator=(const File&) = delete;

    int write(std::string_view bytes);
    /// Ends the file, and gives it its name; EEXIST when something bears it already.
    int finish();

   private:
    friend class Destination;
    int directory_ = -1;  // the destination's
    std::string name_;
    std::string currentName_;  // empty once the file is to stay
    Descriptor descriptor_;
  };
  enum class Naming { atOnce, whenFinished };
  /// Begins a file, and makes the directories above it when missing. One at a time. EEXIST when something
  /// bears its name already, which may show only at its end. Until then it has a passing name, unless it is
  /// to have its own at once, as is right for what is written in one go and known to be whole.
  int makeFile(const std::string& path, mode_t mode, Naming naming, File& file);

 private:
  /// The directory of a path, opened, and made when missing; it stays open for the files beside it.
  int openParent(const std::string& path, std::string& name, bool makingIt);
  int openDirectory(const std::string& path, bool makingIt, Descriptor& directory);

  Descriptor root_;
  Descriptor parent_;
  std::string parentPath_;  // what `parent_` is, empty before the first
  std::string passingName_;
};

}  // namespace ArcCopierImplementation
