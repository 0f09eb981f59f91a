// Extracts whatever bytes as an archive. Nothing may come to lie outside of the destination, no entry may
// leave a passing file, and what the copier says must fit what is there.

#include <fcntl.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "ArcCopier/ArcCopier.h"

namespace fs = std::filesystem;

namespace {

struct Seen {
  std::size_t finished = 0;
  std::size_t problems = 0;
};

Seen& seen(ArcCopierRef copier) { return *static_cast<Seen*>(ArcCopierUserData(copier)); }

int finished(ArcCopierRef copier, const char*) { return ++seen(copier).finished, 0; }
int problem(ArcCopierRef copier, const char*, int error, const char* reason) {
  if (error == 0 || !reason || !*reason) std::abort();
  return ++seen(copier).problems, 2;
}

fs::path makeRoom() {
  std::string name = fs::exists("/dev/shm") ? "/dev/shm/archive-fuzz-XXXXXX" : "/tmp/archive-fuzz-XXXXXX";
  if (!::mkdtemp(name.data())) std::abort();
  return name;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const auto room = makeRoom();
  const auto source = room / "archive.zip";
  const auto destination = room / "in/out";
  const int file = ::open(source.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
  if (file < 0 || ::write(file, data, size) != static_cast<ssize_t>(size)) std::abort();
  ::close(file);

  Seen result;
  const auto copier = ArcCopierNew();
  ArcCopierSetUserData(copier, &result);
  ArcCopierSetLimits(copier, {1000, 64 << 20, 200});
  ArcCopierSetCopyFileFinishedHandler(copier, finished);
  ArcCopierSetFatalErrorHandler(copier, problem);
  ArcCopierSetFatalFileErrorHandler(copier, problem);
  ArcCopierSetFileConflictErrorHandler(copier, problem);
  ArcCopierSetFileErrorHandler(copier, problem);
  const ArcCopierOption options[] = {{ArcCopierExtractPKZip, 1}, {nullptr, 0}};
  const int code = ArcCopierCopyWithOptions(copier, source.c_str(), destination.c_str(), options);
  ArcCopierFree(copier);

  if ((code == ArcCopierSuccess) != (result.problems == 0)) std::abort();
  if (code == ArcCopierBadArchive && fs::exists(room / "in")) std::abort();
  std::size_t files = 0;
  for (const auto& item : fs::recursive_directory_iterator(room)) {
    if (item.path() == source || item.path() == room / "in" || item.path() == destination) continue;
    const auto below = item.path().lexically_relative(destination).string();
    if (below.starts_with("..") || below.find(".arc-copier-") != std::string::npos) std::abort();
    if (!item.is_directory() && (!item.is_regular_file() || item.is_symlink())) std::abort();
    files += !item.is_directory();
  }
  if (files > result.finished) std::abort();
  fs::remove_all(room / "in");
  return 0;
}
