#pragma once

#include <array>
#include <memory>
#include <string>
#include <vector>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/SharedString.h"
#include "MarletFoundation/Platform/TreeAllocator.h"

namespace MarletFoundation {

class DiskTree;

/// A directory of a tree on disk, reached from the tree's root by names alone, with no link followed. Its
/// descriptor is opened when needed and may be closed in between, so that a tree of any size and depth gets
/// by with a few. One thread at a time may use a tree.
///
/// A descriptor that may be wanted again is kept in a slot, an `int` of whoever wants it. The tree empties
/// the slot (-1) when it closes the descriptor to make room.
class DiskDirectory {
 public:
  /// The root of a tree; its descriptor stays open.
  static std::shared_ptr<DiskDirectory> root(Descriptor descriptor);
  /// A directory by name, with its descriptor when it is open already. Otherwise it isn't looked at before it
  /// is used.
  static std::shared_ptr<DiskDirectory> child(std::shared_ptr<DiskDirectory> parent, SharedString name,
                                              Descriptor opened = {}, ino_t number = 0);
  struct Key {};  // only the functions above make directories
  DiskDirectory(Key, std::shared_ptr<DiskDirectory> parent, SharedString name);
  ~DiskDirectory();
  DiskDirectory(const DiskDirectory&) = delete;
  DiskDirectory& operator=(const DiskDirectory&) = delete;

  /// An open descriptor of the directory, good until the tree is next used; -1 and errno when it can't be
  /// opened (any more): ESTALE when another directory has taken its name since it was first opened.
  int descriptor();
  /// The directory's inode, once it was opened; 0 before.
  ino_t number() const { return number_; }
  /// Looks at the entry of that name itself, not at what it may link to.
  int status(const char* name, struct stat& status);
  /// The same, also where the directory was never opened: then it is what bears its name now.
  int statusByPath(const char* name, struct stat& status);
  /// Opens an entry itself for reading, waiting for nothing. For the first few entries the directory isn't opened:
  /// they are reached from its parent, in one call of the system that follows no link.
  Descriptor open(const char* name, int flags = ReadingFlags | O_NOFOLLOW);
  /// Keeps a descriptor in a slot.
  void keep(Descriptor descriptor, int& slot);
  /// Must be told before a slot goes away that isn't empty.
  void forget(const int& slot);
  /// The names and kinds (DT_REG and so on) of all entries; nothing and errno when they can't be listed.
  struct Entry {
    std::string name;
    unsigned char type;
    ino_t number;
  };
  std::optional<std::vector<Entry>> entries();

  /// Makes the tree go on beneath another root.
  void setRoot(Descriptor descriptor);
  /// Makes a directory below the root go on as the one that bears its name now.
  void follow(ino_t number);
  /// Tells a directory below the root where it was moved to within its tree.
  void moveTo(std::shared_ptr<DiskDirectory> parent, SharedString name);
  /// The root of this directory's tree.
  DiskDirectory& rootDirectory();
  /// Where the nodes of this directory's tree are kept.
  const TreeMemory& memory() const;
  const std::shared_ptr<DiskDirectory>& parent() const { return parent_; }
  const SharedString& name() const { return name_; }
  /// The path from the tree's root, for messages.
  std::string path() const;

  /// A name that is asked for in this directory, shared with its brothers, which tend to hold the same ones.
  SharedString sharedName(std::string_view name);
  /// The name that was asked for first in the first of its directories; empty when there was none yet.
  const SharedString& expectedName() const { return namesInDirectories_[0]; }

 private:
  friend class DiskTree;

  Descriptor openThroughParent(const char* name, int flags);
  const char* pathThroughParent(const char* name);
  bool isStill(int descriptor);

  std::shared_ptr<DiskDirectory> parent_;
  SharedString name_;
  std::unique_ptr<DiskTree> ownTree_;  // the root's
  DiskTree* tree_;
  int depth_;  // the root's is 0
  int descriptor_ = -1;
  int openedThroughParent_ = 0;
  ino_t number_ = 0;
  /// The names that were asked for first in its directories, no name twice.
  std::array<SharedString, 4> namesInDirectories_;
};

}  // namespace MarletFoundation
