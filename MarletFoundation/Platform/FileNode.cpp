#include "MarletFoundation/Platform/FileNode.h"

#include <dirent.h>

#include <vector>

namespace MarletFoundation {
namespace {

FileNode::Kind kindOf(mode_t mode) {
  if (S_ISDIR(mode)) return FileNode::Kind::directory;
  if (S_ISREG(mode)) return FileNode::Kind::regularFile;
  if (S_ISLNK(mode)) return FileNode::Kind::symbolicLink;
  return FileNode::Kind::other;
}

bool isAbsence(int error) { return error == ENOENT || error == ENOTDIR || error == ENAMETOOLONG; }

}  // namespace

FileNode::Stamp::Stamp(const struct stat& status)
    : device(status.st_dev), number(status.st_ino), size(status.st_size), changed(status.st_ctim) {}

bool FileNode::Stamp::operator==(const Stamp& other) const {
  return device == other.device && number == other.number && size == other.size &&
         changed.tv_sec == other.changed.tv_sec && changed.tv_nsec == other.changed.tv_nsec;
}

std::shared_ptr<FileNode> FileNode::inMemory(Data contents) {
  std::shared_ptr<FileNode> node(new FileNode);
  node->kind_ = Kind::regularFile;
  node->contents_.data = std::move(contents);
  node->contentsRead_ = true;
  return node;
}

std::shared_ptr<FileNode> FileNode::directoryInMemory() {
  std::shared_ptr<FileNode> node(new FileNode);
  node->kind_ = Kind::directory;
  node->listed_ = true;
  node->opened_ = true;
  return node;
}

std::shared_ptr<FileNode> FileNode::onDisk(std::shared_ptr<DiskDirectory> parent, std::string_view name) {
  std::shared_ptr<FileNode> node(new FileNode);
  node->parent_ = std::move(parent);
  node->diskName_ = name;
  return node;
}

std::shared_ptr<FileNode> FileNode::atPath(const std::string& path) {
  std::shared_ptr<FileNode> node(new FileNode);
  node->path_ = path;
  node->look();
  if (node->kind_ == Kind::unreadable) throwPosix(node->error_, path);
  if (node->kind_ == Kind::directory) {
    Descriptor root(retrying([&] { return ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC); }));
    if (!root) throwPosix(errno, path);
    node->directory_ = DiskDirectory::root(std::move(root));
    node->opened_ = true;
  } else if (node->kind_ == Kind::regularFile && !node->openOnDisk()) {
    throwPosix(errno, path);
  }
  return node;
}

FileNode::~FileNode() {
  // Level by level: a tree may be deeper than the stack.
  std::vector<Children> pending;
  if (!children_.empty()) pending.push_back(std::move(children_));
  while (!pending.empty()) {
    Children level = std::move(pending.back());
    pending.pop_back();
    for (auto& [name, node] : level) {
      if (node && node.use_count() == 1 && !node->children_.empty())
        pending.push_back(std::move(node->children_));
    }
  }
}

int FileNode::lookAgain(struct stat& status) {
  if (parent_) return parent_->status(diskName_.c_str(), status);
  return retrying([&] { return ::stat(path_.c_str(), &status); });
}

void FileNode::look() {
  struct stat status;
  if (lookAgain(status) == 0) {
    kind_ = kindOf(status.st_mode);
    stamp_ = Stamp(status);
  } else {
    kind_ = Kind::unreadable;
    error_ = errno;
  }
}

FileNode::Kind FileNode::kind() {
  if (kind_ == Kind::unknown) look();
  if (kind_ == Kind::directory && !directory_ && parent_)
    directory_ = DiskDirectory::child(parent_, diskName_);
  return kind_;
}

bool FileNode::hasChildren() {
  if (kind() != Kind::directory) return false;
  if (!opened_) opened_ = directory_->descriptor() >= 0;
  return *opened_;
}

std::shared_ptr<FileNode> FileNode::child(std::string_view name) {
  if (kind() != Kind::directory || !isFileName(name)) return nullptr;
  const auto found = children_.find(name);
  if (found != children_.end()) return found->second;
  if (listed_ || !hasChildren()) return nullptr;
  return children_.emplace(name, lookUp(name)).first->second;
}

std::shared_ptr<FileNode> FileNode::lookUp(std::string_view name) {
  auto node = onDisk(directory_, name);
  if (expectsDirectories_) {
    node->directory_ = DiskDirectory::openChild(directory_, node->diskName_);
    if (node->directory_) {
      node->kind_ = Kind::directory;
      node->opened_ = true;
      return node;
    }
    if (isAbsence(errno) && errno != ENOTDIR) return nullptr;
  }
  node->look();
  if (node->kind_ == Kind::unreadable && isAbsence(node->error_)) return nullptr;
  expectsDirectories_ = node->kind_ == Kind::directory;
  return node;
}

const FileNode::Children* FileNode::allChildren() {
  if (!hasChildren()) {
    errno = kind_ == Kind::directory ? EACCES : ENOTDIR;
    return nullptr;
  }
  if (listed_) return &children_;
  const auto entries = directory_->entries();
  if (!entries) return nullptr;
  for (const auto& [name, type] : *entries) {
    const auto [place, isNew] = children_.try_emplace(name);
    if (!isNew) continue;
    place->second = onDisk(directory_, name);
    if (type != DT_UNKNOWN) place->second->kind_ = kindOf(DTTOIF(type));
  }
  listed_ = true;
  return &children_;
}

void FileNode::setChild(std::string name, std::shared_ptr<FileNode> child) {
  children_.insert_or_assign(std::move(name), std::move(child));
}

void FileNode::removeChild(std::string_view name) {
  const auto found = children_.find(name);
  if (found != children_.end()) {
    found->second = nullptr;
  } else if (!listed_) {
    children_.emplace(name, nullptr);
  }
}

const FileContents& FileNode::contents() {
  if (contentsRead_) return contents_;
  contentsRead_ = true;
  struct stat status;
  // Without a stamp the name was only seen in a listing; whatever stands there now, no device is opened.
  const bool isListedOnly = stamp_.number == 0;
  if (isListedOnly && lookAgain(status) != 0) {
    contents_.error = errno;
    return contents_;
  }
  if (isListedOnly) stamp_ = Stamp(status);
  if (kind_ != Kind::regularFile || (isListedOnly && !S_ISREG(status.st_mode))) {
    contents_.error = EINVAL;
  } else if (auto file = openOnDisk(); !file) {
    contents_.error = errno;
  } else {
    contents_ = readToEnd(file.get(), stamp_.size);
    if (parent_) parent_->closeLater(std::move(file));
  }
  return contents_;
}

Descriptor FileNode::openOnDisk() {
  if (parent_) return parent_->openFile(diskName_.c_str());
  return Descriptor(retrying([&] { return ::open(path_.c_str(), ReadingFlags); }));
}

}  // namespace MarletFoundation
