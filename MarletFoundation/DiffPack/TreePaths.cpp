#include "MarletFoundation/DiffPack/TreePaths.h"

#include <cerrno>
#include <span>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {
namespace {

std::span<const std::string_view> directoryPart(const PathNames& path) {
  return std::span(path).first(path.empty() ? 0 : path.size() - 1);
}

}  // namespace

void addDescendant(FileWrapper root, const PathNames& path, FileWrapper file) {
  for (const auto name : directoryPart(path)) {
    auto next = root.child(name);
    if (!next || !next->hasChildren()) {
      if (next && next->isDirectory()) throw ErrorObject::posix(EACCES, name);
      next = FileWrapper::directory();
      next->setPreferredFilename(std::string(name));
      root.addFileWrapper(*next);
    }
    root = *next;
  }
  if (!path.empty()) {
    root.removeFileWrapper(path.back());
    if (!file.preferredFilename()) file.setPreferredFilename(std::string(path.back()));
  }
  root.addFileWrapper(std::move(file));
}

void removeDescendant(FileWrapper root, const PathNames& path) {
  for (const auto name : directoryPart(path)) {
    const auto next = root.child(name);
    if (!next) return;
    root = *next;
  }
  if (!path.empty()) root.removeFileWrapper(path.back());
}

}  // namespace MarletFoundation
