#include "MarletFoundation/Platform/FileNode.h"

#include <dirent.h>

#include <new>
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

FileNode::Directory::Directory(std::shared_ptr<DiskDirectory> directory)
    : onDisk(std::move(directory)), children(onDisk ? onDisk->memory() : nullptr) {}

std::shared_ptr<FileNode> FileNode::make(DiskDirectory* tree) {
  if (!tree) return std::make_shared<FileNode>(Key());
  return std::allocate_shared<FileNode>(TreeAllocator<FileNode>(tree->memory()), Key());
}

std::shared_ptr<FileNode> FileNode::inMemory(Data contents) {
  auto node = make(nullptr);
  node->kind_ = Kind::regularFile;
  node->facts_ = File{{}, -1, true, std::move(contents)};
  return node;
}

std::shared_ptr<FileNode> FileNode::directoryInMemory() {
  auto node = make(nullptr);
  node->becomeDirectory(nullptr, true);
  node->directory().isListed = true;
  return node;
}

std::shared_ptr<FileNode> FileNode::onDisk(std::shared_ptr<DiskDirectory> parent, SharedString name) {
  auto node = make(parent.get());
  node->parent_ = std::move(parent);
  node->diskName_ = std::move(name);
  return node;
}

std::shared_ptr<FileNode> FileNode::atPath(const std::string& path) {
  auto node = onDisk(nullptr, SharedString(path));
  node->lookByName();
  if (node->kind_ == Kind::unreadable) {
    const auto displaced = node->error_ == ENOENT ? AtomicReplacement::displacedPath(path) : std::nullopt;
    if (!displaced) throwPosix(node->error_, path);
    node = onDisk(nullptr, SharedString(*displaced));
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
  if (file() && file()->descriptor >= 0) parent_->forget(file()->descriptor);
  auto* const directory = std::get_if<Directory>(&facts_);
  if (!directory || directory->children.empty()) return;
  // Level by level: a tree may be deeper than the stack.
  try {
    std::vector<Children> pending;
    pending.push_back(std::move(directory->children));
    while (!pending.empty()) {
      const auto children = std::move(pending.back());
      pending.pop_back();
      for (const auto& [name, node] : children) {
        if (!node || node.use_count() > 1) continue;
        auto* const below = std::get_if<Directory>(&node->facts_);
        if (below && !below->children.empty()) pending.push_back(std::move(below->children));
      }
    }
  } catch (const std::bad_alloc&) {
    // What wasn't moved goes with its node, on the stack.
  }
}

std::optional<std::string> FileNode::preferredName() const {
  if (preferredName_) return *preferredName_;
  if (const auto& directory = diskDirectory(); directory && !directory->name().empty())
    return std::string(directory->name());
  return parent_ ? std::optional(std::string(diskName_)) : std::nullopt;
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
    auto& file = facts_.emplace<File>();
    file.stamp = Stamp(status);
    parent_->keep(std::move(opened), file.descriptor);
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
  facts_.emplace<Directory>(std::move(onDisk)).wasOpened = wasOpened;
}

FileNode::Kind FileNode::kind() {
  if (kind_ == Kind::directory && !std::holds_alternative<Directory>(facts_)) {
    becomeDirectory(DiskDirectory::child(parent_, diskName_), std::nullopt);
  }
  return kind_;
}

const std::shared_ptr<DiskDirectory>& FileNode::diskDirectory() const {
  static const std::shared_ptr<DiskDirectory> none;
  const auto* directory = std::get_if<Directory>(&facts_);
  return directory ? directory->onDisk : none;
}

bool FileNode::hasChildren() {
  if (kind() != Kind::directory) return false;
  auto& [onDisk, children, isListed, wasOpened, expectsDirectories] = directory();
  if (!wasOpened) wasOpened = onDisk->descriptor() >= 0;
  return *wasOpened;
}

std::shared_ptr<FileNode> FileNode::child(std::string_view name) {
  if (kind() != Kind::directory || !isFileName(name)) return nullptr;
  auto& children = directory().children;
  const auto found = children.lower_bound(name);
  if (found != children.end() && found->first.view() == name) return found->second;
  if (directory().isListed || !hasChildren()) return nullptr;
  auto shared = directory().onDisk->sharedName(name);
  auto child = lookUp(shared);
  return children.emplace_hint(found, std::move(shared), std::move(child))->second;
}

/// Finds a directory by opening in it what its brother was first asked for: the file proves the directory, and is
/// likely to be asked for next. Null when that isn't there, which tells nothing.
std::shared_ptr<FileNode> FileNode::lookUpByContent(const SharedString& name) {
  const auto& expected = directory().onDisk->expectedName();
  if (expected.empty()) return nullptr;
  auto below = DiskDirectory::child(directory().onDisk, name);
  auto content = onDisk(below, expected);
  content->look();
  if (content->kind_ == Kind::unreadable) return nullptr;
  auto node = make(below.get());
  node->becomeDirectory(std::move(below), true);
  node->directory().children.emplace(expected, std::move(content));
  return node;
}

std::shared_ptr<FileNode> FileNode::lookUp(const SharedString& name) {
  auto& own = directory();
  if (own.expectsDirectories) {
    if (auto node = lookUpByContent(name)) return node;
    if (auto opened = own.onDisk->open(name.c_str(), DirectoryFlags)) {
      auto node = make(own.onDisk.get());
      node->becomeDirectory(DiskDirectory::child(own.onDisk, name, std::move(opened)), true);
      return node;
    }
    if (isAbsence(errno)) return nullptr;
  }
  auto node = onDisk(own.onDisk, name);
  node->look();
  if (node->kind_ == Kind::unreadable && isAbsence(node->error_)) return nullptr;
  own.expectsDirectories = node->kind_ == Kind::directory;
  return node;
}

const FileNode::Children* FileNode::allChildren() {
  if (!hasChildren()) {
    errno = kind_ == Kind::directory ? EACCES : ENOTDIR;
    return nullptr;
  }
  auto& [onDiskDirectory, children, isListed, wasOpened, expectsDirectories] = directory();
  if (isListed) return &children;
  const auto entries = onDiskDirectory->entries();
  if (!entries) return nullptr;
  for (const auto& [entryName, type] : *entries) {
    const auto place = children.lower_bound(entryName);
    if (place != children.end() && place->first.view() == entryName) continue;
    const SharedString name(entryName);
    auto node = onDisk(onDiskDirectory, name);
    if (type == DT_UNKNOWN) {
      node->lookByName();
    } else {
      node->kind_ = kindOf(DTTOIF(type));
    }
    children.emplace_hint(place, name, std::move(node));
  }
  isListed = true;
  return &children;
}

void FileNode::setChild(std::string_view name, std::shared_ptr<FileNode> child) {
  directory().children.insert_or_assign(SharedString(name), std::move(child));
}

void FileNode::removeChild(std::string_view name) {
  if (kind() == Kind::directory) setChild(name, nullptr);
}

std::optional<Data> FileNode::contents() {
  if (kind() != Kind::regularFile) return std::nullopt;
  if (!file() || !file()->wasRead) readContents();
  return isLoaded() ? std::optional(file()->contents) : std::nullopt;
}

void FileNode::readContents() {
  Descriptor opened;
  if (!file() || file()->descriptor < 0) {
    struct stat status;
    opened = openRegularFile(status);
    const int error = errno;
    auto& known = facts_.emplace<File>();
    known.wasRead = true;
    if (!opened) {
      error_ = error;
      return;
    }
    known.stamp = Stamp(status);
  }
  auto& known = *std::get_if<File>(&facts_);
  auto read = readToEnd(opened ? opened.get() : known.descriptor, known.stamp.size);
  known.wasRead = true;
  known.contents = std::move(read.data);
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
