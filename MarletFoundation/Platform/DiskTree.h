#pragma once

#include <memory>
#include <string>
#include <vector>

#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation {

class DiskTree;

/// A directory of a tree on disk, reached from the tree's root by names alone, with no link followed. Its
/// descriptor is opened when needed and may be closed in between, so that a tree of any size and depth gets
/// by with a few. One thread at a time may use a tree.
class DiskDirectory {
 public:
  /// The root of a tree; its descriptor stays open.
  static std::shared_ptr<DiskDirectory> root(Descriptor descriptor);
  /// A directory by name. It isn't looked at before it is used.
  static std::shared_ptr<DiskDirectory> child(std::shared_ptr<DiskDirectory> parent, std::string name);
  /// The directory of that name, opened; null and errno when there is none.
  static std::shared_ptr<DiskDirectory> openChild(const std::shared_ptr<DiskDirectory>& parent,
                                                  std::string name);
  struct Key {};  // only the functions above make directories
  DiskDirectory(Key, std::shared_ptr<DiskDirectory> parent, std::string name);
  ~DiskDirectory();
  DiskDirectory(const DiskDirectory&) = delete;
  DiskDirectory& operator=(const DiskDirectory&) = delete;

  /// An open descriptor of the directory, good until the tree is next used; -1 and errno when it can't be
  /// opened (any more).
  int descriptor();
  /// Looks at the entry of that name itself, not at what it may link to.
  int status(const char* name, struct stat& status);
  /// Opens an entry for reading. Nothing is waited for, but the caller rules out that it is a device.
  Descriptor openFile(const char* name);
  /// Takes over a descriptor, to be closed together with others.
  void closeLater(Descriptor descriptor);
  /// The names and kinds (DT_REG and so on) of all entries; nothing and errno when they can't be listed.
  struct Entry {
    std::string name;
    unsigned char type;
  };
  std::optional<std::vector<Entry>> entries();

  /// Makes the tree go on beneath another root.
  void setRoot(Descriptor descriptor);
  /// The root of this directory's tree.
  DiskDirectory& rootDirectory();
  const std::shared_ptr<DiskDirectory>& parent() const { return parent_; }
  const std::string& name() const { return name_; }
  /// The path from the tree's root, for messages.
  std::string path() const;

 private:
  friend class DiskTree;

  std::shared_ptr<DiskDirectory> parent_;
  std::string name_;
  std::unique_ptr<DiskTree> ownTree_;  // the root's
  DiskTree* tree_;
  int depth_;  // the root's is 0
  int descriptor_ = -1;
};

}  // namespace MarletFoundation
