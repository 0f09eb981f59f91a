#include "MarletFoundation/Platform/FileNode.h"

#include <dirent.h>

#include <vector>

#include "MarletFoundation/Platform/AtomicReplacement.h"

namespace MarletFoundation {
namespace {

FileNode::Kind kindOf(mode_t mode) {
  if (S_ISDIR(mode)) return FileNode::Kind::directory;
  if (S_ISREG(mode)) return FileNode::Kind::regularFile;
  if (S_ISLNK(mode)) return FileNode::Kind::symbolicLink;
  return FileNode::Kind::other;
}

/// Whether a look by name failed since nothing of that name can be there.
bool isAbsence(int error) { return error == ENOENT || error == ENAMETOOLONG; }

}  // namespace

FileNode::Stamp::Stamp(const struct stat& status)
    : number(status.st_ino), size(status.st_size), changed(status.st_ctim) {}

bool FileNode::Stamp::operator==(const Stamp& other) const {
  return number == other.number && size == other.size && changed.tv_sec == other.changed.tv_sec &&
         changed.tv_nsec == other.changed.tv_nsec;
}

std::shared_ptr<FileNode> FileNode::inMemory(Data contents) {
  auto node = std::make_shared<FileNode>(Key());
  node->kind_ = Kind::regularFile;
  node->contents_ = std::move(contents);
  node->contentsWereRead_ = true;
  return node;
}

std::shared_ptr<FileNode> FileNode::directoryInMemory() {
  auto node = std::make_shared<FileNode>(Key());
  node->becomeDirectory(nullptr, true);
  node->directory_->isListed = true;
  return node;
}

std::shared_ptr<FileNode> FileNode::onDisk(std::shared_ptr<DiskDirectory> parent, std::string_view name) {
  auto node = std::make_shared<FileNode>(Key());
  node->parent_ = std::move(parent);
  node->diskName_ = name;
  return node;
}

std::shared_ptr<FileNode> FileNode::atPath(const std::string& path) {
  auto node = onDisk(nullptr, path);
  node->lookByName();
  if (node->kind_ == Kind::unreadable) {
    const auto displaced = node->error_ == ENOENT ? AtomicReplacement::displacedPath(path) : std::nullopt;
    if (!displaced) throwPosix(node->error_, path);
    node = onDisk(nullptr, *displaced);
    node->lookByName();
  }
  if (node->kind_ == Kind::directory) {
    Descriptor root(retrying([&] { return ::open(node->diskName_.c_str(), DirectoryFlags & ~O_NOFOLLOW); }));
    if (!root) throwPosix(errno, path);
    node->becomeDirectory(DiskDirectory::root(std::move(root)), true);
  } else if (node->kind_ == Kind::regularFile && !node->openOnDisk()) {
    throwPosix(errno, path);
  }
  return node;
}

FileNode::~FileNode() {
  if (descriptor_ >= 0) parent_->forget(descriptor_);
  if (!directory_) return;
  // Level by level: a tree may be deeper than the stack.
  std::vector<std::unique_ptr<Directory>> pending;
  pending.push_back(std::move(directory_));
  while (!pending.empty()) {
    const auto directory = std::move(pending.back());
    pending.pop_back();
    for (const auto& [name, node] : directory->children) {
      if (node && node->directory_ && node.use_count() == 1) pending.push_back(std::move(node->directory_));
    }
  }
}

std::optional<std::string> FileNode::preferredName() const {
  if (preferredName_) return *preferredName_;
  if (directory_ && directory_->onDisk && !directory_->onDisk->name().empty())
    return directory_->onDisk->name();
  return parent_ ? std::optional(diskName_) : std::nullopt;
}

void FileNode::setPreferredName(std::string name) {
  preferredName_ = std::make_unique<std::string>(std::move(name));
}

int FileNode::lookAgain(struct stat& status) {
  if (parent_) return parent_->status(diskName_.c_str(), status);
  return retrying([&] { return ::stat(diskName_.c_str(), &status); });
}

/// Looks at an item by opening it, since a look at what is open costs half as much as one by name, and most
/// files are read next. A device is opened by this too, but never read.
void FileNode::look() {
  auto opened = parent_->open(diskName_.c_str());
  struct stat status;
  if (!opened || ::fstat(opened.get(), &status) != 0) {
    if (!isAbsence(errno)) return lookByName();
    error_ = errno;
    return;
  }
  kind_ = kindOf(status.st_mode);
  if (kind_ == Kind::regularFile) {
    stamp_ = Stamp(status);
    parent_->keep(std::move(opened), descriptor_);
  } else if (kind_ == Kind::directory) {
    becomeDirectory(DiskDirectory::child(parent_, diskName_, std::move(opened)), true);
  }
}

void FileNode::lookByName() {
  struct stat status;
  if (lookAgain(status) == 0) {
    kind_ = kindOf(status.st_mode);
  } else {
    kind_ = Kind::unreadable;
    error_ = errno;
  }
}

void FileNode::becomeDirectory(std::shared_ptr<DiskDirectory> onDisk, std::optional<bool> wasOpened) {
  kind_ = Kind::directory;
  directory_ = std::make_unique<Directory>();
  directory_->onDisk = std::move(onDisk);
  directory_->wasOpened = wasOpened;
}

FileNode::Kind FileNode::kind() {
  if (kind_ == Kind::directory && !directory_) {
    becomeDirectory(DiskDirectory::child(parent_, diskName_), std::nullopt);
  }
  return kind_;
}

const std::shared_ptr<DiskDirectory>& FileNode::diskDirectory() const {
  static const std::shared_ptr<DiskDirectory> none;
  return directory_ ? directory_->onDisk : none;
}

bool FileNode::hasChildren() {
  if (kind() != Kind::directory) return false;
  if (!directory_->wasOpened) directory_->wasOpened = directory_->onDisk->descriptor() >= 0;
  return *directory_->wasOpened;
}

std::shared_ptr<FileNode> FileNode::child(std::string_view name) {
  if (kind() != Kind::directory || !isFileName(name)) return nullptr;
  const auto found = directory_->children.lower_bound(name);
  if (found != directory_->children.end() && found->first == name) return found->second;
  if (directory_->isListed || !hasChildren()) return nullptr;
  return directory_->children.emplace_hint(found, name, lookUp(name))->second;
}

/// Finds a directory by opening in it what its brother was first asked for: the file proves the directory, and is
/// likely to be asked for next. Null when that isn't there, which tells nothing.
std::shared_ptr<FileNode> FileNode::lookUpByContent(std::string_view name) {
  const auto& expected = directory_->onDisk->nameInDirectories;
  if (expected.empty()) return nullptr;
  auto directory = DiskDirectory::child(directory_->onDisk, std::string(name));
  auto content = onDisk(directory, expected);
  content->look();
  if (content->kind_ == Kind::unreadable) return nullptr;
  auto node = std::make_shared<FileNode>(Key());
  node->becomeDirectory(std::move(directory), true);
  node->directory_->children.emplace(expected, std::move(content));
  return node;
}

std::shared_ptr<FileNode> FileNode::lookUp(std::string_view name) {
  const auto& onDiskDirectory = directory_->onDisk;
  if (directory_->children.empty() && onDiskDirectory->parent()) {
    onDiskDirectory->parent()->nameInDirectories = name;
  }
  if (directory_->expectsDirectories) {
    if (auto node = lookUpByContent(name)) return node;
    std::string text(name);
    if (auto opened = onDiskDirectory->open(text.c_str(), DirectoryFlags)) {
      auto node = std::make_shared<FileNode>(Key());
      node->becomeDirectory(DiskDirectory::child(onDiskDirectory, std::move(text), std::move(opened)), true);
      return node;
    }
    if (isAbsence(errno)) return nullptr;
  }
  auto node = onDisk(onDiskDirectory, name);
  node->look();
  if (node->kind_ == Kind::unreadable && isAbsence(node->error_)) return nullptr;
  directory_->expectsDirectories = node->kind_ == Kind::directory;
  return node;
}

const FileNode::Children* FileNode::allChildren() {
  if (!hasChildren()) {
    errno = kind_ == Kind::directory ? EACCES : ENOTDIR;
    return nullptr;
  }
  auto& [onDiskDirectory, children, isListed, wasOpened, expectsDirectories] = *directory_;
  if (isListed) return &children;
  const auto entries = onDiskDirectory->entries();
  if (!entries) return nullptr;
  for (const auto& [name, type] : *entries) {
    const auto [place, isNew] = children.try_emplace(name);
    if (!isNew) continue;
    place->second = onDisk(onDiskDirectory, name);
    if (type == DT_UNKNOWN) {
      place->second->lookByName();
    } else {
      place->second->kind_ = kindOf(DTTOIF(type));
    }
  }
  isListed = true;
  return &children;
}

void FileNode::setChild(std::string name, std::shared_ptr<FileNode> child) {
  directory_->children.insert_or_assign(std::move(name), std::move(child));
}

void FileNode::removeChild(std::string_view name) {
  if (kind() == Kind::directory) directory_->children.insert_or_assign(std::string(name), nullptr);
}

std::optional<Data> FileNode::contents() {
  if (kind() != Kind::regularFile) return std::nullopt;
  if (!contentsWereRead_) readContents();
  return isLoaded() ? std::optional(contents_) : std::nullopt;
}

void FileNode::readContents() {
  contentsWereRead_ = true;
  Descriptor opened;
  if (descriptor_ < 0) {
    struct stat status;
    opened = openRegularFile(status);
    if (!opened) {
      error_ = errno;
      return;
    }
    stamp_ = Stamp(status);
  }
  auto read = readToEnd(opened ? opened.get() : descriptor_, stamp_.size);
  contents_ = std::move(read.data);
  error_ = read.error;
}

Descriptor FileNode::openRegularFile(struct stat& status) {
  Descriptor file = parent_ ? parent_->open(diskName_.c_str())
                            : Descriptor(retrying([&] { return ::open(diskName_.c_str(), ReadingFlags); }));
  if (!file || ::fstat(file.get(), &status) != 0) return Descriptor();
  if (S_ISREG(status.st_mode)) return file;
  errno = EINVAL;
  return Descriptor();
}

Descriptor FileNode::openOnDisk() {
  struct stat status;
  return openRegularFile(status);
}

}  // namespace MarletFoundation
