#include "MarletFoundation/Platform/FileWrapper.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/un.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

std::optional<std::string> contents(const std::optional<FileWrapper>& file) {
  const auto data = file ? file->regularFileContents() : std::nullopt;
  return data ? std::optional(std::string(data->view())) : std::nullopt;
}

void fill(const fs::path& path, std::string_view text) { std::ofstream(path, std::ios::binary) << text; }

/// A node as a line for each item below it.
std::string listing(const FileWrapper& node, const std::string& indent = {}) {
  std::string text;
  const auto children = node.fileWrappers();
  if (!children) return text;
  for (const auto& [name, child] : *children) {
    text += indent + name + (child.isDirectory() ? "/" : child.isRegularFile() ? "" : "?");
    text += contents(child) ? "=" + *contents(child) + "\n" : "\n";
    text += listing(child, indent + " ");
  }
  return text;
}

TEST(FileWrapper, OneTreeFromMemoryAndFromDisk) {
  const Tree tree{{"a/b/c", "1"s}, {"a/.d", ""s}, {"e", std::string("\0\xFF", 2)}, {"empty/", ""s}};
  const TemporaryDirectory directory;
  tree.writeTo(directory.path());
  const FileWrapper fromDisk(directory.url());
  EXPECT_EQ(fromDisk.preferredFilename(), directory.path().filename().string());
  for (const auto& root : {tree.wrapper(), fromDisk}) {
    EXPECT_EQ(listing(root), std::string("a/\n .d=\n b/\n  c=1\ne=\0\xFF\nempty/\n", 30));
    EXPECT_TRUE(root.hasChildren());
    EXPECT_EQ(contents(root.child("a")->child("b")->child("c")), "1");
    EXPECT_EQ(root.child("a")->preferredFilename(), "a");
    EXPECT_FALSE(root.child("e")->hasChildren());
    EXPECT_FALSE(root.child("e")->child("x"));
    EXPECT_FALSE(root.child("e")->fileWrappers());
    EXPECT_FALSE(root.regularFileContents());
    const std::string endless(5000, 'x');
    for (const char* name : {"", ".", "..", "a/b", "/", "/etc", "none", endless.c_str()}) {
      EXPECT_FALSE(root.child(name)) << name;
    }
    EXPECT_FALSE(root.child(std::string_view("e\0", 2)));
  }
}

TEST(FileWrapper, OnlyTheRootMayBeALink) {
  const TemporaryDirectory directory;
  Tree{{"outside/secret", "no"s}, {"book/real/file", "yes"s}}.writeTo(directory.path());
  const auto book = directory.path() / "book";
  fs::create_directory_symlink("book", directory.path() / "link");
  fs::create_directory_symlink("../outside", book / "escape");
  fs::create_symlink("../outside/secret", book / "secret");
  fs::create_symlink("real/file", book / "inner");
  fs::create_directory_symlink(".", book / "self");
  fs::create_symlink("loop", book / "loop");
  const FileWrapper root(directory.url("link"));
  EXPECT_EQ(contents(root.child("real")->child("file")), "yes");
  for (const bool listed : {false, true}) {
    const FileWrapper again(directory.url("link"));
    if (listed) again.fileWrappers();
    for (const char* name : {"escape", "secret", "inner", "self", "loop"}) {
      const auto child = again.child(name);
      ASSERT_TRUE(child) << name;
      EXPECT_FALSE(child->isDirectory() || child->isRegularFile() || child->hasChildren()) << name;
      EXPECT_FALSE(child->child("secret") || child->regularFileContents() || child->fileWrappers()) << name;
    }
  }
  EXPECT_EQ(contents(FileWrapper(directory.url("book/secret"))), "no");
  for (const char* name : {"book/loop", "none", "book/real/file/x"}) {
    EXPECT_THROW(FileWrapper(directory.url(name)), ErrorObject) << name;
  }
  EXPECT_THROW(FileWrapper(*URL::parse("http://host/")), ErrorObject);
}

TEST(FileWrapper, NothingBlocksAndNoDeviceIsRead) {
  const TemporaryDirectory directory;
  ASSERT_EQ(::mkfifo((directory.path() / "pipe").c_str(), 0600), 0);
  sockaddr_un address{AF_UNIX, {}};
  (directory.path() / "socket").string().copy(address.sun_path, sizeof address.sun_path - 1);
  const int socket = ::socket(AF_UNIX, SOCK_STREAM, 0);
  ASSERT_EQ(::bind(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
  ::close(socket);
  const bool hasDevice = ::mknod((directory.path() / "zero").c_str(), S_IFCHR | 0666, ::makedev(1, 5)) == 0;
  for (const bool listed : {false, true}) {
    const FileWrapper root(directory.url());
    EXPECT_EQ(listed ? root.fileWrappers()->size() : 2u + hasDevice, 2u + hasDevice);
    for (const char* name : {"pipe", "socket", "zero"}) {
      const auto child = root.child(name);
      ASSERT_EQ(child.has_value(), hasDevice || std::string_view(name) != "zero");
      if (!child) continue;
      EXPECT_FALSE(child->isDirectory() || child->isRegularFile() || child->regularFileContents()) << name;
    }
  }
  const FileWrapper pipe(directory.url("pipe"));
  EXPECT_FALSE(pipe.isDirectory() || pipe.isRegularFile() || pipe.regularFileContents());
}

TEST(FileWrapper, WhatWasLookedAtStays) {
  const TemporaryDirectory directory;
  Tree{{"read", "old"s}, {"gone", "old"s}, {"sub/file", "old"s}}.writeTo(directory.path());
  const FileWrapper root(directory.url());
  EXPECT_EQ(contents(root.child("read")), "old");
  EXPECT_FALSE(root.child("late"));
  fill(directory.path() / "read", "new");
  fill(directory.path() / "late", "new");
  EXPECT_EQ(contents(root.child("read")), "old");
  EXPECT_FALSE(root.child("late"));
  EXPECT_EQ(listing(root), "gone=old\nread=old\nsub/\n file=old\n");
}

TEST(FileWrapper, ReadsTheTreeThatItOpenedWhenThePathNamesAnother) {
  const TemporaryDirectory directory;
  Tree{{"book/sub/file", "old"s}, {"other/sub/file", "new"s}}.writeTo(directory.path());
  const FileWrapper root(directory.url("book"));
  fs::rename(directory.path() / "book", directory.path() / "moved");
  fs::rename(directory.path() / "other", directory.path() / "book");
  EXPECT_EQ(contents(root.child("sub")->child("file")), "old");
}

TEST(FileWrapper, FilesThatChangeBetweenLookAndRead) {
  const std::string large(100000, 'x');
  struct Row {
    const char* what;
    std::function<void(const fs::path&)> change;
    /// Of a file that was only listed, or that the tree had to close meanwhile.
    std::optional<std::string> expected;
    /// Whether another item took the name, while the one that was looked at is still open.
    bool isReplaced = false;
  };
  const Row rows[] = {
      {"cut short", [](const fs::path& path) { fs::resize_file(path, 3); }, "xxx"},
      {"grown", [&](const fs::path& path) { fill(path, large + large); }, large + large},
      {"emptied", [](const fs::path& path) { fs::resize_file(path, 0); }, ""},
      {"removed", [](const fs::path& path) { fs::remove(path); }, std::nullopt, true},
      {"a pipe", [](const fs::path& path) { fs::remove(path), ::mkfifo(path.c_str(), 0600); }, std::nullopt,
       true},
      {"a directory", [](const fs::path& path) { fs::remove(path), fs::create_directory(path); },
       std::nullopt, true},
      {"a link", [](const fs::path& path) { fs::remove(path), fs::create_symlink("/etc/passwd", path); },
       std::nullopt, true},
      {"huge", [](const fs::path& path) { fs::resize_file(path, std::uintmax_t{1} << 40); }, std::nullopt},
  };
  enum class Look { listed, open, closed };
  for (const auto& row : rows) {
    for (const auto look : {Look::listed, Look::open, Look::closed}) {
      const TemporaryDirectory directory;
      fill(directory.path() / "file", large);
      for (int i = 0; i < 100; ++i) fill(directory.path() / std::to_string(i), "");
      const FileWrapper root(directory.url());
      if (look == Look::listed) root.fileWrappers();
      const auto file = root.child("file");
      ASSERT_TRUE(file && file->isRegularFile());
      for (int i = 0; look == Look::closed && i < 100; ++i) root.child(std::to_string(i));
      row.change(directory.path() / "file");
      const auto expected = look == Look::open && row.isReplaced ? large : row.expected;
      EXPECT_TRUE(contents(file) == expected) << row.what;
      EXPECT_TRUE(contents(file) == expected) << row.what << ", again";
    }
  }
}

TEST(FileWrapper, DirectoriesThatChangeAfterTheirLook) {
  const TemporaryDirectory directory;
  Tree{{"outside/file", "no"s}, {"book/sub/inner/file", "yes"s}}.writeTo(directory.path());
  const FileWrapper root(directory.url("book"));
  root.fileWrappers();
  const auto sub = root.child("sub");
  ASSERT_TRUE(sub->isDirectory());
  fs::rename(directory.path() / "book/sub", directory.path() / "book/aside");
  fs::create_directory_symlink("../outside", directory.path() / "book/sub");
  EXPECT_TRUE(sub->isDirectory());
  EXPECT_FALSE(sub->hasChildren());
  EXPECT_FALSE(sub->child("file"));
}

TEST(FileWrapper, WhatCannotBeReadShowsAsAbsent) {
  if (::geteuid() == 0) GTEST_SKIP() << "root reads everything";
  const TemporaryDirectory directory;
  Tree{{"closed/file", "x"s}, {"file", "x"s}}.writeTo(directory.path());
  fs::permissions(directory.path() / "closed", fs::perms::none);
  fs::permissions(directory.path() / "file", fs::perms::none);
  const FileWrapper root(directory.url());
  EXPECT_TRUE(root.child("file")->isRegularFile());
  EXPECT_FALSE(root.child("file")->regularFileContents());
  EXPECT_TRUE(root.child("closed")->isDirectory());
  EXPECT_FALSE(root.child("closed")->hasChildren() || root.child("closed")->child("file"));
  fs::permissions(directory.path() / "closed", fs::perms::owner_all);
}

TEST(FileWrapper, GetsByWithFewDescriptors) {
  const TemporaryDirectory directory;
  for (int i = 0; i < 100; ++i) {
    const auto sub = directory.path() / std::to_string(i);
    fs::create_directories(sub / "deep/deeper");
    fill(sub / "deep/deeper/file", std::to_string(i));
  }
  rlimit before;
  ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &before), 0);
  const FileWrapper root(directory.url());
  std::vector<FileWrapper> kept;
  const rlimit few{static_cast<rlim_t>(::dup(0) + 6), before.rlim_max};
  ::setrlimit(RLIMIT_NOFILE, &few);
  for (int i = 0; i < 100; ++i) kept.push_back(*root.child(std::to_string(i))->child("deep"));
  int found = 0;
  for (int i = 0; i < 100; ++i)
    found += contents(kept[i].child("deeper")->child("file")) == std::to_string(i);
  const bool isListed = root.fileWrappers()->size() == 100;
  ::setrlimit(RLIMIT_NOFILE, &before);
  EXPECT_EQ(found, 100);
  EXPECT_TRUE(isListed);
}

TEST(FileWrapper, ChildrenAreAddedAndRemovedInAnyTree) {
  const TemporaryDirectory directory;
  const Tree tree{{"a", "1"s}, {"b/c", "2"s}};
  tree.writeTo(directory.path());
  for (auto root : {tree.wrapper(), FileWrapper(directory.url())}) {
    auto replacement = FileWrapper::regularFile(Data(std::string("3")));
    replacement.setPreferredFilename("a");
    root.addFileWrapper(replacement);
    root.removeFileWrapper("none");
    root.removeFileWrapper("b");
    EXPECT_FALSE(root.child("b"));
    auto copy = FileWrapper(directory.url("b"));
    copy.setPreferredFilename("d");
    root.addFileWrapper(copy);
    EXPECT_EQ(listing(root), "a=3\nd/\n c=2\n");
  }
  auto file = FileWrapper::regularFile({});
  EXPECT_NE(fatalMessage([&] { FileWrapper::directory().addFileWrapper(file); }), "");
  EXPECT_NE(fatalMessage([&] { file.addFileWrapper(FileWrapper(directory.url())); }), "");
}

}  // namespace
}  // namespace MarletFoundation::test
