#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/DiskTree.h"

namespace MarletFoundation {

/// What a file wrapper shares with its copies: a directory, file or other item, in memory or on disk. Facts
/// of the disk are asked for once, when they are first needed.
class FileNode {
 public:
  enum class Kind : unsigned char { unknown, directory, regularFile, symbolicLink, other, unreadable };
  /// Children by name, as far as they were looked at; null stands for one that isn't there.
  using Children = std::map<std::string, std::shared_ptr<FileNode>, std::less<>>;

  /// What a look at a file's name found, enough to tell whether it has changed since.
  struct Stamp {
    dev_t device = 0;
    ino_t number = 0;
    off_t size = 0;
    timespec changed{};

    Stamp() = default;
    explicit Stamp(const struct stat& status);
    bool operator==(const Stamp& other) const;
  };

  static std::shared_ptr<FileNode> inMemory(Data contents);
  static std::shared_ptr<FileNode> directoryInMemory();
  /// The item at a path, links followed. Throws when it can't be opened.
  static std::shared_ptr<FileNode> atPath(const std::string& path);
  ~FileNode();

  /// The kind, looked up if need be; never `unknown`.
  Kind kind();
  bool hasChildren();
  /// The child of that name, or null.
  std::shared_ptr<FileNode> child(std::string_view name);
  /// All children; null and errno when they can't be listed. Names that aren't there may map to null.
  const Children* allChildren();
  void setChild(std::string name, std::shared_ptr<FileNode> child);
  void removeChild(std::string_view name);
  /// The bytes of a regular file, read at first call; `error` tells why there are none.
  const FileContents& contents();

  /// Whether the node stands for an item on disk, below a root or by itself.
  bool isOnDisk() const { return parent_ || directory_ || !path_.empty(); }
  bool contentsWereRead() const { return contentsRead_; }
  const Stamp& stamp() const { return stamp_; }
  /// The errno of an unreadable node.
  int error() const { return error_; }
  /// The directory on disk that holds the item under `diskName`; null for a root.
  const std::shared_ptr<DiskDirectory>& parent() const { return parent_; }
  const std::string& diskName() const { return diskName_; }
  /// The directory on disk that a directory node stands for; null for one in memory.
  const std::shared_ptr<DiskDirectory>& diskDirectory() const { return directory_; }
  /// Opens the file on disk for reading; the caller looks at what it got.
  Descriptor openOnDisk();
  /// Looks at the item on disk as it is now; what the node knows stays.
  int lookAgain(struct stat& status);

  std::optional<std::string> preferredName;

 private:
  FileNode() = default;
  static std::shared_ptr<FileNode> onDisk(std::shared_ptr<DiskDirectory> parent, std::string_view name);
  void look();
  std::shared_ptr<FileNode> lookUp(std::string_view name);

  Kind kind_ = Kind::unknown;
  bool listed_ = false;
  bool contentsRead_ = false;
  /// Whether the directory could be opened for reading, once that was tried.
  std::optional<bool> opened_;
  /// Brothers tend to be of one kind: tells what the next child by name is taken for at first. A wrong guess
  /// costs one more system call and nothing else.
  bool expectsDirectories_ = false;
  int error_ = 0;
  std::shared_ptr<DiskDirectory> parent_;
  std::string diskName_;
  std::string path_;  // of a file that is a root
  std::shared_ptr<DiskDirectory> directory_;
  Children children_;
  FileContents contents_;
  Stamp stamp_;
};

}  // namespace MarletFoundation
