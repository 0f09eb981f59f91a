#include "MarletFoundation/Platform/RelativePath.h"

#include <limits.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <string>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

/// Opens all of a path in one call of the system, which follows no link on the way.
Descriptor openWithoutLinks(const Descriptor& directory, const std::string& path) {
  open_how how{};
  how.flags = ReadingFlags;
  how.resolve = RESOLVE_NO_SYMLINKS | RESOLVE_BENEATH;
  return Descriptor(static_cast<int>(
      retrying([&] { return ::syscall(SYS_openat2, directory.get(), path.c_str(), &how, sizeof how); })));
}

/// The same by way of a tree, name by name, where the system has no such call or a sandbox forbids it.
Data readThroughTree(const URL& directory, std::string_view path) {
  const auto file = descendant(FileWrapper(directory), path);
  const auto contents = file ? file->regularFileContents() : std::nullopt;
  if (!contents) throwPosix(ENOENT, directory.appendingPathComponent(path).path());
  return *contents;
}

}  // namespace

std::optional<std::vector<std::string_view>> relativePathComponents(std::string_view path) {
  if (path.empty() || path.front() == '/' || path.size() >= PATH_MAX ||
      path.find('\0') != std::string_view::npos) {
    return std::nullopt;
  }
  auto components = split(path, '/');
  std::erase(components, "");
  for (const auto component : components) {
    if (component == "." || component == "..") return std::nullopt;
  }
  return components;
}

std::optional<FileWrapper> descendant(const FileWrapper& root, std::string_view path) {
  const auto components = relativePathComponents(path);
  if (!components) return std::nullopt;
  std::optional<FileWrapper> node = root;
  for (const auto component : *components) {
    node = node->child(component);
    if (!node) return std::nullopt;
  }
  return node;
}

Data readDescendant(const URL& directory, std::string_view path) {
  const auto fail = [&](int error) { throwPosix(error, directory.appendingPathComponent(path).path()); };
  if (!relativePathComponents(path)) fail(EINVAL);
  const Descriptor parent(
      walkingAgain([&] { return ::open(systemPath(directory).c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC); }));
  if (!parent) fail(errno);
  const auto file = openWithoutLinks(parent, std::string(path));
  if (!file) {
    if (errno == ENOSYS || errno == EPERM) return readThroughTree(directory, path);
    fail(errno);
  }
  auto contents = readToEnd(file.get(), std::nullopt);
  if (contents.error != 0) fail(contents.error);
  return std::move(contents.data);
}

}  // namespace MarletFoundation
