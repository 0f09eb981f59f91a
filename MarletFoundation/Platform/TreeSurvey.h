#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/DiskTree.h"
#include "MarletFoundation/Platform/FileStamp.h"

namespace MarletFoundation {

/// Everything that lay in a directory tree at one look: what a writer goes by, and holds against the disk once more
/// before and after its tree takes the place. Stages of writers (see `AtomicReplacement`) are no part of a tree.
class TreeSurvey {
 public:
  static constexpr std::size_t None = static_cast<std::size_t>(-1);

  struct Entry {
    std::string name;
    mode_t kind;  // S_IFREG and so on
    FileStamp stamp;
    std::size_t directory = None;  // its number, for a directory
    ino_t listedNumber = 0;        // as the listing gives it; some file systems list others than they show
    /// Whether the written tree has this very file, so that a change of its bytes is one there, too.
    bool isShared = false;
  };

  struct Directory {
    std::shared_ptr<DiskDirectory> onDisk;
    std::vector<Entry> entries;  // by name
    timespec changed{};
    /// Whether it hadn't changed for so long that each further change shows in that time.
    bool isSettled = false;

    Entry* find(std::string_view name);
  };

  /// An empty one, for a writer to note what it writes.
  TreeSurvey() = default;
  /// Looks at all of the tree, level by level. `path` is the root's, for messages. Throws when something can't be
  /// looked at, and EBUSY with its path for a place on which something is mounted.
  TreeSurvey(std::shared_ptr<DiskDirectory> root, const std::string& path);

  /// The root is number 0.
  Directory& operator[](std::size_t number) { return directories_[number]; }
  /// The device that all of it lies on.
  dev_t device() const { return device_; }
  /// Adds a directory without entries, and gives its number.
  std::size_t add(std::shared_ptr<DiskDirectory> directory);

  /// Holds all that was found against the disk; throws ESTALE, naming the first difference. The bytes of a shared
  /// file may have changed.
  void requireUnchanged();

 private:
  void list(std::size_t number);
  void requireUnchanged(Directory& directory);
  void requireSameEntries(Directory& directory);
  [[noreturn]] void fail(int error, const DiskDirectory& directory, std::string_view name = {}) const;

  std::string path_;
  dev_t device_ = 0;
  std::vector<Directory> directories_;
};

/// Whether something is mounted at an entry of a directory, or at the directory itself for an empty name.
bool isMountPoint(int directory, const char* name);

}  // namespace MarletFoundation
