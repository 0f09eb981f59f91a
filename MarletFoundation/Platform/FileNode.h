#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/DiskTree.h"
#include "MarletFoundation/Platform/FileStamp.h"
#include "MarletFoundation/Platform/SharedString.h"
#include "MarletFoundation/Platform/TreeAllocator.h"

namespace MarletFoundation {

class TreeSurvey;

/// What a file wrapper shares with its copies: a directory, file or other item, in memory or on disk. Facts
/// of the disk are asked for once, when they are first needed.
class FileNode {
 public:
  enum class Kind : unsigned char { directory, regularFile, symbolicLink, other, unreadable };
  static Kind kindOf(mode_t mode);
  /// Children by name, as far as they were looked at; null stands for one that isn't there.
  struct ByName {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const { return a < b; }
  };
  using Children = std::map<SharedString, std::shared_ptr<FileNode>, ByName,
                            TreeAllocator<std::pair<const SharedString, std::shared_ptr<FileNode>>>>;

  static std::shared_ptr<FileNode> inMemory(Data contents);
  static std::shared_ptr<FileNode> directoryInMemory();
  /// The item at a path, links followed. Throws when it can't be opened.
  static std::shared_ptr<FileNode> atPath(const std::string& path);
  /// The same, but written as what lies at the path by then, and unreadable for now when it can't be opened.
  static std::shared_ptr<FileNode> referenceTo(const std::string& path);
  /// What was found under a name: for a file with its stamp.
  static std::shared_ptr<FileNode> found(std::shared_ptr<DiskDirectory> parent, SharedString name, Kind kind,
                                         const FileStamp& stamp);
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
  /// The children that were looked at, added or removed so far.
  const Children& knownChildren() const { return std::get_if<Directory>(&facts_)->children; }
  /// Whether a child was put in, or removed, since the directory was read from disk. All children of one in memory
  /// were put in.
  bool isChanged(std::string_view name) const;
  void setChild(std::string_view name, std::shared_ptr<FileNode> child);
  void removeChild(std::string_view name);
  /// The bytes of a regular file, read at first call; nothing when they can't be read.
  std::optional<Data> contents();

  /// Whether a regular file's bytes are held in memory.
  bool isLoaded() const { return file() && file()->wasRead && error_ == 0; }
  bool isOnDisk() const { return !diskName_.empty(); }
  bool isReference() const { return isReference_; }
  /// What the look at a file found that came before its bytes were read; nothing before that look.
  std::optional<FileStamp> stamp() const { return file() ? std::optional(file()->stamp) : std::nullopt; }
  /// The directory on disk that holds a file or link under `diskName`. Without one, that name is a path.
  const std::shared_ptr<DiskDirectory>& parent() const { return parent_; }
  const SharedString& diskName() const { return diskName_; }
  /// The directory on disk that a directory node stands for; null for one in memory.
  const std::shared_ptr<DiskDirectory>& diskDirectory() const;
  /// Looks at the item on disk as it is now; what the node knows stays.
  int lookAgain(struct stat& status);
  /// Opens the file on disk for reading; none and errno when that fails, or it is no regular one.
  Descriptor openOnDisk(struct stat& status);

  /// What doesn't let a tree be written any more: where, and an errno, ESTALE for what is no longer as it was found.
  struct Obstacle {
    std::string path;
    int error;
  };
  /// Looks again at all on disk that this tree was read from: whether it is as it was found, also where a child was
  /// since put in or removed. What couldn't be read counts only there: a writer must not take it for absent.
  std::optional<Obstacle> obstacleToWriting();
  /// Whether something else has the place of a root on disk, or nothing.
  bool wasReplaced() const;
  /// Whether all that was looked at is as it was found, so that what was read is one state.
  bool isUnchanged();
  /// Makes the tree go on in what was written of it.
  void adopt(TreeSurvey& written, Descriptor root);

 private:
  struct File {
    FileStamp stamp;
    int descriptor = -1;  // in a directory, from the look on: a slot of its tree
    bool wasRead = false;
    Data contents;
  };

  struct Directory {
    explicit Directory(std::shared_ptr<DiskDirectory> directory);

    std::shared_ptr<DiskDirectory> onDisk;
    Children children;
    /// What the disk held under the names of the children that were put in or removed: null for nothing.
    std::unique_ptr<Children> replaced;
    /// Whether `children` are all.
    bool isListed = false;
    /// Whether it could be opened for reading, once that was tried.
    std::optional<bool> wasOpened;
    /// Siblings tend to be of one kind: tells what the next child by name is taken for at first. A wrong
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
  void keepReplaced(std::string_view name);
  class Check;
  class Adoption;

  Kind kind_ = Kind::unreadable;
  bool isReference_ = false;
  int error_ = 0;
  std::unique_ptr<std::string> preferredName_;
  std::shared_ptr<DiskDirectory> parent_;
  SharedString diskName_;
  std::variant<std::monostate, File, Directory> facts_;
};

}  // namespace MarletFoundation
