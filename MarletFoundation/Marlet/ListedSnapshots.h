#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

namespace MarletFoundation {

struct BookPagePlaceholderSnapshot;
struct MarletChapterSnapshot;

/// The most bytes that the pages of a chapter, or the chapters of a book, may hold together. A few bytes of a
/// manifest can name a large page or chapter again, so that without a measure a small document fills all memory.
inline constexpr std::size_t MostHeldBytes = std::size_t{1} << 27;

/// What a snapshot holds in memory, about.
std::size_t heldBytes(const BookPagePlaceholderSnapshot& page);
std::size_t heldBytes(const MarletChapterSnapshot& chapter);

/// Throws the `ErrorObject` for a document that holds more than `MostHeldBytes`.
void requireHeldBytes(std::size_t bytes);

/// The snapshots that a manifest lists by name, in its order. What is listed again is read once and copied.
template <class Snapshot>
class ListedSnapshots {
 public:
  /// Adds the snapshot of `name`, which must stay; `load` makes it where none was made before. Throws what `load`
  /// throws, and an `ErrorObject` where all together hold too much.
  template <class Load>
  void add(std::string_view name, Load load) {
    const auto [first, isNew] = places_.try_emplace(name, snapshots_.size());
    if (isNew) {
      snapshots_.push_back(load());
      requireHeldBytes(held_ += heldBytes(snapshots_.back()));
    } else {
      requireHeldBytes(held_ += heldBytes(snapshots_[first->second]));
      snapshots_.push_back(Snapshot(snapshots_[first->second]));
    }
  }

  std::vector<Snapshot> take() { return std::move(snapshots_); }

 private:
  std::vector<Snapshot> snapshots_;
  std::unordered_map<std::string_view, std::size_t> places_;
  std::size_t held_ = 0;
};

}  // namespace MarletFoundation
