#include "support/FailingAllocation.h"

#include <cstdlib>

namespace {

thread_local long made = 0;
thread_local long failing = 0;
thread_local bool failsFromThere = false;

bool fails() {
  ++made;
  return failing != 0 && (made == failing || (failsFromThere && made > failing));
}

void* allocate(std::size_t size) { return fails() ? nullptr : std::malloc(size == 0 ? 1 : size); }

void* orThrow(void* memory) {
  if (!memory) throw std::bad_alloc();
  return memory;
}

}  // namespace

void* operator new(std::size_t size) { return orThrow(allocate(size)); }
void* operator new(std::size_t size, const std::nothrow_t&) noexcept { return allocate(size); }
void* operator new(std::size_t size, std::align_val_t alignment) {
  const auto unit = static_cast<std::size_t>(alignment);
  return orThrow(fails() ? nullptr : std::aligned_alloc(unit, (size + unit - 1) / unit * unit));
}
void operator delete(void* memory) noexcept { std::free(memory); }
void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }
void operator delete(void* memory, std::align_val_t) noexcept { std::free(memory); }
void operator delete(void* memory, std::size_t, std::align_val_t) noexcept { std::free(memory); }

namespace MarletFoundation::test {

FailingAllocation::FailingAllocation(long number, bool lasting) {
  failing = made + number;
  failsFromThere = lasting;
}

FailingAllocation::~FailingAllocation() { failing = 0; }

long takeAllocationCount() { return std::exchange(made, 0); }

}  // namespace MarletFoundation::test
