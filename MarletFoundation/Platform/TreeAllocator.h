#pragma once

#include <cstddef>
#include <memory>
#include <memory_resource>
#include <new>
#include <utility>

namespace MarletFoundation {

using TreeMemory = std::shared_ptr<std::pmr::monotonic_buffer_resource>;

/// Takes the nodes of a tree from the tree's own memory, which is given back at once when the last of them goes:
/// they are many, small, and live equally long. Without a memory it takes them from the heap.
template <class Value>
struct TreeAllocator {
  using value_type = Value;

  TreeMemory memory;

  TreeAllocator(TreeMemory itsMemory) : memory(std::move(itsMemory)) {}
  template <class Other>
  TreeAllocator(const TreeAllocator<Other>& other) : memory(other.memory) {}

  Value* allocate(std::size_t count) {
    if (!memory) return std::allocator<Value>().allocate(count);
    return static_cast<Value*>(memory->allocate(count * sizeof(Value), alignof(Value)));
  }
  void deallocate(Value* values, std::size_t count) {
    if (!memory) std::allocator<Value>().deallocate(values, count);
  }

  template <class Other>
  bool operator==(const TreeAllocator<Other>& other) const {
    return memory == other.memory;
  }
};

}  // namespace MarletFoundation
