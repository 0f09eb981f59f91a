#include "MarletFoundation/Utils/Checksum.h"

#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/resource.h>

#include <condition_variable>
#include <fstream>
#include <mutex>

#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/DispatchQueue.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

TEST(Checksum, DigestsFilesAndBytes) {
  struct Row {
    std::string contents, md5, sha1;
  };
  const Row rows[] = {
      {"", "d41d8cd98f00b204e9800998ecf8427e", "da39a3ee5e6b4b0d3255bfef95601890afd80709"},
      {"abc", "900150983cd24fb0d6963f7d28e17f72", "a9993e364706816aba3e25717850c26c9cd0d89d"},
      // More than one slice of either digest, and no whole number of them.
      {std::string(1'000'000, 'a'), "7707d6ae4e027c70eea2a935c2296f21",
       "34aa973cd4c4daa4f61eeb2bdbad27316534016f"},
  };
  const TemporaryDirectory directory;
  for (const auto& [contents, md5, sha1] : rows) {
    std::ofstream(directory.path() / "file", std::ios::binary) << contents;
    const auto url = directory.url("file");
    EXPECT_EQ(Checksum::MD5ChecksumForFile(url), md5);
    EXPECT_EQ(hexadecimal(Data::mlf_SHA1DigestForURL(url)->bytes()), sha1);
    EXPECT_EQ(hexadecimal(Data(contents).mlf_SHA1Digest().bytes()), sha1);
  }
  // A file that claims to be empty and isn't.
  const auto version = URL::file("/proc/version");
  EXPECT_EQ(*Data::mlf_SHA1DigestForURL(version), FileManager::readFile(version).mlf_SHA1Digest());
  for (const auto* missing : {"nothing", ""}) {
    EXPECT_THROW(Checksum::MD5ChecksumForFile(directory.url(missing)), ErrorObject);
    EXPECT_FALSE(Data::mlf_SHA1DigestForURL(directory.url(missing)));
  }
}

/// Removes in the background, and waits for the end of it.
std::optional<ErrorObject> removeAndWait(const URL& url) {
  std::mutex mutex;
  std::condition_variable ended;
  bool isDone = false;
  std::optional<ErrorObject> result;
  FileManager::asynchronouslyRemoveItem(url, [&](const std::optional<ErrorObject>& error) {
    const std::lock_guard lock(mutex);
    result = error;
    isDone = true;
    ended.notify_all();
  });
  EXPECT_FALSE(std::filesystem::exists(std::filesystem::symlink_status(url.path())));
  std::unique_lock lock(mutex);
  ended.wait(lock, [&] { return isDone; });
  return result;
}

TEST(AsynchronousRemoval, TakesTheItemAwayAtOnceAndRemovesItLater) {
  const TemporaryDirectory directory, temporary;
  const auto item = directory.path() / "item";
  const char* set = ::getenv("TMPDIR");
  const std::string kept = set ? set : "/tmp";
  // The second is on another file system.
  for (const auto& place : {temporary.path().string(), std::string("/dev/shm")}) {
    ::setenv("TMPDIR", place.c_str(), 1);
    std::filesystem::create_directories(item / "deep/er");
    std::ofstream(item / "deep/file") << "contents";
    std::filesystem::create_directory_symlink(directory.path(), item / "link");
    std::ofstream(directory.path() / "beside") << "stays";
    EXPECT_FALSE(removeAndWait(directory.url("item")));
    EXPECT_EQ(FileManager::contentsOfDirectory(directory.url(), false), std::vector<std::string>{"beside"});
    EXPECT_TRUE(std::filesystem::is_empty(temporary.path()));
  }
  ::setenv("TMPDIR", kept.c_str(), 1);
  // Deeper than a process may have files open.
  rlimit before, few;
  ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &before), 0);
  few = {200, before.rlim_max};
  auto level = item;
  for (int depth = 0; depth < 300; ++depth) level /= "d";
  std::filesystem::create_directories(level);
  ::setrlimit(RLIMIT_NOFILE, &few);
  EXPECT_FALSE(removeAndWait(directory.url("item")));
  ::setrlimit(RLIMIT_NOFILE, &before);
  EXPECT_THROW(FileManager::asynchronouslyRemoveItem(directory.url("nothing")), ErrorObject);
}

}  // namespace
}  // namespace MarletFoundation::test
