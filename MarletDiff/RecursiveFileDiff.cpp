#include "MarletDiff/RecursiveFileDiff.h"

#include <dirent.h>
#include <limits.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <memory>
#include <span>
#include <string>

#include "MarletDiff/ContentDiff.h"
#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/DiskTree.h"
#include "MarletFoundation/Platform/PropertyListText.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletDiff {
namespace {

using namespace MarletFoundation;
using Directory = std::shared_ptr<DiskDirectory>;
using Entries = std::vector<DiskDirectory::Entry>;
using Result = std::vector<FileDiffDescriptor>;

/// Whether it is a text that a delta file can carry.
bool isDeltaText(std::string_view bytes) {
  return isValidUTF8(bytes) && PropertyListText::findInvalidXMLCharacter(bytes) == PropertyListText::npos;
}

/// One of the two trees.
class Side {
 public:
  explicit Side(const URL& url) : path_(systemPath(url)) {
    Descriptor opened(retrying([&] { return ::open(path_.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC); }));
    if (!opened) throwPosix(errno, path_);
    root_ = DiskDirectory::root(std::move(opened));
  }

  const Directory& root() const { return root_; }

  /// What lies in a directory, by name.
  Entries entries(DiskDirectory& directory) const {
    auto entries = directory.entries();
    if (!entries) fail(errno, directory.path());
    for (auto& entry : *entries) {
      if (entry.type == DT_UNKNOWN) entry.type = IFTODT(status(directory, entry.name).st_mode);
    }
    std::sort(entries->begin(), entries->end(), [](const auto& a, const auto& b) { return a.name < b.name; });
    return *std::move(entries);
  }

  struct stat status(DiskDirectory& directory, const std::string& name) const {
    struct stat status;
    if (directory.status(name.c_str(), status) != 0) fail(errno, directory.path() + name);
    return status;
  }

  /// An open regular file with its status.
  struct File {
    Descriptor descriptor;
    struct stat status;
  };
  File open(DiskDirectory& directory, const std::string& name) const {
    File file{directory.open(name.c_str()), {}};
    if (!file.descriptor || ::fstat(file.descriptor.get(), &file.status) != 0)
      fail(errno, directory.path() + name);
    if (!S_ISREG(file.status.st_mode)) fail(EINVAL, directory.path() + name);
    return file;
  }

  /// The file's bytes; nothing when there are more than are read into memory.
  std::optional<Data> contents(const File& file, DiskDirectory& directory, const std::string& name) const {
    auto [data, error] = readToEnd(file.descriptor.get(), file.status.st_size);
    if (error == EFBIG) return std::nullopt;
    if (error != 0) fail(error, directory.path() + name);
    return std::move(data);
  }

  std::string linkDestination(DiskDirectory& directory, const std::string& name) const {
    std::array<char, PATH_MAX> buffer;
    const int at = directory.descriptor();
    const auto length = at < 0 ? -1 : ::readlinkat(at, name.c_str(), buffer.data(), buffer.size());
    if (length < 0) fail(errno, directory.path() + name);
    return {buffer.data(), static_cast<std::size_t>(length)};
  }

  [[noreturn]] void fail(int error, const std::string& path) const { throwPosix(error, path_ + "/" + path); }

 private:
  std::string path_;
  Directory root_;
};

/// Reads up to the buffer's size, less only at the file's end. Negative and errno when it fails.
ssize_t readFully(int descriptor, std::span<char> buffer, off_t expected) {
  std::size_t size = 0;
  while (size < buffer.size()) {
    const auto count =
        retrying([&] { return ::read(descriptor, buffer.data() + size, buffer.size() - size); });
    if (count < 0) return -1;
    size += static_cast<std::size_t>(count);
    if (count == 0 || static_cast<off_t>(size) >= expected) break;
  }
  return static_cast<ssize_t>(size);
}

class TreeDiff {
 public:
  TreeDiff(const URL& original, const URL& updated, std::optional<DiffOptions> options)
      : original_(original), updated_(updated), options_(options) {}

  Result run() {
    compareDirectories(original_.root(), updated_.root());
    return std::move(result_);
  }

 private:
  void compareDirectories(const Directory& original, const Directory& updated) {
    const auto before = original_.entries(*original), after = updated_.entries(*updated);
    auto a = before.begin();
    auto b = after.begin();
    while (a != before.end() || b != after.end()) {
      const bool onlyOriginal = b == after.end() || (a != before.end() && a->name < b->name);
      const bool onlyUpdated = a == before.end() || (b != after.end() && b->name < a->name);
      if (onlyOriginal) {
        walk<FileDiffDescriptor::Removed>(original_, original, *a++);
      } else if (onlyUpdated) {
        walk<FileDiffDescriptor::Added>(updated_, updated, *b++);
      } else {
        compareEntries(original, *a++, updated, *b++);
      }
    }
  }

  void compareEntries(const Directory& original, const DiskDirectory::Entry& before, const Directory& updated,
                      const DiskDirectory::Entry& after) {
    const auto path = pathOf(original_, *original, before);
    checkKind(updated_, *updated, after);
    if ((before.type == DT_DIR) != (after.type == DT_DIR)) {
      walk<FileDiffDescriptor::Removed>(original_, original, before);
      walk<FileDiffDescriptor::Added>(updated_, updated, after);
    } else if (before.type == DT_DIR) {
      compareDirectories(DiskDirectory::child(original, SharedString(before.name)),
                         DiskDirectory::child(updated, SharedString(after.name)));
    } else if (before.type != after.type) {
      result_.push_back({FileDiffDescriptor::Replaced{path}});
    } else if (before.type == DT_REG) {
      compareFiles(*original, *updated, before.name, path);
    } else if (original_.linkDestination(*original, before.name) !=
               updated_.linkDestination(*updated, after.name)) {
      result_.push_back({FileDiffDescriptor::Replaced{path}});
    }
  }

  void compareFiles(DiskDirectory& original, DiskDirectory& updated, const std::string& name,
                    const std::string& path) {
    const auto before = original_.open(original, name), after = updated_.open(updated, name);
    if (before.status.st_dev == after.status.st_dev && before.status.st_ino == after.status.st_ino) return;
    if (before.status.st_size == after.status.st_size && haveEqualBytes(before, after, path)) return;
    const auto contents = original_.contents(before, original, name);
    const auto updatedContents = contents ? updated_.contents(after, updated, name) : std::nullopt;
    if (!updatedContents || !isDeltaText(contents->view()) || !isDeltaText(updatedContents->view())) {
      result_.push_back({FileDiffDescriptor::Replaced{path}});
    } else if (auto hunks = diffContent(contents->view(), updatedContents->view(), options_);
               !hunks.empty()) {
      result_.push_back({FileDiffDescriptor::Modified{path, std::move(hunks)}});
    }
  }

  /// Leaves both files at their start when they differ.
  bool haveEqualBytes(const Side::File& before, const Side::File& after, const std::string& path) {
    for (off_t at = 0;;) {
      const auto expected = before.status.st_size - at;
      const auto count = readFully(before.descriptor.get(), buffer_, expected);
      if (count < 0) original_.fail(errno, path);
      const auto otherCount = readFully(after.descriptor.get(), otherBuffer_, expected);
      if (otherCount < 0) updated_.fail(errno, path);
      if (count != otherCount ||
          !std::equal(buffer_.begin(), buffer_.begin() + count, otherBuffer_.begin())) {
        ::lseek(before.descriptor.get(), 0, SEEK_SET);
        ::lseek(after.descriptor.get(), 0, SEEK_SET);
        return false;
      }
      at += count;
      if (count == 0 || at >= before.status.st_size) return true;
    }
  }

  /// Adds a file, or all files of a directory, that only one side has.
  template <class Change>
  void walk(const Side& side, const Directory& directory, const DiskDirectory::Entry& entry) {
    auto path = pathOf(side, *directory, entry);
    if (entry.type != DT_DIR) {
      result_.push_back({Change{std::move(path)}});
      return;
    }
    const auto child = DiskDirectory::child(directory, SharedString(entry.name));
    for (const auto& inside : side.entries(*child)) walk<Change>(side, child, inside);
  }

  static void checkKind(const Side& side, DiskDirectory& directory, const DiskDirectory::Entry& entry) {
    if (entry.type != DT_DIR && entry.type != DT_REG && entry.type != DT_LNK)
      side.fail(EINVAL, directory.path() + entry.name);
  }

  /// The limit of a path's length bounds the depth of the walk, too.
  static std::string pathOf(const Side& side, DiskDirectory& directory, const DiskDirectory::Entry& entry) {
    checkKind(side, directory, entry);
    auto path = directory.path() + entry.name;
    if (path.size() >= PATH_MAX) side.fail(ENAMETOOLONG, path);
    return path;
  }

  Side original_;
  Side updated_;
  std::optional<DiffOptions> options_;
  Result result_;
  std::vector<char> buffer_ = std::vector<char>(std::size_t{1} << 16);
  std::vector<char> otherBuffer_ = std::vector<char>(std::size_t{1} << 16);
};

}  // namespace

Result recursiveFileDiff(const URL& originalUrl, const URL& updatedUrl, std::optional<DiffOptions> options) {
  return TreeDiff(originalUrl, updatedUrl, options).run();
}

}  // namespace MarletDiff
