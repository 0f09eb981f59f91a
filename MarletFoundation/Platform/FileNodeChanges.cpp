#include <set>
#include <vector>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/FileNode.h"
#include "MarletFoundation/Platform/StageNames.h"
#include "MarletFoundation/Platform/TreeSurvey.h"

namespace MarletFoundation {
namespace {

bool isAbsence(int error) { return error == ENOENT || error == ENOTDIR || error == ENAMETOOLONG; }

}  // namespace

/// Holds what a tree's nodes found against the disk, directory by directory.
class FileNode::Check {
 public:
  explicit Check(bool isForWriting) : isForWriting_(isForWriting) {}

  std::optional<Obstacle> run(FileNode& root) {
    if (root.kind() == Kind::directory) jobs_.push_back({&root, false});
    while (!jobs_.empty() && !obstacle_) {
      const auto job = jobs_.back();
      jobs_.pop_back();
      checkDirectory(*job.node, job.isReplaced);
    }
    return std::move(obstacle_);
  }

 private:
  struct Job {
    FileNode* node;
    /// Whether the written tree has something else there, or nothing.
    bool isReplaced;
  };

  void checkDirectory(FileNode& node, bool isReplaced) {
    auto& own = node.directory();
    if (!own.onDisk) return;
    checkIdentity(*own.onDisk, !own.children.empty());
    for (const auto& [name, child] : own.children) {
      if (!own.replaced || !own.replaced->contains(name.view()))
        checkItem(*own.onDisk, name, child.get(), isReplaced);
    }
    if (own.replaced) {
      for (const auto& [name, child] : *own.replaced) checkItem(*own.onDisk, name, child.get(), true);
    }
    if (own.isListed && !obstacle_) checkNames(own);
  }

  /// The root's place is the writer's or the reader's to look at. A directory that was never opened is told by
  /// what was found in it.
  void checkIdentity(DiskDirectory& directory, bool isToldByChildren) {
    struct stat now;
    if (!directory.parent() || (directory.number() == 0 && isToldByChildren)) return;
    const bool isThere = directory.parent()->statusByPath(directory.name().c_str(), now) == 0;
    if (!isThere || !S_ISDIR(now.st_mode) || (directory.number() != 0 && now.st_ino != directory.number()))
      meet(ESTALE, directory, {});
  }

  void checkItem(DiskDirectory& directory, const SharedString& name, FileNode* known, bool isReplaced) {
    if (obstacle_ || !isFileName(name)) return;
    if (isForWriting_ && isReplaced && known && known->error_ != 0) meet(known->error_, directory, name);
    if (known && known->kind() == Kind::directory && known->diskDirectory()) {
      if (known->diskDirectory()->parent().get() == &directory) jobs_.push_back({known, isReplaced});
      return;
    }
    struct stat now;
    const bool isThere = directory.statusByPath(name.c_str(), now) == 0;
    if (!isThere && !isAbsence(errno)) return meet(errno, directory, name);
    if (!known && isThere) return meet(ESTALE, directory, name);
    if (!known) return;
    const auto* file = known->file();
    if (known->kind_ == Kind::unreadable) {
      if (known->error_ == ESTALE) meet(ESTALE, directory, name);
    } else if (!isThere || (file && (!S_ISREG(now.st_mode) || FileStamp(now) != file->stamp))) {
      meet(ESTALE, directory, name);
    }
  }

  /// Nothing may have come to a directory whose children are all known.
  void checkNames(const Directory& own) {
    const auto entries = own.onDisk->entries();
    if (!entries) return meet(errno, *own.onDisk, {});
    std::set<std::string, std::less<>> names;
    for (const auto& entry : *entries) names.insert(entry.name);
    for (const auto& name : names) {
      const bool isKnown =
          own.children.contains(name) || (own.replaced && own.replaced->contains(std::string_view(name)));
      if (!isKnown && !isStageOfOneOf(names, name)) return meet(ESTALE, *own.onDisk, name);
    }
  }

  void meet(int error, const DiskDirectory& directory, std::string_view name) {
    if (!obstacle_) obstacle_ = Obstacle{directory.path() + std::string(name), error};
  }

  bool isForWriting_;
  std::optional<Obstacle> obstacle_;
  std::vector<Job> jobs_;
};

std::optional<FileNode::Obstacle> FileNode::obstacleToWriting() { return Check(true).run(*this); }

bool FileNode::wasReplaced() const {
  const auto& root = diskDirectory();
  struct stat opened, now;
  if (!root || root->parent() || isReference_ || ::fstat(root->descriptor(), &opened) != 0) return false;
  const std::string path(diskName_);
  if (::stat(path.c_str(), &now) == 0) return !isSameItem(now, opened);
  const auto displaced = errno == ENOENT ? AtomicReplacement::displacedPath(path) : std::nullopt;
  return errno == ENOENT && !(displaced && ::stat(displaced->c_str(), &now) == 0 && isSameItem(now, opened));
}

bool FileNode::isUnchanged() { return !Check(false).run(*this); }

/// Takes over what was written: the directories, the stamps of files, and as what the disk holds under the names of
/// children that were put in or removed.
class FileNode::Adoption {
 public:
  explicit Adoption(TreeSurvey& written) : written_(written) {}

  void run(FileNode& root, Descriptor descriptor) {
    const auto& onDisk = root.directory().onDisk;
    struct stat status;
    if (!onDisk->parent()) {
      onDisk->setRoot(std::move(descriptor));
    } else if (::fstat(descriptor.get(), &status) == 0) {
      onDisk->follow(status.st_ino);
    }
    jobs_.push_back({&root, 0});
    while (!jobs_.empty()) {
      const auto job = jobs_.back();
      jobs_.pop_back();
      adoptDirectory(*job.node, written_[job.number]);
    }
  }

 private:
  struct Job {
    FileNode* node;
    std::size_t number;
  };

  void adoptDirectory(FileNode& node, TreeSurvey::Directory& written) {
    auto& own = node.directory();
    for (const auto& [name, child] : own.children) {
      auto* const entry = written.find(name);
      if (!child || !entry) continue;
      if (node.isChanged(name)) takeIn(own, name, *child);
      if (!node.isChanged(name)) adoptItem(*child, *entry);
    }
    if (!own.replaced) return;
    for (auto& [name, base] : *own.replaced) {
      auto* const entry = written.find(name);
      base = entry ? foundAs(own.onDisk, name, *entry) : nullptr;
    }
  }

  /// A child that was moved within its tree lies there by now.
  void takeIn(Directory& own, const SharedString& name, FileNode& child) {
    const auto& place = child.diskDirectory() ? child.diskDirectory()->parent() : child.parent_;
    if (!place || child.isReference_ || &place->rootDirectory() != &own.onDisk->rootDirectory()) return;
    child.parent_ = own.onDisk;
    child.diskName_ = name;
    if (child.diskDirectory()) child.diskDirectory()->moveTo(own.onDisk, name);
    own.replaced->erase(name);
  }

  void adoptItem(FileNode& child, const TreeSurvey::Entry& entry) {
    if (auto* const file = std::get_if<File>(&child.facts_)) {
      file->stamp = entry.stamp;
    } else if (auto* const directory = std::get_if<Directory>(&child.facts_);
               directory && directory->onDisk && entry.directory != TreeSurvey::None) {
      directory->onDisk->follow(written_[entry.directory].onDisk->number());
      jobs_.push_back({&child, entry.directory});
    }
  }

  /// What the disk has after the write, as nodes that nobody else sees.
  std::shared_ptr<FileNode> foundAs(const std::shared_ptr<DiskDirectory>& parent, const SharedString& name,
                                    const TreeSurvey::Entry& entry) {
    struct Pending {
      std::shared_ptr<FileNode> node;
      std::size_t number;
    };
    std::vector<Pending> pending;
    const auto make = [&](const std::shared_ptr<DiskDirectory>& above, const SharedString& itsName,
                          const TreeSurvey::Entry& item) {
      auto node = found(above, itsName, kindOf(item.kind), item.stamp);
      if (item.directory != TreeSurvey::None) {
        node->becomeDirectory(
            DiskDirectory::child(above, itsName, Descriptor(), written_[item.directory].onDisk->number()),
            std::nullopt);
        node->directory().isListed = true;
        pending.push_back({node, item.directory});
      }
      return node;
    };
    auto top = make(parent, name, entry);
    while (!pending.empty()) {
      const auto [node, number] = std::move(pending.back());
      pending.pop_back();
      auto& own = node->directory();
      for (const auto& item : written_[number].entries) {
        SharedString itsName(item.name);
        auto below = make(own.onDisk, itsName, item);
        own.children.emplace(std::move(itsName), std::move(below));
      }
    }
    return top;
  }

  TreeSurvey& written_;
  std::vector<Job> jobs_;
};

void FileNode::adopt(TreeSurvey& written, Descriptor root) { Adoption(written).run(*this, std::move(root)); }

}  // namespace MarletFoundation
