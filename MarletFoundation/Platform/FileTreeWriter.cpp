#include <unistd.h>

#include <map>
#include <set>
#include <vector>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/FileNode.h"
#include "MarletFoundation/Platform/FileWrapper.h"

namespace MarletFoundation {
namespace {

bool sameItem(const struct stat& a, const struct stat& b) {
  return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

/// Copies what is left to read of an open file, sharing its blocks where the file system can.
int copyBytes(int from, int to) {
  while (true) {
    const auto count =
        retrying([&] { return ::copy_file_range(from, nullptr, to, nullptr, std::size_t{1} << 30, 0); });
    if (count == 0) break;
    if (count < 0 && errno != EXDEV && errno != EINVAL && errno != ENOSYS && errno != EOPNOTSUPP) return -1;
    if (count < 0) break;
  }
  // For file systems that can't, and for files that claim to be empty and aren't.
  std::vector<char> buffer(std::size_t{1} << 16);
  while (true) {
    const auto count = retrying([&] { return ::read(from, buffer.data(), buffer.size()); });
    if (count <= 0) return static_cast<int>(count);
    if (writeAll(to, {buffer.data(), static_cast<std::size_t>(count)}) != 0) return -1;
  }
}

/// Builds a tree of nodes in a new directory, level by level without recursion, since trees may be deep.
class TreeWriter {
 public:
  TreeWriter(const AtomicReplacement& replacement, std::shared_ptr<DiskDirectory> target)
      : replacement_(replacement), target_(std::move(target)) {
    if (::fstat(target_->descriptor(), &targetStatus_) != 0) throwPosix(errno, replacement.path());
    if (replacement.replacesDirectory()) original_ = DiskDirectory::root(replacement.openReplaced());
  }

  void write(const std::shared_ptr<FileNode>& root) {
    jobs_.push_back({root, target_, original_});
    while (!jobs_.empty()) {
      const Job job = jobs_.back();
      if (job.isDone) {
        above_.erase(job.node.get());
        jobs_.pop_back();
      } else {
        jobs_.back().isDone = true;
        writeDirectory(job);
      }
    }
    finishDirectories();
    if (flushes_ > MostSingleFlushes && ::syncfs(target_->descriptor()) != 0) fail(errno, *target_);
  }

 private:
  /// Each flush waits for the disk. From some number on one flush of the whole file system is sooner done.
  static constexpr int MostSingleFlushes = 64;
  int flush(int descriptor) { return ++flushes_ > MostSingleFlushes ? 0 : ::fsync(descriptor); }

  struct Job {
    std::shared_ptr<FileNode> node;
    std::shared_ptr<DiskDirectory> target;
    /// The directory of the replaced document at the same place, or null.
    std::shared_ptr<DiskDirectory> original;
    bool isDone = false;
  };
  struct Finish {
    std::shared_ptr<DiskDirectory> target, attributes;
  };

  [[noreturn]] void fail(int error, const DiskDirectory& directory, const std::string& name = {}) const {
    throwPosix(error, replacement_.path() + "/" + directory.path() + name);
  }

  void writeDirectory(const Job& job) {
    if (!above_.insert(job.node.get()).second) fail(ELOOP, *job.target);
    const auto* children = job.node->allChildren();
    if (!children) fail(errno, *job.target);
    const auto& source = job.node->diskDirectory();
    struct stat status;
    if (source && (::fstat(source->descriptor(), &status) != 0)) fail(errno, *job.target);
    // A document that is written into itself would go on forever.
    if (source && sameItem(status, targetStatus_)) fail(EINVAL, *job.target);
    finishes_.push_back({job.target, source ? source : job.original});
    for (const auto& [name, child] : *children) {
      if (child) writeChild(job, std::string(name), child);
    }
  }

  void writeChild(const Job& job, const std::string& name, const std::shared_ptr<FileNode>& child) {
    if (!isFileName(name)) fail(EINVAL, *job.target, name);
    switch (child->kind()) {
      case FileNode::Kind::directory: {
        auto original = originalDirectory(job, name);
        const mode_t mode = child->diskDirectory() || original ? 0700 : 0777;
        if (::mkdirat(job.target->descriptor(), name.c_str(), mode) != 0) fail(errno, *job.target, name);
        jobs_.push_back({child, DiskDirectory::child(job.target, SharedString(name)), std::move(original)});
        return;
      }
      case FileNode::Kind::regularFile:
        if (!linkFile(*job.target, name, *child)) writeFile(job, name, *child);
        return;
      case FileNode::Kind::symbolicLink:
        return copyLink(*job.target, name, *child);
      case FileNode::Kind::unreadable:
        fail(child->error(), *job.target, name);
      case FileNode::Kind::other:
        fail(EINVAL, *job.target, name);
    }
  }

  std::shared_ptr<DiskDirectory> originalDirectory(const Job& job, const std::string& name) {
    return originalKind(job, name) == S_IFDIR ? DiskDirectory::child(job.original, SharedString(name))
                                              : nullptr;
  }

  /// The kind of what the replaced document has at the same place; 0 when there is nothing.
  mode_t originalKind(const Job& job, const std::string& name) {
    struct stat status;
    if (!job.original) return 0;
    if (job.original->status(name.c_str(), status) == 0) return status.st_mode & S_IFMT;
    if (errno != ENOENT) fail(errno, *job.target, name);
    return 0;
  }

  /// Lets the new document share a file that is as it was with the document it replaces.
  bool linkFile(DiskDirectory& target, const std::string& name, FileNode& file) {
    struct stat status;
    if (!file.parent() || !isReplaced(file.parent()->rootDirectory())) return false;
    if (file.parent()->status(file.diskName().c_str(), status) != 0 || !S_ISREG(status.st_mode)) return false;
    if (file.isLoaded() && FileNode::Stamp(status) != file.stamp()) return false;
    const auto number = status.st_ino;
    if (::linkat(file.parent()->descriptor(), file.diskName().c_str(), target.descriptor(), name.c_str(),
                 0) != 0) {
      return false;
    }
    if (target.status(name.c_str(), status) == 0 && status.st_ino == number) return true;
    ::unlinkat(target.descriptor(), name.c_str(), 0);
    return false;
  }

  /// Whether the tree lies in the directory that is replaced, which goes away afterwards.
  bool isReplaced(DiskDirectory& root) {
    if (!replacement_.replacesDirectory()) return false;
    const auto [known, isNew] = replacedRoots_.try_emplace(&root, false);
    if (!isNew) return known->second;
    Descriptor directory(::openat(root.descriptor(), ".", DirectoryFlags));
    struct stat status, below{};
    while (directory && ::fstat(directory.get(), &status) == 0 && !sameItem(status, below)) {
      if (sameItem(status, *replacement_.replaced())) return known->second = true;
      below = status;
      directory = Descriptor(::openat(directory.get(), "..", DirectoryFlags));
    }
    return false;
  }

  void writeFile(const Job& job, const std::string& name, FileNode& file) {
    auto& target = *job.target;
    const Descriptor source = file.isOnDisk() ? file.openOnDisk() : Descriptor();
    if (!source && !file.isLoaded()) fail(errno, target, name);
    const Descriptor original = source ? Descriptor() : openOriginal(job, name);
    const int attributes = source ? source.get() : original.get();
    Descriptor written(::openat(target.descriptor(), name.c_str(),
                                O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC,
                                attributes >= 0 ? 0600 : 0666));
    if (!written) fail(errno, target, name);
    if ((attributes >= 0 && copyAttributes(attributes, written.get()) != 0) ||
        (file.isLoaded() ? writeAll(written.get(), file.contents()->view())
                         : copyBytes(source.get(), written.get())) != 0 ||
        flush(written.get()) != 0) {
      fail(errno, target, name);
    }
  }

  /// The file whose attributes a new one takes over, if there is one that we may read.
  Descriptor openOriginal(const Job& job, const std::string& name) {
    if (originalKind(job, name) != S_IFREG) return Descriptor();
    auto original = job.original->open(name.c_str());
    if (!original && errno != EACCES) fail(errno, *job.target, name);
    return original;
  }

  void copyLink(DiskDirectory& target, const std::string& name, FileNode& link) {
    std::string text(static_cast<std::size_t>(PATH_MAX), '\0');
    const auto length =
        ::readlinkat(link.parent()->descriptor(), link.diskName().c_str(), text.data(), text.size() - 1);
    if (length < 0) fail(errno, target, name);
    text.resize(static_cast<std::size_t>(length));
    if (::symlinkat(text.c_str(), target.descriptor(), name.c_str()) != 0) fail(errno, target, name);
  }

  /// Attributes come last, since a mode may forbid to add entries; the deepest directories first, since it
  /// may forbid to reach them.
  void finishDirectories() {
    for (; !finishes_.empty(); finishes_.pop_back()) {
      const auto& [target, attributes] = finishes_.back();
      const int number = target->descriptor();
      if (number < 0 || (attributes && copyAttributes(attributes->descriptor(), number) != 0) ||
          flush(number) != 0) {
        fail(errno, *target);
      }
    }
  }

  const AtomicReplacement& replacement_;
  std::shared_ptr<DiskDirectory> target_;
  std::shared_ptr<DiskDirectory> original_;
  struct stat targetStatus_;
  std::vector<Job> jobs_;
  std::set<const FileNode*> above_;
  std::vector<Finish> finishes_;
  std::map<const DiskDirectory*, bool> replacedRoots_;
  int flushes_ = 0;
};

void writeRegularFile(AtomicReplacement& replacement, FileNode& file) {
  const Descriptor source = file.isOnDisk() ? file.openOnDisk() : Descriptor();
  if (!source && !file.isLoaded()) throwPosix(errno, replacement.path());
  const int target = replacement.makeFile();
  if ((source && !replacement.replacesFile() && copyAttributes(source.get(), target) != 0) ||
      (file.isLoaded() ? writeAll(target, file.contents()->view()) : copyBytes(source.get(), target)) != 0) {
    throwPosix(errno, replacement.path());
  }
}

}  // namespace

void FileWrapper::write(const URL& url, ExistingItem existing) const {
  const auto path = systemPath(url);
  const auto kind = node_->kind();
  if (kind != FileNode::Kind::directory && kind != FileNode::Kind::regularFile) throwPosix(EINVAL, path);
  AtomicReplacement replacement(path, existing);
  if (kind == FileNode::Kind::regularFile) {
    writeRegularFile(replacement, *node_);
    replacement.commit();
    return;
  }
  const bool hasAttributes = node_->diskDirectory() || replacement.replacesDirectory();
  const auto target = replacement.makeDirectory(hasAttributes ? 0700 : 0777);
  TreeWriter(replacement, target).write(node_);
  if (wasReplaced()) throwPosix(ESTALE, path, "The document was replaced after it had been opened.");
  replacement.commit();
  // The tree that was read goes on in its own copy: the one it was opened in is gone.
  const auto& source = node_->diskDirectory();
  struct stat status;
  if (source && replacement.replaced() && ::fstat(source->descriptor(), &status) == 0 &&
      sameItem(status, *replacement.replaced())) {
    Descriptor root(::fcntl(target->descriptor(), F_DUPFD_CLOEXEC, 0));
    if (root) source->setRoot(std::move(root));
  }
}

}  // namespace MarletFoundation
