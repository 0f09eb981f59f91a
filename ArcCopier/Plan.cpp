#include "ArcCopier/Plan.h"

#include <sys/stat.h>

#include <cerrno>
#include <string_view>
#include <unordered_map>

#include "ArcCopier/EntryReader.h"

namespace ArcCopierImplementation {
namespace {

constexpr std::uint16_t UTF8Flag = 1u << 11;

/// Who has which path of the destination.
class Places {
 public:
  Problem take(std::string_view path, bool isDirectory) {
    const auto known = nearestKnown(path);
    if (known != kinds_.end() && known->second == Kind::file)
      return {ENOTDIR, "it lies below what is a file"};
    auto slash = path.find('/', known == kinds_.end() ? 0 : known->first.size() + 1);
    for (; slash != std::string_view::npos; slash = path.find('/', slash + 1))
      kinds_.emplace(path.substr(0, slash), Kind::neededDirectory);
    const auto kind = isDirectory ? Kind::directory : Kind::file;
    const auto [place, isNew] = kinds_.try_emplace(path, kind);
    if (isNew) return {};
    if (place->second == Kind::neededDirectory && isDirectory) {
      place->second = kind;
      return {};
    }
    if (place->second == Kind::neededDirectory) return {EISDIR, "it is a file where there is a directory"};
    return {EEXIST, "its name was there before"};
  }

  std::size_t count() const { return kinds_.size(); }

 private:
  enum class Kind { file, directory, neededDirectory };
  using Kinds = std::unordered_map<std::string_view, Kind>;

  /// The nearest place above a path that somebody has.
  Kinds::iterator nearestKnown(std::string_view path) {
    while (true) {
      const auto slash = path.rfind('/');
      if (slash == std::string_view::npos) return kinds_.end();
      path = path.substr(0, slash);
      if (const auto known = kinds_.find(path); known != kinds_.end()) return known;
    }
  }

  Kinds kinds_;
};

Problem problemOfType(const ZipEntry& entry, bool isDirectory) {
  switch (entry.mode & S_IFMT) {
    case 0:
    case S_IFREG:
    case S_IFDIR:
      break;
    case S_IFLNK:
      return {EINVAL, "it is a symbolic link"};
    default:
      return {EINVAL, "it is a device or another special file"};
  }
  if (isDirectory && entry.size != 0) return {EINVAL, "it is a directory with contents"};
  return {};
}

}  // namespace

std::vector<PlannedItem> plan(const ZipDirectory& directory, std::uint64_t entryLimit) {
  std::vector<PlannedItem> items;
  items.reserve(directory.entries().size());  // the places refer to the paths
  Places places;
  for (const auto& entry : directory.entries()) {
    items.push_back({&entry, entryPath(entry.name, (entry.flags & UTF8Flag) != 0)});
    auto& path = items.back().path;
    path.isDirectory = path.isDirectory || S_ISDIR(entry.mode);
    if (!path.problem) path.problem = problemOfType(entry, path.isDirectory);
    if (!path.problem) path.problem = EntryReader::problem(entry);
    if (!path.problem) path.problem = places.take(path.normalized, path.isDirectory);
    if (places.count() > entryLimit) throw Refusal{EFBIG, "it has too many entries", true};
  }
  return items;
}

}  // namespace ArcCopierImplementation
