#include "MarletDiff/WorkMemory.h"

#include <sys/mman.h>

#include <algorithm>
#include <new>

namespace MarletDiff {
namespace {

constexpr std::size_t largePage = std::size_t{1} << 21;
constexpr std::size_t smallestBlock = 4096;
/// Beyond these the system may have to move much memory about to find large pages, which costs more than they spare.
constexpr std::size_t mostLargePages = 8;

class Blocks : public std::pmr::memory_resource {
  static bool fillsLargePages(std::size_t bytes) {
    return bytes >= largePage / 2 && bytes <= mostLargePages * largePage;
  }

  void* do_allocate(std::size_t bytes, std::size_t alignment) override {
    if (!fillsLargePages(bytes)) return ::operator new(bytes, std::align_val_t(alignment));
    const auto rounded = (bytes + largePage - 1) / largePage * largePage;
    auto* const block = ::operator new(rounded, std::align_val_t(largePage));
    // What the system makes of it changes nothing but the time.
    ::madvise(block, rounded, MADV_HUGEPAGE);
    return block;
  }

  void do_deallocate(void* block, std::size_t bytes, std::size_t alignment) override {
    ::operator delete(block, std::align_val_t(fillsLargePages(bytes) ? largePage : alignment));
  }

  bool do_is_equal(const memory_resource& other) const noexcept override { return this == &other; }
};

std::pmr::memory_resource* theBlocks() {
  static Blocks blocks;
  return &blocks;
}

}  // namespace

WorkMemory::WorkMemory(std::size_t expected)
    : monotonic_buffer_resource(std::max(expected, smallestBlock), theBlocks()) {}

}  // namespace MarletDiff
