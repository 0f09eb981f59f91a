#include "MarletFoundation/DiffPack/PackPaths.h"

#include <algorithm>
#include <vector>

#include "MarletFoundation/DiffPack/DiffError.h"
#include "MarletFoundation/DiffPack/DiffPackFormat.h"
#include "MarletFoundation/Platform/RelativePath.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;

/// A file of the pack's directory; the manifest is nobody's entry.
struct PackFile {
  std::string place;
  const std::string* entry;
  bool isChosen;
};

/// So that what is below a path follows it directly: a slash comes before all other characters.
bool isAhead(const PackFile& a, const PackFile& b) {
  const auto rank = [](char c) { return c == '/' ? 0 : 1 + static_cast<unsigned char>(c); };
  return std::lexicographical_compare(a.place.begin(), a.place.end(), b.place.begin(), b.place.end(),
                                      [&](char x, char y) { return rank(x) < rank(y); });
}

bool isAtOrBelow(const PackFile& file, const PackFile& other) {
  return file.place.starts_with(other.place) &&
         (file.place.size() == other.place.size() || file.place[other.place.size()] == '/');
}

bool isSameEntry(const PackFile& a, const PackFile& b) { return a.entry && b.entry && *a.entry == *b.entry; }

ErrorObject collision(const PackFile& above, const PackFile& below) {
  const auto name = [](const PackFile& file) {
    return file.entry ? "\"" + *file.entry + "\"" : std::string("its own manifest");
  };
  return diffError(DiffErrorCode::CriticalDiffPackValidationError,
                   "A pack can't hold " + name(below) + " beside " + name(above) + ": both need \"" +
                       above.place + "\" in its directory. Give one of the two another name, or revert it.");
}

}  // namespace

std::string plainPath(std::string_view path) {
  const auto names = relativePathComponents(path);
  if (!names) return std::string(path);
  std::string plain;
  for (const auto name : *names) plain.append(plain.empty() ? "" : "/").append(name);
  return plain;
}

std::string deltaPath(std::string_view path) {
  return std::string(path.substr(0, path.find_last_not_of('/') + 1)).append(DiffPackFormat::deltaExtension);
}

void requireRoomInPack(const FileDiffDescriptors& entries, const std::set<std::string, std::less<>>& chosen) {
  std::vector<PackFile> files{{std::string(DiffPackFormat::manifestFilename), nullptr, false}};
  for (const auto& entry : entries) {
    if (std::holds_alternative<FileDiffDescriptor::Removed>(entry.change)) continue;
    const bool isModified = std::holds_alternative<FileDiffDescriptor::Modified>(entry.change);
    const auto& path = entry.filePath();
    auto place = plainPath(isModified ? deltaPath(path) : path);
    files.push_back({std::move(place), &path, chosen.contains(path)});
  }
  std::stable_sort(files.begin(), files.end(), isAhead);
  // The files above the one that is looked at, each below the one before it.
  std::vector<const PackFile*> above;
  for (const auto& file : files) {
    while (!above.empty() && !isAtOrBelow(file, *above.back())) above.pop_back();
    // The nearest one is enough: those above it have been compared with each other.
    const auto* other = above.empty() ? nullptr : above.back();
    if (other && (file.isChosen || other->isChosen) && !isSameEntry(file, *other))
      throw collision(*other, file);
    above.push_back(&file);
  }
}

}  // namespace MarletFoundation
