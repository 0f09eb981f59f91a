#include "MarletFoundation/Platform/FileWrapper.h"

#include <cerrno>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileNode.h"
#include "MarletFoundation/Platform/RelativePath.h"

namespace MarletFoundation {

FileWrapper::FileWrapper(const URL& url) : node_(FileNode::atPath(systemPath(url))) {
  node_->setPreferredName(url.lastPathComponent());
}

FileWrapper FileWrapper::reference(const URL& url) {
  FileWrapper wrapper(FileNode::referenceTo(systemPath(url)));
  wrapper.setPreferredFilename(url.lastPathComponent());
  return wrapper;
}

FileWrapper FileWrapper::regularFile(Data contents) {
  return FileWrapper(FileNode::inMemory(std::move(contents)));
}

FileWrapper FileWrapper::directory(Children children) {
  auto node = FileNode::directoryInMemory();
  for (auto& [name, child] : children) {
    if (!child.preferredFilename()) child.setPreferredFilename(name);
    node->setChild(name, child.node_);
  }
  return FileWrapper(std::move(node));
}

bool FileWrapper::isDirectory() const { return node_->kind() == FileNode::Kind::directory; }

bool FileWrapper::isRegularFile() const { return node_->kind() == FileNode::Kind::regularFile; }

std::optional<Data> FileWrapper::regularFileContents() const { return node_->contents(); }

bool FileWrapper::hasChildren() const { return node_->hasChildren(); }

std::optional<FileWrapper> FileWrapper::child(std::string_view name) const {
  auto child = node_->child(name);
  if (!child || child->kind() == FileNode::Kind::unreadable) return std::nullopt;
  return FileWrapper(std::move(child));
}

std::optional<FileWrapper::Children> FileWrapper::fileWrappers() const {
  const auto* children = node_->allChildren();
  if (!children) return std::nullopt;
  Children wrappers;
  for (const auto& [name, child] : *children) {
    if (child && child->kind() != FileNode::Kind::unreadable)
      wrappers.emplace(name.view(), FileWrapper(child));
  }
  return wrappers;
}

void FileWrapper::requireReadable(std::string_view path) const {
  const auto names = relativePathComponents(path);
  if (!names) return;
  const auto requireChildren = [&](FileNode& node) {
    if (node.kind() == FileNode::Kind::directory && !node.hasChildren())
      throw ErrorObject::posix(EACCES, std::string(path));
  };
  auto node = node_;
  for (const auto name : *names) {
    requireChildren(*node);
    node = node->child(name);
    if (!node) return;
    if (node->kind() == FileNode::Kind::unreadable)
      throw ErrorObject::posix(node->error(), std::string(path));
  }
  requireChildren(*node);
  if (node->kind() == FileNode::Kind::regularFile && !node->contents())
    throw ErrorObject::posix(node->error(), std::string(path));
}

bool FileWrapper::wasReplaced() const { return node_->wasReplaced(); }

bool FileWrapper::isUnchanged() const { return !wasReplaced() && node_->isUnchanged(); }

std::optional<std::string> FileWrapper::preferredFilename() const { return node_->preferredName(); }

void FileWrapper::setPreferredFilename(std::string name) { node_->setPreferredName(std::move(name)); }

void FileWrapper::addFileWrapper(FileWrapper child) {
  if (!isDirectory()) fatalError("A file wrapper that isn't a directory takes no children.");
  auto name = child.preferredFilename();
  if (!name) fatalError("A file wrapper needs a preferred file name to be added to a directory.");
  node_->setChild(*name, std::move(child.node_));
}

void FileWrapper::removeFileWrapper(std::string_view name) { node_->removeChild(name); }

}  // namespace MarletFoundation
