// Extracts whatever bytes as an archive, and archives whose headers agree but hold whatever names, types and
// data. Nothing may come to lie outside of the destination, no entry may
// leave a passing file, and what the copier says must fit what is there.

#include <fcntl.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <string_view>

#include "ArcCopier/ArcCopier.h"

namespace fs = std::filesystem;

namespace {

struct Seen {
  fs::path destination;
  std::size_t files = 0;
  std::size_t problems = 0;
};

Seen& seen(ArcCopierRef copier) { return *static_cast<Seen*>(ArcCopierUserData(copier)); }

int finished(ArcCopierRef copier, const char* path) {
  const auto status = fs::symlink_status(seen(copier).destination / path);
  if (!fs::is_regular_file(status) && !fs::is_directory(status)) std::abort();
  seen(copier).files += fs::is_regular_file(status);
  return 0;
}
int problem(ArcCopierRef copier, const char*, int error, const char* reason) {
  if (error == 0 || !reason || !*reason) std::abort();
  return ++seen(copier).problems, 2;
}

std::string number(std::uint64_t value, std::size_t size) {
  std::string bytes;
  for (std::size_t i = 0; i < size; ++i) bytes += static_cast<char>(value >> 8 * i);
  return bytes;
}

std::uint32_t crc32(std::string_view bytes) {
  std::uint32_t crc = ~0u;
  for (const char c : bytes) {
    crc ^= static_cast<unsigned char>(c);
    for (int bit = 0; bit < 8; ++bit) crc = (crc & 1 ? 0xEDB88320 : 0) ^ (crc >> 1);
  }
  return ~crc;
}

/// An archive with an entry for each 6 bytes: flags, high bits of the mode, method, and the sizes of name and
/// data, which follow. What is stored has the right checksum.
std::string archiveOf(std::string_view input) {
  std::string archive, directory;
  std::size_t count = 0;
  const auto take = [&](std::size_t size) {
    const auto bytes = input.substr(0, size);
    input.remove_prefix(bytes.size());
    return bytes;
  };
  for (; input.size() >= 6; ++count) {
    const auto head = take(6);
    const auto name = take(static_cast<unsigned char>(head[4]));
    const auto data = take(static_cast<unsigned char>(head[5]));
    const bool isDeflated = head[3] & 1;
    const auto size = isDeflated ? static_cast<unsigned char>(head[2]) : data.size();
    const auto fields = std::string(head.substr(0, 1)) + head[1] + number(isDeflated ? 8 : 0, 2) +
                        number(0, 4) + number(crc32(data), 4) + number(data.size(), 4) + number(size, 4) +
                        number(name.size(), 2) + number(0, 2);
    directory += "PK\1\2" + number(20, 2) + number(20, 2) + fields + number(0, 8) + number(0, 1) + head[3] +
                 number(archive.size(), 4) + std::string(name);
    archive += "PK\3\4" + number(20, 2) + fields + std::string(name) + std::string(data);
  }
  const auto offset = archive.size();
  return archive + directory + "PK\5\6" + number(0, 4) + number(count, 2) + number(count, 2) +
         number(directory.size(), 4) + number(offset, 4) + number(0, 2);
}

fs::path makeRoom() {
  std::string name = fs::exists("/dev/shm") ? "/dev/shm/archive-fuzz-XXXXXX" : "/tmp/archive-fuzz-XXXXXX";
  if (!::mkdtemp(name.data())) std::abort();
  return name;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view input(reinterpret_cast<const char*>(data), size);
  const bool isWhole = input.empty() || input.front() == 'P';
  const auto bytes = isWhole ? std::string(input) : archiveOf(input.substr(1));
  static const auto room = makeRoom();
  const auto source = room / "archive.zip";
  const auto destination = room / "in/out";
  const int file = ::open(source.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
  if (file < 0 || ::write(file, bytes.data(), bytes.size()) != static_cast<ssize_t>(bytes.size()))
    std::abort();
  ::close(file);

  Seen result{destination};
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
    if (below == ".." || below.starts_with("../")) std::abort();
    if (!item.is_directory() && (!item.is_regular_file() || item.is_symlink())) std::abort();
    files += !item.is_directory();
  }
  if (files != result.files) std::abort();
  fs::remove_all(room / "in");
  return 0;
}
