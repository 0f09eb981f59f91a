#include <unistd.h>

#include <algorithm>
#include <map>
#include <set>
#include <vector>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/FileNode.h"
#include "MarletFoundation/Platform/FileWrapper.h"
#include "MarletFoundation/Platform/TreeSurvey.h"

namespace MarletFoundation {
namespace {

/// Builds a tree of nodes in a new directory, level by level without recursion, since trees may be deep. What nobody
/// looked at is taken over as it lies on disk.
class TreeWriter {
 public:
  TreeWriter(const AtomicReplacement& replacement, std::shared_ptr<DiskDirectory> target)
      : replacement_(replacement), target_(std::move(target)) {
    if (::fstat(target_->descriptor(), &targetStatus_) != 0) throwPosix(errno, replacement.path());
    if (replacement.replacesDirectory())
      original_ = &survey(duplicate(replacement.replacedDirectory().get()));
  }

  void write(const std::shared_ptr<FileNode>& root) {
    written_.add(target_);
    jobs_.push_back({root, sourceOf(*root), original_ ? &(*original_)[0] : nullptr, target_, 0});
    while (!jobs_.empty()) {
      const Job job = jobs_.back();
      if (job.isDone) {
        if (job.node) above_.erase(job.node.get());
        jobs_.pop_back();
      } else {
        jobs_.back().isDone = true;
        writeDirectory(job);
      }
    }
    finishDirectories();
    if (flushes_ > MostSingleFlushes && ::syncfs(target_->descriptor()) != 0) fail(errno, *target_);
    for (auto& read : surveys_) {
      if (read.get() != original_) read->requireUnchanged();
    }
  }

  /// Throws when the directory that is replaced is no longer what was taken over or left out.
  void requireUnchangedOriginal() {
    if (original_) original_->requireUnchanged();
  }

  TreeSurvey& written() { return written_; }

 private:
  /// Each flush waits for the disk. From some number on one flush of the whole file system is sooner done.
  static constexpr int MostSingleFlushes = 64;
  int flush(int descriptor) { return ++flushes_ > MostSingleFlushes ? 0 : ::fsync(descriptor); }

  /// Where a directory is read from.
  struct Source {
    TreeSurvey* survey = nullptr;
    std::size_t number = 0;
    TreeSurvey::Directory* directory() const { return survey ? &(*survey)[number] : nullptr; }
  };
  struct Job {
    /// Null for a directory that nobody looked at.
    std::shared_ptr<FileNode> node;
    Source source;
    /// The directory of the replaced document at the same place, or null.
    TreeSurvey::Directory* original;
    std::shared_ptr<DiskDirectory> target;
    std::size_t written;
    bool isDone = false;
  };
  struct Finish {
    std::shared_ptr<DiskDirectory> target, attributes;
  };

  [[noreturn]] void fail(int error, const DiskDirectory& directory, const std::string& name = {}) const {
    refuse(error, replacement_.path() + "/" + directory.path() + name);
  }

  /// What had a name when it was found and has none now was taken away.
  [[noreturn]] static void refuse(int error, const std::string& place) {
    if (error != ESTALE && error != ENOENT) throwPosix(error, place);
    throwPosix(ESTALE, place, "It was changed after it had been opened.");
  }

  Descriptor duplicate(int directory) const {
    Descriptor opened(directory < 0 ? -1 : ::openat(directory, ".", DirectoryFlags));
    if (!opened) refuse(errno, replacement_.path());
    return opened;
  }

  TreeSurvey& survey(Descriptor root) {
    surveys_.push_back(
        std::make_unique<TreeSurvey>(DiskDirectory::root(std::move(root)), replacement_.path()));
    return *surveys_.back();
  }

  /// What lies on disk where a directory was read from, which is refused when that is no longer what was found.
  Source sourceOf(FileNode& node) {
    if (node.isReference()) return referenceOf(node);
    const auto& onDisk = node.diskDirectory();
    if (!onDisk) return {};
    struct stat status;
    const int opened = onDisk->descriptor();
    if (opened < 0 || ::fstat(opened, &status) != 0) refuse(errno, replacement_.path());
    const bool isOriginal = original_ && isSameItem(status, *replacement_.replaced());
    auto& found = isOriginal ? *original_ : survey(duplicate(opened));
    requireAsFound(node);
    return {&found, 0};
  }

  /// A reference is to what lies there now.
  Source referenceOf(FileNode& node) {
    const std::string path(node.diskName());
    const Descriptor opened(walkingAgain([&] { return ::open(path.c_str(), DirectoryFlags & ~O_NOFOLLOW); }));
    if (!opened) refuse(errno, path);
    return {&survey(duplicate(opened.get())), 0};
  }

  void requireAsFound(FileNode& node) const {
    const auto obstacle = node.obstacleToWriting();
    if (!obstacle) return;
    refuse(obstacle->error, replacement_.path() + "/" + obstacle->path);
  }

  void writeDirectory(const Job& job) {
    requireNotCancelled(replacement_.path());
    if (job.node && !above_.insert(job.node.get()).second) fail(ELOOP, *job.target);
    auto* const source = job.source.directory();
    // A document that is written into itself would go on forever.
    if (source && source->onDisk->number() == targetStatus_.st_ino &&
        job.source.survey->device() == targetStatus_.st_dev) {
      fail(EINVAL, *job.target);
    }
    finishes_.push_back({job.target, source         ? source->onDisk
                                     : job.original ? job.original->onDisk
                                                    : nullptr});
    auto* const node = job.node.get();
    if (source) {
      for (auto& entry : source->entries) {
        if (!node || !node->isChanged(entry.name)) takeOver(job, entry);
      }
    }
    if (node) {
      for (const auto& [name, child] : node->knownChildren()) {
        if (child && node->isChanged(name.view())) writeChild(job, std::string(name), child);
      }
    }
    auto& entries = written_[job.written].entries;
    std::sort(entries.begin(), entries.end(), [](const auto& a, const auto& b) { return a.name < b.name; });
  }

  /// Writes what a directory held when it was read, below which something may have been changed since.
  void takeOver(const Job& job, TreeSurvey::Entry& entry) {
    switch (entry.kind) {
      case S_IFDIR: {
        std::shared_ptr<FileNode> node;
        if (job.node) {
          const auto known = job.node->knownChildren().find(std::string_view(entry.name));
          if (known != job.node->knownChildren().end()) node = known->second;
        }
        return startDirectory(job, entry.name, std::move(node), {job.source.survey, entry.directory});
      }
      case S_IFREG:
        if (!linkFile(job, entry)) copyFile(job, entry);
        return;
      case S_IFLNK:
        return copyLink(job, entry.name, *job.source.directory()->onDisk, entry.name);
      default:
        fail(EINVAL, *job.target, entry.name);
    }
  }

  void startDirectory(const Job& job, const std::string& name, std::shared_ptr<FileNode> node,
                      Source source) {
    auto* const original = originalDirectory(job, name);
    const mode_t mode = source.survey || original ? 0700 : 0777;
    if (::mkdirat(job.target->descriptor(), name.c_str(), mode) != 0) fail(errno, *job.target, name);
    auto target = DiskDirectory::child(job.target, SharedString(name));
    const auto number = written_.add(target);
    note(job, {name, S_IFDIR, {}, number});
    jobs_.push_back({std::move(node), source, original, std::move(target), number});
  }

  void writeChild(const Job& job, const std::string& name, const std::shared_ptr<FileNode>& child) {
    if (!isFileName(name)) fail(EINVAL, *job.target, name);
    switch (child->kind()) {
      case FileNode::Kind::directory:
        return startDirectory(job, name, child, sourceOf(*child));
      case FileNode::Kind::regularFile:
        return writeFile(job, name, *child);
      case FileNode::Kind::symbolicLink:
        return copyLink(job, name, *child->parent(), std::string(child->diskName()));
      case FileNode::Kind::unreadable:
        fail(child->error(), *job.target, name);
      case FileNode::Kind::other:
        fail(EINVAL, *job.target, name);
    }
  }

  TreeSurvey::Directory* originalDirectory(const Job& job, const std::string& name) {
    auto* const entry = job.original ? job.original->find(name) : nullptr;
    return entry && entry->directory != TreeSurvey::None ? &(*original_)[entry->directory] : nullptr;
  }

  void note(const Job& job, TreeSurvey::Entry entry) {
    written_[job.written].entries.push_back(std::move(entry));
  }

  void noteFile(const Job& job, const std::string& name, int file) {
    struct stat status;
    if (::fstat(file, &status) != 0) fail(errno, *job.target, name);
    note(job, {name, S_IFREG, FileStamp(status)});
  }

  /// Lets the new document share a file that is as it was with the document it replaces.
  bool linkFile(const Job& job, TreeSurvey::Entry& entry) {
    auto& from = *job.source.directory()->onDisk;
    if (!isReplaced(from.rootDirectory()) || ::linkat(from.descriptor(), entry.name.c_str(),
                                                      job.target->descriptor(), entry.name.c_str(), 0) != 0) {
      return false;
    }
    // The name may have become another file's by then, and be the first one's inode again at the last look.
    struct stat linked;
    if (job.target->status(entry.name.c_str(), linked) != 0) fail(errno, *job.target, entry.name);
    if (FileStamp(linked) != entry.stamp) fail(ESTALE, *job.target, entry.name);
    entry.isShared = job.source.survey == original_;
    note(job, {entry.name, S_IFREG, entry.stamp});
    return true;
  }

  /// Whether the tree lies in the directory that is replaced, which goes away afterwards.
  bool isReplaced(DiskDirectory& root) {
    if (!replacement_.replacesDirectory()) return false;
    const auto [known, isNew] = replacedRoots_.try_emplace(&root, false);
    if (!isNew) return known->second;
    Descriptor directory(::openat(root.descriptor(), ".", DirectoryFlags));
    struct stat status, below{};
    while (directory && ::fstat(directory.get(), &status) == 0 && !isSameItem(status, below)) {
      if (isSameItem(status, *replacement_.replaced())) return known->second = true;
      below = status;
      directory = Descriptor(::openat(directory.get(), "..", DirectoryFlags));
    }
    return false;
  }

  void copyFile(const Job& job, const TreeSurvey::Entry& entry) {
    auto& from = *job.source.directory()->onDisk;
    const auto source = from.open(entry.name.c_str());
    struct stat status;
    if (!source || ::fstat(source.get(), &status) != 0) fail(errno, *job.target, entry.name);
    if (FileStamp(status) != entry.stamp) fail(ESTALE, *job.target, entry.name);
    const auto written = makeFile(job, entry.name, source.get());
    finishFile(job, entry.name, written.get(), copyBytes(source.get(), written.get()));
  }

  void writeFile(const Job& job, const std::string& name, FileNode& file) {
    if (file.isLoaded() && !file.isReference()) {
      const auto like = file.isOnDisk() ? openLike(file) : openOriginal(job, name);
      const auto written = makeFile(job, name, like.get());
      return finishFile(job, name, written.get(), writeAll(written.get(), file.contents()->view()));
    }
    struct stat status;
    const auto source = file.openOnDisk(status);
    if (!source) fail(errno, *job.target, name);
    if (!file.isReference() && file.stamp() && *file.stamp() != FileStamp(status))
      fail(ESTALE, *job.target, name);
    const auto written = makeFile(job, name, source.get());
    finishFile(job, name, written.get(), copyBytes(source.get(), written.get()));
  }

  /// The file on disk whose bytes are in memory; it may be gone by now.
  static Descriptor openLike(FileNode& file) {
    struct stat status;
    return file.openOnDisk(status);
  }

  /// Starts a file with the attributes of an open one, if that is one.
  Descriptor makeFile(const Job& job, const std::string& name, int like) const {
    Descriptor file(::openat(job.target->descriptor(), name.c_str(),
                             O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, like >= 0 ? 0600 : 0666));
    if (!file || (like >= 0 && copyAttributes(like, file.get()) != 0)) fail(errno, *job.target, name);
    return file;
  }

  void finishFile(const Job& job, const std::string& name, int file, int filled) {
    requireNotCancelled(replacement_.path());
    if (filled != 0 || flush(file) != 0) fail(errno, *job.target, name);
    noteFile(job, name, file);
  }

  /// The file whose attributes a new one takes over, if there is one that we may read.
  Descriptor openOriginal(const Job& job, const std::string& name) {
    const auto* entry = job.original ? job.original->find(name) : nullptr;
    if (!entry || entry->kind != S_IFREG) return Descriptor();
    auto original = job.original->onDisk->open(name.c_str());
    if (!original && errno != EACCES) fail(errno, *job.target, name);
    return original;
  }

  void copyLink(const Job& job, const std::string& name, DiskDirectory& from, const std::string& itsName) {
    std::string text(static_cast<std::size_t>(PATH_MAX), '\0');
    const auto length = ::readlinkat(from.descriptor(), itsName.c_str(), text.data(), text.size() - 1);
    if (length < 0) fail(errno, *job.target, name);
    text.resize(static_cast<std::size_t>(length));
    if (::symlinkat(text.c_str(), job.target->descriptor(), name.c_str()) != 0)
      fail(errno, *job.target, name);
    note(job, {name, S_IFLNK, {}});
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
  struct stat targetStatus_;
  std::vector<std::unique_ptr<TreeSurvey>> surveys_;
  TreeSurvey* original_ = nullptr;
  TreeSurvey written_;
  std::vector<Job> jobs_;
  std::set<const FileNode*> above_;
  std::vector<Finish> finishes_;
  std::map<const DiskDirectory*, bool> replacedRoots_;
  int flushes_ = 0;
};

void writeRegularFile(AtomicReplacement& replacement, FileNode& file) {
  struct stat status;
  const Descriptor source = file.isOnDisk() ? file.openOnDisk(status) : Descriptor();
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
  if (wasReplaced()) throwPosix(ESTALE, path, "The document was replaced after it had been opened.");
  if (kind == FileNode::Kind::regularFile) {
    writeRegularFile(replacement, *node_);
    replacement.commit();
    return;
  }
  const auto& source = node_->diskDirectory();
  struct stat status;
  const bool isInPlace = source && replacement.replacesDirectory() &&
                         ::fstat(source->descriptor(), &status) == 0 &&
                         isSameItem(status, *replacement.replaced());
  const auto target = replacement.makeDirectory(source || replacement.replacesDirectory() ? 0700 : 0777);
  TreeWriter writer(replacement, target);
  writer.write(node_);
  replacement.commit([&] { writer.requireUnchangedOriginal(); });
  // The tree that was read goes on in its own copy: the one it was opened in is gone.
  if (!isInPlace) return;
  if (Descriptor root(::fcntl(target->descriptor(), F_DUPFD_CLOEXEC, 0)); root)
    node_->adopt(writer.written(), std::move(root));
}

}  // namespace MarletFoundation
