#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/DiskTree.h"
#include "MarletFoundation/Platform/ExistingItem.h"
#include "MarletFoundation/Platform/WriteCancellation.h"

namespace MarletFoundation {

/// Builds a file or directory beside the one whose place it is to take, as `.NAME.stage.XXXXXX`, and changes
/// the two at once. A crash at any instruction leaves the old item or the new one, and what it left of the
/// other the next replacement of that item clears away; a lock (flock) tells it what is still being built.
/// Where the file system can't exchange two names, the old item bears the name `.NAME.displaced` for a moment
/// in which nothing has its own; a crash then is undone by the next replacement. Failures throw.
class AtomicReplacement {
 public:
  /// Takes the place of the item at `path`, or of what it links to in the end; it need not exist. Only files
  /// and directories are replaced (EINVAL), and no mount points (EBUSY). Nothing is where it is to be kept
  /// (EEXIST), which `commit` looks to as well.
  explicit AtomicReplacement(std::string path, ExistingItem existing = ExistingItem::Replaced);
  /// Removes what was built but not committed.
  ~AtomicReplacement();
  AtomicReplacement(const AtomicReplacement&) = delete;
  AtomicReplacement& operator=(const AtomicReplacement&) = delete;

  const std::string& path() const { return path_; }
  /// What the path named at the start.
  const std::optional<struct stat>& replaced() const { return place_.item; }
  bool replacesFile() const { return place_.item && S_ISREG(place_.item->st_mode); }
  bool replacesDirectory() const { return place_.item && S_ISDIR(place_.item->st_mode); }
  /// The replaced item, opened for reading.
  Descriptor openReplaced() const;
  /// The replaced directory, open from the start to the end; none where no directory is replaced.
  const Descriptor& replacedDirectory() const { return replacedDirectory_; }

  /// Starts a file, to be filled through the descriptor, which stays this object's. It has the mode and the
  /// extended attributes of a replaced file.
  int makeFile();
  /// Starts a directory.
  std::shared_ptr<DiskDirectory> makeDirectory(mode_t mode);
  /// Flushes what was started, puts it in place, flushes the directory, and removes the old item. Refuses
  /// (ESTALE) when the path leads elsewhere by now, or to something else than at the start where that was a
  /// directory. `check` throws when the old item is no longer what it is taken for: it is asked before and after the
  /// two are exchanged. After any failure the old item is in its place again, but for a file where names can't be
  /// exchanged: once another was renamed to its name, that one stays.
  void commit(const std::function<void()>& check = {});

  /// Where the old item lies after a replacement in two steps that was cut off between them; nothing when
  /// there was none.
  static std::optional<std::string> displacedPath(const std::string& path);

 private:
  /// A directory, a name in it, and the file or directory that bears it.
  struct Place {
    Descriptor parent;
    std::string name;
    std::optional<struct stat> item;
  };
  /// What the path means, the links at its end followed.
  Place currentPlace() const;
  void undoHalfReplacement();
  /// Renames within the directory, never over another item.
  int moveToFreeName(const std::string& from, const std::string& to);
  void clearLeftovers();
  template <class Make>
  void start(Make make);
  void requireSamePlace() const;
  void requireSameItem() const;
  void putInPlace();
  void replaceInTwoSteps();
  void settle(const std::function<void()>& check);
  void takeBack();
  void discard() noexcept;

  std::string path_;
  ExistingItem existing_;
  Place place_;              // as it was at the start
  std::string stagePrefix_;  // of the names of what is built for this name
  std::string displaced_;
  Descriptor replacedDirectory_;
  std::string staging_;  // the name of what is being built, or of the old item once it is replaced
  Descriptor built_;
  WriteUnderWay underWay_;
};

/// Gives `to` the owner, mode and extended attributes of `from`, as far as the file system and our rights go;
/// a mode or an attribute of a user's that can't be kept is an error.
int copyAttributes(int from, int to);

/// Removes a file or a whole directory, of any depth; what can't be removed stays. 0, or the errno of the first
/// thing that stayed.
int removeTree(int parent, const std::string& name);

}  // namespace MarletFoundation
