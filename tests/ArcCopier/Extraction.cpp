#include "ArcCopier/Extraction.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <fstream>
#include <memory>

namespace fs = std::filesystem;

namespace MarletFoundation::test {
namespace {

std::string contents(const fs::path& path) {
  return {std::istreambuf_iterator<char>(std::ifstream(path, std::ios::binary).rdbuf()), {}};
}

Extraction& of(ArcCopierRef copier) { return *static_cast<Extraction*>(ArcCopierUserData(copier)); }

}  // namespace

Extraction::Extraction(const std::string& archive, ArcCopierLimits bounds) : limits(bounds) {
  std::ofstream(directory_.path() / "archive.zip", std::ios::binary) << archive;
}

void Extraction::run() {
  const std::unique_ptr<ArcCopier, decltype(&ArcCopierFree)> handle(ArcCopierNew(), &ArcCopierFree);
  const auto copier = handle.get();
  ArcCopierSetUserData(copier, this);
  ArcCopierSetLimits(copier, limits);
  ArcCopierSetCopyFileStartedHandler(copier, [](ArcCopierRef c, const char* path) {
    of(c).started.emplace_back(path);
    return 0;
  });
  ArcCopierSetCopyFileFinishedHandler(copier, [](ArcCopierRef c, const char* path) {
    of(c).finished.emplace_back(path);
    return 0;
  });
  ArcCopierSetCopyFileUpdateHandler(copier, [](ArcCopierRef c, const char*, std::uint64_t copied) {
    of(c).meanwhile();
    if (of(c).cancelAt != 0 && copied >= of(c).cancelAt) ArcCopierCancel(c);
    return 0;
  });
  const auto fatal = [](ArcCopierRef c, const char*, int, const char* reason) {
    of(c).problems[""] = reason;
    return 0;
  };
  ArcCopierSetFatalErrorHandler(copier, fatal);
  ArcCopierSetFatalFileErrorHandler(copier, fatal);
  ArcCopierSetFileConflictErrorHandler(copier, [](ArcCopierRef c, const char* path, int, const char*) {
    of(c).conflicts.emplace_back(path);
    return 0;
  });
  ArcCopierSetFileErrorHandler(copier, [](ArcCopierRef c, const char* path, int, const char* reason) {
    of(c).problems[path] = reason;
    return of(c).stopsAtErrors ? 1 : 2;
  });
  const ArcCopierOption options[] = {{ArcCopierExtractPKZip, 1}, {nullptr, 0}};
  result = ArcCopierCopyWithOptions(copier, (directory_.path() / "archive.zip").c_str(),
                                    destination().c_str(), options);
  error = errno;

  for (const auto& item : fs::directory_iterator(directory_.path()))
    EXPECT_TRUE(item.path().filename() == "archive.zip" || item.path().filename() == "out") << item.path();
  for (const auto& [path, text] : files()) {
    EXPECT_EQ(path.find(".arc-copier"), std::string::npos);
    struct stat status;
    ASSERT_EQ(::lstat((destination() / path).c_str(), &status), 0) << path;
    EXPECT_EQ(status.st_mode & 07000, 0u) << path;
  }
}

std::map<std::string, std::string> Extraction::files() const {
  std::map<std::string, std::string> all;
  if (!fs::exists(destination())) return all;
  for (const auto& item : fs::recursive_directory_iterator(destination())) {
    const auto path = item.path().lexically_relative(destination()).string();
    all[path] = item.is_symlink() ? "->" : item.is_directory() ? "/" : contents(item.path());
  }
  return all;
}

}  // namespace MarletFoundation::test
