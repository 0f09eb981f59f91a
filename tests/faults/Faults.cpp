/// Preloaded into a command, lets one of its calls to the file system go wrong. $FAULT_AT counts the calls that
/// can go wrong so, from 1; $FAULT is `error` (EIO), `short` (a write of one byte less) or `exit` (the process
/// ends ahead of the call), or `hold`: the call waits for $FAULT_FOR ms, else 30, and so does each $FAULT_EVERYth.
/// $NO_EXCHANGE makes the file system one that can't exchange two names. The number of calls made goes to
/// $FAULT_COUNT, a file. $STARVE leaves no descriptor to open once two names were exchanged. With `memory` for $FAULT no
/// allocation succeeds from the one at $FAULT_AT on, counted from the start of `main`.

#include <dlfcn.h>
#include <fcntl.h>
#include <stdarg.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string_view>
#include <thread>

#define INTERPOSED extern "C" __attribute__((visibility("default")))

using namespace std::string_view_literals;

namespace {

std::atomic<long> counted = 0;
bool isStarved = false;
bool isStarted = false;
std::atomic<long> allocated = 0;

const char* setting(const char* name) {
  const char* value = std::getenv(name);
  return value ? value : "";
}

template <class Function>
Function next(Function, const char* name) {
  return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

enum class Call { look, change, write };

/// Whether the fault that is asked for can befall a call. A process that ends at a look might as well end at the
/// change after it.
bool counts(Call call) {
  static const std::string_view fault = setting("FAULT");
  return fault == "short"  ? call == Call::write
         : fault == "exit" ? call != Call::look
                           : fault == "error" || fault == "hold";
}

bool isHeld(long number) {
  static const bool isAsked = setting("FAULT") == "hold"sv;
  static const long at = std::atol(setting("FAULT_AT")), every = std::atol(setting("FAULT_EVERY"));
  return isAsked && (number == at || (every > 0 && number % every == 0));
}

void hold() {
  static const long milliseconds = *setting("FAULT_FOR") ? std::atol(setting("FAULT_FOR")) : 30;
  // A signal that comes meanwhile must not end it early.
  const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
  std::this_thread::sleep_until(end);
}

/// Counts a call, and says whether it is the one to fail. Ends the process if that is to happen here.
bool isFaulty(Call call) {
  static const long at = std::atol(setting("FAULT_AT"));
  if (!counts(call)) return false;
  const long number = ++counted;
  if (isHeld(number)) hold();
  if (number != at) return false;
  if (setting("FAULT") == "exit"sv) ::_exit(99);
  return true;
}

bool isError() { return setting("FAULT") == "error"sv; }

template <class Result>
Result fail() {
  errno = EIO;
  return static_cast<Result>(-1);
}

struct Report {
  ~Report() {
    const char* path = setting("FAULT_COUNT");
    if (FILE* file = *path ? std::fopen(path, "w") : nullptr) {
      std::fprintf(file, "%ld\n", counted.load());
      std::fclose(file);
    }
  }
} report;

}  // namespace

#define FAULTY(kind, Result, name, parameters, arguments)                           \
  INTERPOSED Result name parameters {                                               \
    static const auto original = next(&::name, #name);                              \
    return isFaulty(Call::kind) && isError() ? fail<Result>() : original arguments; \
  }

FAULTY(change, int, mkdirat, (int directory, const char* path, mode_t mode), (directory, path, mode))
FAULTY(change, int, linkat, (int from, const char* path, int to, const char* name, int flags),
       (from, path, to, name, flags))
FAULTY(change, int, symlinkat, (const char* target, int directory, const char* path),
       (target, directory, path))
FAULTY(change, int, unlinkat, (int directory, const char* path, int flags), (directory, path, flags))
FAULTY(change, int, renameat, (int from, const char* path, int to, const char* name), (from, path, to, name))
FAULTY(change, int, fsync, (int file), (file))
FAULTY(change, int, syncfs, (int file), (file))
FAULTY(change, int, fchmod, (int file, mode_t mode), (file, mode))
FAULTY(change, int, fchmodat, (int directory, const char* path, mode_t mode, int flags),
       (directory, path, mode, flags))
FAULTY(change, int, fchown, (int file, uid_t user, gid_t group), (file, user, group))
FAULTY(look, int, fstat, (int file, struct stat* status), (file, status))
FAULTY(look, int, stat, (const char* path, struct stat* status), (path, status))
FAULTY(look, int, fstatat, (int directory, const char* path, struct stat* status, int flags),
       (directory, path, status, flags))
FAULTY(look, ssize_t, readlinkat, (int directory, const char* path, char* text, size_t size),
       (directory, path, text, size))
FAULTY(look, ssize_t, pread, (int file, void* bytes, size_t size, off_t offset), (file, bytes, size, offset))
FAULTY(change, ssize_t, copy_file_range,
       (int from, off_t* fromAt, int to, off_t* toAt, size_t size, unsigned flags),
       (from, fromAt, to, toAt, size, flags))
FAULTY(look, int, statx, (int directory, const char* path, int flags, unsigned mask, struct statx* status),
       (directory, path, flags, mask, status))
FAULTY(look, ssize_t, flistxattr, (int file, char* list, size_t size), (file, list, size))

// A function with a structure's name, which a definition here would hide.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wshadow"
FAULTY(look, int, flock, (int file, int operation), (file, operation))
#pragma GCC diagnostic pop

INTERPOSED int renameat2(int from, const char* path, int to, const char* name, unsigned flags) {
  static const auto original = next(&::renameat2, "renameat2");
  if (isFaulty(Call::change) && isError()) return fail<int>();
  if ((flags & RENAME_EXCHANGE) != 0 && *setting("NO_EXCHANGE")) {
    errno = EINVAL;
    return -1;
  }
  const int result = original(from, path, to, name, flags);
  if (result == 0 && (flags & RENAME_EXCHANGE) != 0 && *setting("STARVE")) isStarved = true;
  return result;
}

INTERPOSED ssize_t write(int file, const void* bytes, size_t size) {
  static const auto original = next(&::write, "write");
  if (file > 2 && isFaulty(Call::write)) {
    if (isError()) return fail<ssize_t>();
    if (size > 1) --size;
  }
  return original(file, bytes, size);
}

/// The command's first call of all.
INTERPOSED sighandler_t signal(int number, sighandler_t handler) {
  static const auto original = next(&::signal, "signal");
  isStarted = setting("FAULT") == "memory"sv;
  return original(number, handler);
}

namespace {

bool hasMemory() {
  if (!isStarted) return true;
  static const long at = std::atol(setting("FAULT_AT"));
  if (++allocated < at) return true;
  errno = ENOMEM;
  return false;
}

}  // namespace

extern "C" void *__libc_malloc(size_t), *__libc_calloc(size_t, size_t), *__libc_realloc(void*, size_t);
INTERPOSED void* malloc(size_t size) { return hasMemory() ? __libc_malloc(size) : nullptr; }
INTERPOSED void* calloc(size_t count, size_t size) {
  return hasMemory() ? __libc_calloc(count, size) : nullptr;
}
INTERPOSED void* realloc(void* old, size_t size) { return hasMemory() ? __libc_realloc(old, size) : nullptr; }

INTERPOSED int open(const char* path, int flags, ...) {
  static const auto original = next(&::open, "open");
  va_list arguments;
  va_start(arguments, flags);
  const auto mode = va_arg(arguments, mode_t);
  va_end(arguments);
  if (isStarved) {
    errno = EMFILE;
    return -1;
  }
  return isFaulty((flags & O_CREAT) != 0 ? Call::change : Call::look) && isError()
             ? fail<int>()
             : original(path, flags, mode);
}

INTERPOSED int openat(int directory, const char* path, int flags, ...) {
  static const auto original = next(&::openat, "openat");
  va_list arguments;
  va_start(arguments, flags);
  const auto mode = va_arg(arguments, mode_t);
  va_end(arguments);
  if (isStarved) {
    errno = EMFILE;
    return -1;
  }
  return isFaulty((flags & O_CREAT) != 0 ? Call::change : Call::look) && isError()
             ? fail<int>()
             : original(directory, path, flags, mode);
}

/// How files are opened that must lie beneath a directory.
INTERPOSED long syscall(long number, ...) {
  static const auto original = next(&::syscall, "syscall");
  va_list arguments;
  va_start(arguments, number);
  long values[6];
  for (auto& value : values) value = va_arg(arguments, long);
  va_end(arguments);
  if (number == SYS_openat2 && isFaulty(Call::look) && isError()) return fail<long>();
  return original(number, values[0], values[1], values[2], values[3], values[4], values[5]);
}
