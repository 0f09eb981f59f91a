#include "MarletFoundation/Platform/FileManager.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/xattr.h>

#include <cerrno>
#include <filesystem>
#include <functional>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/LinkProtection.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;
using FileManager::Relationship;

/// The errno that an action throws; 0 if it throws none.
template <class Action>
int errorOf(Action action) {
  try {
    action();
  } catch (const ErrorObject& error) {
    EXPECT_EQ(error.domain(), PosixErrorDomain);
    return error.code();
  }
  return 0;
}

TEST(FileManager, LinksOfOthersInDirectoriesOpenToAllAreNotFollowed) {
  constexpr uid_t we = 1000, owner = 1001, stranger = 1002;
  const struct {
    mode_t mode;
    uid_t link;
    bool mayFollow;
  } rows[] = {{01777, stranger, false}, {01777, we, true},      {01777, owner, true},
              {01002, stranger, false}, {0777, stranger, true}, {01775, stranger, true}};
  for (const auto& row : rows) {
    struct stat directory {
    }, link{};
    directory.st_mode = S_IFDIR | row.mode;
    directory.st_uid = owner;
    link.st_uid = row.link;
    EXPECT_EQ(mayFollowLink(directory, link, we), row.mayFollow) << std::oct << row.mode << " " << row.link;
  }
}

TEST(FileManager, RelationshipGoesByTheItemsThemselves) {
  const TemporaryDirectory directory;
  Tree{{"a/b/file", ""s}, {"ab/", ""s}}.writeTo(directory.path());
  fs::create_directory_symlink("../ab", directory.path() / "a/out");
  fs::create_directory_symlink("a", directory.path() / "alias");
  const auto a = directory.url("a");
  const std::pair<const char*, Relationship> rows[] = {{"a", Relationship::same},
                                                       {"alias", Relationship::same},
                                                       {"a/b/file", Relationship::contains},
                                                       {"ab", Relationship::other},
                                                       {"alias/b/..", Relationship::same},
                                                       {"a/out", Relationship::other},
                                                       {"", Relationship::other},
                                                       {"alias/b/file", Relationship::contains}};
  for (const auto& [item, expected] : rows) {
    EXPECT_EQ(FileManager::relationship(a, directory.url(item)), expected) << item;
    EXPECT_EQ(FileManager::relationship(directory.url("alias"), directory.url(item)), expected) << item;
  }
  EXPECT_EQ(FileManager::relationship(URL::file("/"), a), Relationship::contains);
  EXPECT_EQ(FileManager::relationship(URL::file("/"), URL::file("/")), Relationship::same);
  EXPECT_EQ(errorOf([&] { FileManager::relationship(a, directory.url("a/none")); }), ENOENT);
  EXPECT_EQ(errorOf([&] { FileManager::relationship(directory.url("none"), a); }), ENOENT);
}

TEST(FileManager, ListsAndReads) {
  const TemporaryDirectory directory;
  Tree{{"b", "bytes"s}, {"a/", ""s}, {".hidden", ""s}, {"B", ""s}}.writeTo(directory.path());
  ASSERT_EQ(::mkfifo((directory.path() / "pipe").c_str(), 0600), 0);
  EXPECT_EQ(FileManager::contentsOfDirectory(directory.url(), true),
            (std::vector<std::string>{"B", "a", "b", "pipe"}));
  EXPECT_EQ(FileManager::contentsOfDirectory(directory.url(), false).front(), ".hidden");
  EXPECT_EQ(FileManager::readFile(directory.url("b")).view(), "bytes");
  EXPECT_FALSE(FileManager::readFile(URL::file("/proc/self/status")).empty());
  const auto withNul = directory.url().appendingPathComponent(std::string_view("b\0x", 3));
  EXPECT_FALSE(FileManager::fileExists(withNul));
  const std::pair<int, std::function<void()>> failures[] = {
      {EINVAL, [&] { FileManager::readFile(directory.url("pipe")); }},
      {EINVAL, [&] { FileManager::readFile(URL::file("/dev/zero")); }},
      {EINVAL, [&] { FileManager::readFile(withNul); }},
      {EINVAL, [&] { FileManager::readFile(*URL::parse("http://host/b")); }},
      {EISDIR, [&] { FileManager::readFile(directory.url("a")); }},
      {ENOENT, [&] { FileManager::readFile(directory.url("c")); }},
      {ENOTDIR, [&] { FileManager::contentsOfDirectory(directory.url("b"), true); }},
      {ENOENT, [&] { FileManager::isDirectory(directory.url("c")); }},
      {ENOTDIR, [&] { FileManager::resourceIsReachable(directory.url("b/c")); }},
  };
  for (const auto& [expected, action] : failures) EXPECT_EQ(errorOf(action), expected);
}

TEST(FileManager, RefusesToReadMoreThanAGigabyteIntoMemory) {
  const TemporaryDirectory directory;
  Tree{{"huge", ""s}}.writeTo(directory.path());
  fs::resize_file(directory.path() / "huge", (std::uintmax_t{1} << 40));
  EXPECT_EQ(errorOf([&] { FileManager::readFile(directory.url("huge")); }), EFBIG);
}

TEST(FileManager, WritingAFileKeepsWhatBelongsToIt) {
  const TemporaryDirectory directory;
  Tree{{"docs/file", "old"s}, {"docs/sub/", ""s}}.writeTo(directory.path());
  const auto file = directory.path() / "docs/file";
  fs::permissions(file, fs::perms(0640));
  const bool hasAttributes = ::setxattr(file.c_str(), "user.kept", "yes", 3, 0) == 0;
  fs::create_symlink("docs/file", directory.path() / "link");
  fs::create_symlink("docs/new", directory.path() / "dangling");
  fs::create_symlink("loop", directory.path() / "loop");

  FileManager::writeFileAtomically(directory.url("link"), Data(std::string("new")));
  FileManager::writeFileAtomically(directory.url("dangling"), Data(std::string("made")));
  EXPECT_TRUE(fs::is_symlink(directory.path() / "link"));
  EXPECT_EQ(FileManager::readFile(directory.url("docs/file")).view(), "new");
  EXPECT_EQ(FileManager::readFile(directory.url("docs/new")).view(), "made");
  EXPECT_EQ(fs::status(file).permissions(), fs::perms(0640));
  char value[3] = {};
  EXPECT_EQ(::getxattr(file.c_str(), "user.kept", value, 3), hasAttributes ? 3 : -1);

  const auto write = [&](const char* path) {
    return errorOf([&] { FileManager::writeFileAtomically(directory.url(path), Data(std::string("x"))); });
  };
  ASSERT_EQ(::mkfifo((directory.path() / "docs/pipe").c_str(), 0600), 0);
  EXPECT_EQ(write("docs/sub"), EISDIR);
  EXPECT_EQ(write("docs/pipe"), EINVAL);
  EXPECT_EQ(write("loop"), ELOOP);
  EXPECT_EQ(write("none/file"), ENOENT);
  EXPECT_EQ(FileManager::contentsOfDirectory(directory.url("docs"), false),
            (std::vector<std::string>{"file", "new", "pipe", "sub"}));
}

}  // namespace
}  // namespace MarletFoundation::test
