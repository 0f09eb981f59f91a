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
  enum class Kind : unsigned char { directory, regularFile, symbolicLink, other, unreadable };
  /// Children by name, as far as they were looked at; null stands for one that isn't there.
  using Children = std::map<std::string, std::shared_ptr<FileNode>, std::less<>>;

  /// What a look at an open file found, enough to tell whether it has changed since.
  struct Stamp {
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
  struct Key {};  // only the functions above make nodes
  explicit FileNode(Key) {}
  ~FileNode();
  FileNode(const FileNode&) = delete;
  FileNode& operator=(const FileNode&) = delete;

  std::optional<std::string> preferredName() const;
  void setPreferredName(std::string name);

  Kind kind();
  /// The errno of an unreadable node.
  int error() const { return error_; }
  bool hasChildren();
  /// The child of that name, or null.
  std::shared_ptr<FileNode> child(std::string_view name);
  /// All children; null and errno when they can't be listed. Names that aren't there may map to null.
  const Children* allChildren();
  void setChild(std::string name, std::shared_ptr<FileNode> child);
  void removeChild(std::string_view name);
  /// The bytes of a regular file, read at first call; nothing when they can't be read.
  std::optional<Data> contents();

  /// Whether a regular file's bytes are held in memory.
  bool isLoaded() const { return contentsWereRead_ && error_ == 0; }
  bool isOnDisk() const { return !diskName_.empty(); }
  /// What the look found that came before the bytes were read.
  const Stamp& stamp() const { return stamp_; }
  /// The directory on disk that holds a file or link under `diskName`. Without one, that name is a path.
  const std::shared_ptr<DiskDirectory>& parent() const { return parent_; }
  const std::string& diskName() const { return diskName_; }
  /// The directory on disk that a directory node stands for; null for one in memory.
  const std::shared_ptr<DiskDirectory>& diskDirectory() const;
  /// Looks at the item on disk as it is now; what the node knows stays.
  int lookAgain(struct stat& status);
  /// Opens the file on disk for reading; none and errno when that fails, or it is no regular one.
  Descriptor openOnDisk();

 private:
  struct Directory {
    std::shared_ptr<DiskDirectory> onDisk;
    Children children;
    /// Whether `children` are all.
    bool isListed = false;
    /// Whether it could be opened for reading, once that was tried.
    std::optional<bool> wasOpened;
    /// Brothers tend to be of one kind: tells what the next child by name is taken for at first. A wrong
    /// guess costs one more system call and nothing else.
    bool expectsDirectories = false;
  };

  static std::shared_ptr<FileNode> onDisk(std::shared_ptr<DiskDirectory> parent, std::string_view name);
  void look();
  void lookByName();
  void becomeDirectory(std::shared_ptr<DiskDirectory> onDisk, std::optional<bool> wasOpened);
  std::shared_ptr<FileNode> lookUp(std::string_view name);
  std::shared_ptr<FileNode> lookUpByContent(std::string_view name);
  void readContents();
  Descriptor openRegularFile(struct stat& status);

  Kind kind_ = Kind::unreadable;
  bool contentsWereRead_ = false;
  int descriptor_ = -1;  // of a regular file in a directory, from the look on: a slot of its tree
  int error_ = 0;
  std::unique_ptr<std::string> preferredName_;
  std::shared_ptr<DiskDirectory> parent_;
  std::string diskName_;
  std::unique_ptr<Directory> directory_;  // of a directory node
  Stamp stamp_;
  Data contents_;
};

}  // namespace MarletFoundation
