#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/DiskTree.h"
#include "MarletFoundation/Platform/SharedString.h"
#include "MarletFoundation/Platform/TreeAllocator.h"

namespace MarletFoundation {

/// What a file wrapper shares with its copies: a directory, file or other item, in memory or on disk. Facts
/// of the disk are asked for once, when they are first needed.
class FileNode {
 public:
  enum class Kind : unsigned char { directory, regularFile, symbolicLink, other, unreadable };
  /// Children by name, as far as they were looked at; null stands for one that isn't there.
  struct ByName {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const { return a < b; }
  };
  using Children = std::map<SharedString, std::shared_ptr<FileNode>, ByName,
                            TreeAllocator<std::pair<const SharedString, std::shared_ptr<FileNode>>>>;

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
  void setChild(std::string_view name, std::shared_ptr<FileNode> child);
  void removeChild(std::string_view name);
  /// The bytes of a regular file, read at first call; nothing when they can't be read.
  std::optional<Data> contents();

  /// Whether a regular file's bytes are held in memory.
  bool isLoaded() const { return file() && file()->wasRead && error_ == 0; }
  bool isOnDisk() const { return !diskName_.empty(); }
  /// What the look found that came before the bytes of a file were read.
  const Stamp& stamp() const { return file()->stamp; }
  /// The directory on disk that holds a file or link under `diskName`. Without one, that name is a path.
  const std::shared_ptr<DiskDirectory>& parent() const { return parent_; }
  const SharedString& diskName() const { return diskName_; }
  /// The directory on disk that a directory node stands for; null for one in memory.
  const std::shared_ptr<DiskDirectory>& diskDirectory() const;
  /// Looks at the item on disk as it is now; what the node knows stays.
  int lookAgain(struct stat& status);
  /// Opens the file on disk for reading; none and errno when that fails, or it is no regular one.
  Descriptor openOnDisk();

 private:
  struct File {
    Stamp stamp;
    int descriptor = -1;  // in a directory, from the look on: a slot of its tree
    bool wasRead = false;
    Data contents;
  };

  struct Directory {
    explicit Directory(std::shared_ptr<DiskDirectory> directory);

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

  /// A node in the memory of a tree on disk; on the heap without one.
  static std::shared_ptr<FileNode> make(DiskDirectory* tree);
  static std::shared_ptr<FileNode> onDisk(std::shared_ptr<DiskDirectory> parent, SharedString name);
  /// What is known of a file once it was looked at, or null.
  const File* file() const { return std::get_if<File>(&facts_); }
  /// What is known of a directory, once `kind()` was asked for and found one.
  Directory& directory() { return *std::get_if<Directory>(&facts_); }
  void look();
  void lookByName();
  void becomeDirectory(std::shared_ptr<DiskDirectory> onDisk, std::optional<bool> wasOpened);
  std::shared_ptr<FileNode> lookUp(const SharedString& name);
  std::shared_ptr<FileNode> lookUpByContent(const SharedString& name);
  void readContents();
  Descriptor openRegularFile(struct stat& status);

  Kind kind_ = Kind::unreadable;
  int error_ = 0;
  std::unique_ptr<std::string> preferredName_;
  std::shared_ptr<DiskDirectory> parent_;
  SharedString diskName_;
  std::variant<std::monostate, File, Directory> facts_;
};

}  // namespace MarletFoundation
