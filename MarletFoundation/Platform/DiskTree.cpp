#include "MarletFoundation/Platform/DiskTree.h"

#include <dirent.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <bit>
#include <climits>

#include "MarletFoundation/Platform/SharedRelease.h"

namespace MarletFoundation {
namespace {

/// So many entries of a directory are opened before it is worth a descriptor of its own.
constexpr int FewEntries = 3;

}  // namespace

/// The open descriptors of a tree below its root, each in its slot. When there are too many, they are closed
/// in runs of consecutive numbers, one system call a run, since a book of many pages would otherwise spend a
/// third of its system calls on closing.
class DiskTree {
 public:
  static constexpr std::size_t Capacity = 64;
  /// How many of the directory in use and its nearest ancestors stay open when the others are closed.
  static constexpr int Nearest = 12;
  /// How many of its other ancestors stay open, evenly spread, so that the way up from a great depth is short.
  static constexpr int MostSpread = 24;

  DiskTree() { open_.reserve(Capacity); }
  ~DiskTree() { closeAllBut(nullptr); }

  /// Keeps an open descriptor in the slot. Those of `inUse` and of its nearest ancestors stay open.
  void keep(int descriptor, int& slot, const DiskDirectory* inUse) {
    if (open_.size() == Capacity) closeAllBut(inUse);
    open_.push_back({descriptor, &slot});
    slot = descriptor;
  }

  void forget(const int& slot) {
    const auto found =
        std::find_if(open_.rbegin(), open_.rend(), [&](const Entry& entry) { return entry.slot == &slot; });
    if (found != open_.rend()) found->slot = nullptr;
  }

  void closeAllBut(const DiskDirectory* inUse, int nearest = Nearest, int spread = MostSpread) {
    std::vector<const int*> kept;
    const int stride =
        inUse && spread > 0
            ? static_cast<int>(std::bit_ceil(static_cast<unsigned>(inUse->depth_ / spread + 1)))
            : INT_MAX;
    for (; inUse && inUse->parent_; inUse = inUse->parent_.get()) {
      if (nearest-- > 0 || inUse->depth_ % stride == 0) kept.push_back(&inUse->descriptor_);
    }
    const auto closing = std::partition(open_.begin(), open_.end(), [&](const Entry& entry) {
      return std::find(kept.begin(), kept.end(), entry.slot) != kept.end();
    });
    std::sort(closing, open_.end(),
              [](const Entry& a, const Entry& b) { return a.descriptor < b.descriptor; });
    for (auto run = closing; run != open_.end();) {
      auto end = run;
      int next = run->descriptor;
      for (; end != open_.end() && end->descriptor == next; ++end, ++next) {
        if (end->slot) *end->slot = -1;
      }
      closeRun(run->descriptor, next - 1);
      run = end;
    }
    open_.erase(closing, open_.end());
  }

  /// Opens beneath `directory`'s descriptor. Short of descriptors, this tree gives up its own and tries
  /// again.
  int openAt(const DiskDirectory* directory, int directoryDescriptor, const char* name, int flags) {
    return trying(directory, [&] { return ::openat(directoryDescriptor, name, flags); });
  }

  /// The same for a path, following no link on the way. ENOSYS or EPERM where the system has no such call or a
  /// sandbox forbids it.
  int openPathAt(const DiskDirectory* directory, int directoryDescriptor, const char* path, int flags) {
    open_how how{};
    how.flags = static_cast<unsigned>(flags);
    how.resolve = RESOLVE_NO_SYMLINKS;
    return trying(directory, [&] {
      return static_cast<int>(::syscall(SYS_openat2, directoryDescriptor, path, &how, sizeof how));
    });
  }

  Descriptor root;
  std::string scratchPath;
  const TreeMemory memory = std::make_shared<std::pmr::monotonic_buffer_resource>();

 private:
  struct Entry {
    int descriptor;
    int* slot;  // null once it went away
  };

  template <class Call>
  int trying(const DiskDirectory* directory, Call call) {
    const int opened = retrying(call);
    if (opened >= 0 || (errno != EMFILE && errno != ENFILE)) return opened;
    closeAllBut(directory, 1, 0);
    return retrying(call);
  }

  static void closeRun(int first, int last) {
    if (first != last && ::close_range(static_cast<unsigned>(first), static_cast<unsigned>(last), 0) == 0)
      return;
    for (int number = first; number <= last; ++number) ::close(number);
  }

  std::vector<Entry> open_;
};

DiskDirectory::DiskDirectory(Key, std::shared_ptr<DiskDirectory> parent, SharedString name)
    : parent_(std::move(parent)),
      name_(std::move(name)),
      tree_(parent_ ? parent_->tree_ : nullptr),
      depth_(parent_ ? parent_->depth_ + 1 : 0) {}

DiskDirectory::~DiskDirectory() {
  if (descriptor_ >= 0) tree_->forget(descriptor_);
  releaseWithoutStack(std::move(parent_));
}

std::shared_ptr<DiskDirectory> DiskDirectory::root(Descriptor descriptor) {
  auto directory = std::make_shared<DiskDirectory>(Key(), nullptr, SharedString());
  directory->ownTree_ = std::make_unique<DiskTree>();
  directory->tree_ = directory->ownTree_.get();
  directory->tree_->root = std::move(descriptor);
  return directory;
}

std::shared_ptr<DiskDirectory> DiskDirectory::child(std::shared_ptr<DiskDirectory> parent, SharedString name,
                                                    Descriptor opened, ino_t number) {
  const TreeAllocator<DiskDirectory> memory(parent->memory());
  auto directory = std::allocate_shared<DiskDirectory>(memory, Key(), std::move(parent), std::move(name));
  directory->number_ = number;
  if (opened) directory->parent_->keep(std::move(opened), directory->descriptor_);
  return directory;
}

const TreeMemory& DiskDirectory::memory() const { return tree_->memory; }

int DiskDirectory::descriptor() {
  if (!parent_) return tree_->root.get();
  if (descriptor_ >= 0) return descriptor_;
  std::vector<DiskDirectory*> closed;
  DiskDirectory* open = this;
  for (; open->parent_ && open->descriptor_ < 0; open = open->parent_.get()) closed.push_back(open);
  int number = open->parent_ ? open->descriptor_ : tree_->root.get();
  for (auto next = closed.rbegin(); next != closed.rend(); ++next) {
    Descriptor opened(tree_->openAt(open, number, (*next)->name_.c_str(), DirectoryFlags));
    if (!opened || !(*next)->isStill(opened.get())) return -1;
    number = opened.release();
    tree_->keep(number, (*next)->descriptor_, open);
    open = *next;
  }
  return number;
}

/// Whether an open directory is the one that was found at first. False and errno when that can't be told.
bool DiskDirectory::isStill(int descriptor) {
  struct stat status;
  if (::fstat(descriptor, &status) != 0) return false;
  if (number_ == 0) number_ = status.st_ino;
  if (number_ == status.st_ino) return true;
  errno = ESTALE;
  return false;
}

int DiskDirectory::status(const char* name, struct stat& status) {
  const int number = descriptor();
  return number < 0 ? -1 : retrying([&] { return ::fstatat(number, name, &status, AT_SYMLINK_NOFOLLOW); });
}

int DiskDirectory::statusByPath(const char* name, struct stat& status) {
  if (descriptor_ >= 0 || !parent_ || number_ != 0) return this->status(name, status);
  const int number = parent_->descriptor();
  if (number < 0) return -1;
  return retrying([&] { return ::fstatat(number, pathThroughParent(name), &status, AT_SYMLINK_NOFOLLOW); });
}

const char* DiskDirectory::pathThroughParent(const char* name) {
  return tree_->scratchPath.assign(name_.view()).append("/").append(name).c_str();
}

Descriptor DiskDirectory::openThroughParent(const char* name, int flags) {
  const int number = parent_->descriptor();
  if (number < 0) return Descriptor();
  return Descriptor(tree_->openPathAt(parent_.get(), number, pathThroughParent(name), flags));
}

Descriptor DiskDirectory::open(const char* name, int flags) {
  if (descriptor_ < 0 && parent_ && openedThroughParent_ < FewEntries) {
    ++openedThroughParent_;
    auto opened = openThroughParent(name, flags);
    if (opened || (errno != ENOSYS && errno != EPERM)) return opened;
  }
  const int number = descriptor();
  return number < 0 ? Descriptor() : Descriptor(tree_->openAt(this, number, name, flags));
}

void DiskDirectory::keep(Descriptor descriptor, int& slot) { tree_->keep(descriptor.release(), slot, this); }

void DiskDirectory::forget(const int& slot) { tree_->forget(slot); }

std::optional<std::vector<DiskDirectory::Entry>> DiskDirectory::entries() {
  const int number = descriptor();
  if (number < 0) return std::nullopt;
  // A description of its own: the listing must begin at the start, and closes with the stream.
  const int listed = tree_->openAt(this, number, ".", DirectoryFlags);
  if (listed < 0) return std::nullopt;
  const std::unique_ptr<DIR, int (*)(DIR*)> stream(::fdopendir(listed), &::closedir);
  if (!stream) {
    ::close(listed);
    return std::nullopt;
  }
  std::vector<Entry> result;
  while (true) {
    errno = 0;
    const dirent* entry = ::readdir(stream.get());
    if (!entry) break;
    if (isFileName(entry->d_name)) result.push_back({entry->d_name, entry->d_type, entry->d_ino});
  }
  if (errno != 0) return std::nullopt;
  return result;
}

SharedString DiskDirectory::sharedName(std::string_view name) {
  if (!parent_) return SharedString(name);
  for (auto& known : parent_->namesInDirectories_) {
    if (known.view() == name) return known;
    if (known.empty()) return known = SharedString(name);
  }
  return SharedString(name);
}

void DiskDirectory::setRoot(Descriptor descriptor) {
  tree_->closeAllBut(nullptr);
  tree_->root = std::move(descriptor);
}

void DiskDirectory::follow(ino_t number) {
  number_ = number;
  if (descriptor_ < 0) return;
  tree_->forget(descriptor_);
  descriptor_ = -1;
}

void DiskDirectory::moveTo(std::shared_ptr<DiskDirectory> parent, SharedString name) {
  parent_ = std::move(parent);
  name_ = std::move(name);
  depth_ = parent_->depth_ + 1;
}

DiskDirectory& DiskDirectory::rootDirectory() {
  auto* directory = this;
  while (directory->parent_) directory = directory->parent_.get();
  return *directory;
}

std::string DiskDirectory::path() const {
  std::vector<const DiskDirectory*> chain;
  for (const auto* directory = this; directory->parent_; directory = directory->parent_.get()) {
    chain.push_back(directory);
  }
  std::string path;
  for (auto next = chain.rbegin(); next != chain.rend(); ++next)
    path.append((*next)->name_.view()).append(1, '/');
  return path;
}

}  // namespace MarletFoundation
