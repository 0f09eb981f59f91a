#include "MarletFoundation/DiffPack/FileDiffDescriptors.h"

#include <algorithm>
#include <numeric>

namespace MarletFoundation {

FileDiffDescriptors::FileDiffDescriptors(std::vector<MarletDiff::FileDiffDescriptor> entries) {
  Contents contents{std::move(entries), {}};
  contents.byPath.resize(contents.entries.size());
  std::iota(contents.byPath.begin(), contents.byPath.end(), std::size_t{0});
  std::stable_sort(contents.byPath.begin(), contents.byPath.end(), [&](std::size_t a, std::size_t b) {
    return contents.entries[a].filePath() < contents.entries[b].filePath();
  });
  contents_ = std::make_shared<const Contents>(std::move(contents));
}

const MarletDiff::FileDiffDescriptor* FileDiffDescriptors::first(std::string_view filePath) const {
  const auto& byPath = contents_->byPath;
  const auto pathOf = [&](std::size_t index) -> const std::string& { return (*this)[index].filePath(); };
  const auto found =
      std::lower_bound(byPath.begin(), byPath.end(), filePath,
                       [&](std::size_t index, std::string_view path) { return pathOf(index) < path; });
  return found != byPath.end() && pathOf(*found) == filePath ? &(*this)[*found] : nullptr;
}

}  // namespace MarletFoundation
