#include "MarletFoundation/Platform/FileNode.h"

#include <dirent.h>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/SharedRelease.h"

namespace MarletFoundation {
namespace {

/// Whether a look by name failed since nothing of that name can be there.
bool isAbsence(int error) { return error == ENOENT || error == ENAMETOOLONG; }

}  // namespace

FileNode::Kind FileNode::kindOf(mode_t mode) {
  if (S_ISDIR(mode)) return Kind::directory;
  if (S_ISREG(mode)) return Kind::regularFile;
  if (S_ISLNK(mode)) return Kind::symbolicLink;
  return Kind::other;
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
    Descriptor root(
        walkingAgain([&] { return ::open(node->diskName_.c_str(), DirectoryFlags & ~O_NOFOLLOW); }));
    if (!root) throwPosix(errno, path);
    node->becomeDirectory(DiskDirectory::root(std::move(root)), true);
    node->diskName_ = SharedString(path);
  } else if (struct stat status; node->kind_ == Kind::regularFile && !node->openOnDisk(status)) {
    throwPosix(errno, path);
  }
  return node;
}

std::shared_ptr<FileNode> FileNode::referenceTo(const std::string& path) {
  std::shared_ptr<FileNode> node;
  try {
    node = atPath(path);
  } catch (const ErrorObject& error) {
    node = onDisk(nullptr, SharedString(path));
    node->error_ = static_cast<int>(error.code());
  }
  node->isReference_ = true;
  return node;
}

std::shared_ptr<FileNode> FileNode::found(std::shared_ptr<DiskDirectory> parent, SharedString name, Kind kind,
                                          const FileStamp& stamp) {
  auto node = onDisk(std::move(parent), std::move(name));
  node->kind_ = kind;
  if (kind == Kind::regularFile) node->facts_.emplace<File>().stamp = stamp;
  return node;
}

FileNode::~FileNode() {
  if (file() && file()->descriptor >= 0) parent_->forget(file()->descriptor);
  auto* const directory = std::get_if<Directory>(&facts_);
  for (auto* const list :
       {directory ? &directory->children : nullptr, directory ? directory->replaced.get() : nullptr}) {
    if (!list) continue;
    // A tree may be deeper than the stack.
    for (auto& [name, node] : *list) releaseWithoutStack(std::move(node));
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
  return walkingAgain([&] { return ::stat(diskName_.c_str(), &status); });
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
    file.stamp = FileStamp(status);
    parent_->keep(std::move(opened), file.descriptor);
  } else if (kind_ == Kind::directory) {
    becomeDirectory(DiskDirectory::child(parent_, diskName_, std::move(opened), status.st_ino), true);
  }
}

void FileNode::lookByName() {
  struct stat status;
  if (lookAgain(status) == 0) {
    kind_ = kindOf(status.st_mode);
    if (kind_ == Kind::regularFile) facts_.emplace<File>().stamp = FileStamp(status);
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
  auto& own = directory();
  if (!own.wasOpened) own.wasOpened = own.onDisk->descriptor() >= 0;
  return *own.wasOpened;
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

/// Finds a directory by opening in it what its sibling was first asked for: the file proves the directory, and is
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
      struct stat status;
      const auto number = ::fstat(opened.get(), &status) == 0 ? status.st_ino : 0;
      auto node = make(own.onDisk.get());
      node->becomeDirectory(DiskDirectory::child(own.onDisk, name, std::move(opened), number), true);
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
  auto& own = directory();
  if (own.isListed) return &own.children;
  const auto entries = own.onDisk->entries();
  if (!entries) return nullptr;
  for (const auto& entry : *entries) {
    const auto place = own.children.lower_bound(entry.name);
    if (place != own.children.end() && place->first.view() == entry.name) continue;
    const SharedString name(entry.name);
    auto node = onDisk(own.onDisk, name);
    if (entry.type == DT_UNKNOWN) {
      node->lookByName();
    } else {
      node->kind_ = kindOf(DTTOIF(entry.type));
    }
    own.children.emplace_hint(place, name, std::move(node));
  }
  own.isListed = true;
  return &own.children;
}

void FileNode::setChild(std::string_view name, std::shared_ptr<FileNode> child) {
  auto& own = directory();
  if (child && own.onDisk) {
    const auto known = own.children.find(name);
    if (known != own.children.end() && known->second == child) return;
  }
  if (own.onDisk) keepReplaced(name);
  own.children.insert_or_assign(SharedString(name), std::move(child));
}

/// Keeps what the disk has under a name whose child is about to change, looking at it now if nobody did before.
void FileNode::keepReplaced(std::string_view name) {
  auto& own = directory();
  if (!own.replaced) own.replaced = std::make_unique<Children>(own.onDisk->memory());
  if (own.replaced->contains(name) || !isFileName(name)) return;
  std::shared_ptr<FileNode> node;
  if (const auto known = own.children.find(name); known != own.children.end()) {
    node = known->second;
    if (node && node->kind_ == Kind::regularFile && !node->file()) node->lookByName();
  } else if (!own.isListed) {
    node = onDisk(own.onDisk, SharedString(name));
    node->lookByName();
    if (node->kind_ == Kind::unreadable && isAbsence(node->error_)) node = nullptr;
  }
  own.replaced->emplace(SharedString(name), std::move(node));
}

bool FileNode::isChanged(std::string_view name) const {
  const auto& own = *std::get_if<Directory>(&facts_);
  return !own.onDisk || (own.replaced && own.replaced->contains(name));
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
    opened = openOnDisk(status);
    const int error = errno;
    auto& known = facts_.emplace<File>();
    known.wasRead = true;
    if (!opened) {
      error_ = error;
      return;
    }
    known.stamp = FileStamp(status);
  }
  auto& known = *std::get_if<File>(&facts_);
  auto read = readToEnd(opened ? opened.get() : known.descriptor, known.stamp.size);
  known.wasRead = true;
  known.contents = std::move(read.data);
  error_ = read.error;
}

Descriptor FileNode::openOnDisk(struct stat& status) {
  Descriptor file = parent_
                        ? parent_->open(diskName_.c_str())
                        : Descriptor(walkingAgain([&] { return ::open(diskName_.c_str(), ReadingFlags); }));
  if (!file || ::fstat(file.get(), &status) != 0) return Descriptor();
  if (S_ISREG(status.st_mode)) return file;
  errno = EINVAL;
  return Descriptor();
}

}  // namespace MarletFoundation
