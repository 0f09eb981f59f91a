#include <fcntl.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <functional>
#include <future>
#include <map>
#include <thread>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/FileWrapper.h"
#include "support/Failure.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

FileWrapper file(std::string_view name, std::string text) {
  auto wrapper = FileWrapper::regularFile(Data(std::move(text)));
  wrapper.setPreferredFilename(std::string(name));
  return wrapper;
}

std::string text(const fs::path& path) {
  std::ifstream stream(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), {}};
}

std::vector<std::string> names(const TemporaryDirectory& directory) {
  return FileManager::contentsOfDirectory(directory.url(), false);
}

int errorOfWriting(const FileWrapper& wrapper, const URL& url,
                   ExistingItem existing = ExistingItem::Replaced) {
  const auto error = errorOf([&] { wrapper.write(url, existing); });
  return error ? error->code() : 0;
}

ino_t number(const fs::path& path) {
  struct stat status {};
  ::lstat(path.c_str(), &status);
  return status.st_ino;
}

TEST(FileWrapperWriting, TakesThePlaceOfWhatWasThere) {
  const TemporaryDirectory directory;
  const Tree tree{{"a/b", "1"s}, {"empty/", ""s}, {"c", ""s}};
  const auto target = directory.path() / "book";
  fs::create_symlink("book", directory.path() / "link");
  for (const bool isThere : {false, true}) {
    tree.wrapper().write(directory.url("link"));
    EXPECT_EQ(text(target / "a/b"), "1");
    EXPECT_TRUE(fs::is_directory(target / "empty") && fs::exists(target / "c") &&
                !fs::exists(target / "old"));
    EXPECT_TRUE(fs::is_symlink(directory.path() / "link")) << isThere;
    std::ofstream(target / "old");
  }
  file("x", "file").write(directory.url("book"));
  EXPECT_EQ(text(target), "file");
  tree.wrapper().write(directory.url("book"));
  EXPECT_EQ(text(target / "a/b"), "1");
  FileWrapper(directory.url("book/a/b")).write(directory.url("copy"));
  EXPECT_EQ(text(directory.path() / "copy"), "1");
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book", "copy", "link"}));
}

TEST(FileWrapperWriting, KeepsWhatIsToBeKept) {
  const TemporaryDirectory directory;
  Tree{{"file", "1"s}, {"book/file", "1"s}}.writeTo(directory.path());
  fs::create_symlink("nowhere", directory.path() / "link");
  const Tree tree{{"file", "2"s}};
  for (const char* name : {"file", "book", "link"})
    EXPECT_EQ(errorOfWriting(tree.wrapper(), directory.url(name), ExistingItem::Kept), EEXIST) << name;
  EXPECT_EQ(text(directory.path() / "book/file"), "1");
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book", "file", "link"}));

  // Of those who write one name at the same time, one makes it, and what that one wrote stays.
  for (int round = 0; round < 20; ++round) {
    const auto url = directory.url("new" + std::to_string(round));
    std::array<int, 4> errors{};
    std::vector<std::thread> writers;
    for (std::size_t i = 0; i < errors.size(); ++i) {
      writers.emplace_back([&, i] {
        errors[i] = errorOfWriting(Tree{{"file", std::to_string(i)}}.wrapper(), url, ExistingItem::Kept);
      });
    }
    for (auto& writer : writers) writer.join();
    const auto winner = std::find(errors.begin(), errors.end(), 0);
    ASSERT_NE(winner, errors.end());
    EXPECT_EQ(std::count(errors.begin(), errors.end(), EEXIST), std::ssize(errors) - 1);
    EXPECT_EQ(text(url.path() + "/file"), std::to_string(winner - errors.begin()));
  }
}

TEST(FileWrapperWriting, KeepsWhatADocumentIsMadeOf) {
  const TemporaryDirectory directory;
  Tree{{"book/same", "1"s}, {"book/loaded", "2"s}, {"book/new", "3"s}, {"book/sub/x", "4"s}}.writeTo(
      directory.path());
  const auto book = directory.path() / "book";
  fs::create_symlink("../nowhere", book / "link");
  fs::permissions(book / "new", fs::perms(0600));
  fs::permissions(book / "sub", fs::perms(0510));
  const bool hasAttributes = ::setxattr((book / "sub").c_str(), "user.kept", "yes", 3, 0) == 0 &&
                             ::setxattr((book / "new").c_str(), "user.kept", "yes", 3, 0) == 0;
  const auto same = number(book / "same"), loaded = number(book / "loaded"), replaced = number(book / "new");

  FileWrapper root(directory.url("book"));
  EXPECT_EQ(root.child("loaded")->regularFileContents()->view(), "2");
  root.addFileWrapper(file("new", "changed"));
  root.write(directory.url("book"));
  EXPECT_EQ(number(book / "same"), same);
  EXPECT_EQ(number(book / "loaded"), loaded);
  EXPECT_NE(number(book / "new"), replaced);
  EXPECT_EQ(text(book / "new"), "changed");
  EXPECT_EQ(fs::status(book / "new").permissions(), fs::perms(0600));
  EXPECT_EQ(fs::status(book / "sub").permissions(), fs::perms(0510));
  EXPECT_EQ(fs::read_symlink(book / "link"), "../nowhere");
  for (const char* name : {"sub", "new"}) {
    char value[3] = {};
    EXPECT_EQ(::getxattr((book / name).c_str(), "user.kept", value, 3), hasAttributes ? 3 : -1);
  }
  // The wrapper goes on in the new tree, and a copy elsewhere shares no file with it.
  EXPECT_EQ(root.child("sub")->child("x")->regularFileContents()->view(), "4");
  root.write(directory.url("elsewhere"));
  EXPECT_NE(number(directory.path() / "elsewhere/same"), same);
  EXPECT_EQ(fs::status(directory.path() / "elsewhere/sub").permissions(), fs::perms(0510));
  root.write(directory.url("book"));
  EXPECT_EQ(number(book / "same"), same);
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book", "elsewhere"}));
}

/// All paths below a directory, with what the files hold.
std::map<std::string, std::string> dump(const fs::path& directory) {
  std::map<std::string, std::string> items;
  if (!fs::exists(directory)) return items;
  for (const auto& entry : fs::recursive_directory_iterator(directory))
    items[fs::relative(entry.path(), directory).string()] =
        entry.is_regular_file() ? text(entry.path()) : "/";
  return items;
}

struct Meanwhile {
  const char* name;
  /// What the tree's owner looks at or changes, and what another does afterwards.
  std::function<void(FileWrapper)> own;
  std::function<void(const fs::path&)> other;
  int error;
};

/// Puts another directory with the same files in the place of one, as a writer of a part does.
void exchange(const fs::path& part) {
  fs::copy(part, part.string() + "2", fs::copy_options::recursive);
  fs::remove_all(part);
  fs::rename(part.string() + "2", part);
}

TEST(FileWrapperWriting, ReplacesExactlyWhatWasRead) {
  const auto nothing = [](auto&&) {};
  const auto look = [](FileWrapper root) {
    root.child("page")->child("Manifest")->regularFileContents();
    root.child("none");
  };
  const auto list = [](FileWrapper root) { root.child("page")->fileWrappers(); };
  const auto change = [](FileWrapper root) {
    root.child("page")->addFileWrapper(file("Manifest", "ours"));
    root.child("pack")->removeFileWrapper("delta");
    root.addFileWrapper(file("new", "ours"));
  };
  const auto write = [](const char* path, const char* text) {
    return [=](const fs::path& book) { std::ofstream(book / path) << text; };
  };
  const std::vector<Meanwhile> table{
      {"nothing", change, nothing, 0},
      {"a file that was read is written", look, write("page/Manifest", "other"), ESTALE},
      {"a file that nobody looked at is written", look, write("pack/delta", "other"), 0},
      {"a file that is overwritten is written", change, write("page/Manifest", "other"), ESTALE},
      {"a file that is removed is written", change, write("pack/delta", "other"), ESTALE},
      {"a file comes where one is put", change, write("new", "other"), ESTALE},
      {"a file comes where none was", look, write("none", "other"), ESTALE},
      {"a file comes to a listed directory", list, write("page/more", "other"), ESTALE},
      {"a file comes to a directory that wasn't listed", look, write("page/more", "other"), 0},
      {"a part is exchanged below", look, [](const fs::path& book) { exchange(book / "page"); }, ESTALE},
      {"a part is exchanged that nobody looked at", look,
       [](const fs::path& book) { exchange(book / "pack"); }, 0},
      {"a file goes that nobody looked at", look,
       [](const fs::path& book) { fs::remove(book / "page/Sources/a"); }, 0},
      {"a part that was read goes", look, [](const fs::path& book) { fs::remove_all(book / "page"); },
       ESTALE},
      {"all of it is exchanged", nothing, [](const fs::path& book) { exchange(book); }, ESTALE},
      {"all of it goes", nothing, [](const fs::path& book) { fs::remove_all(book); }, ESTALE},
  };
  for (const auto& row : table) {
    SCOPED_TRACE(row.name);
    const TemporaryDirectory directory;
    const auto book = directory.path() / "book";
    Tree{{"book/page/Manifest", "1"s}, {"book/page/Sources/a", "2"s}, {"book/pack/delta", "3"s}}.writeTo(
        directory.path());
    const FileWrapper root(directory.url("book"));
    row.own(root);
    row.other(book);
    const auto before = dump(book);
    EXPECT_EQ(errorOfWriting(root, directory.url("book")), row.error);
    if (row.error != 0) {
      EXPECT_EQ(dump(book), before);
    }
    EXPECT_EQ(errorOfWriting(root, directory.url("copy")), row.error);
    if (row.error == 0) {
      EXPECT_EQ(dump(directory.path() / "copy"), dump(book));
      // The tree goes on in what it wrote, and knows that from what another writes there.
      EXPECT_EQ(errorOfWriting(root, directory.url("book")), 0);
      std::ofstream(book / "page/Manifest") << "another's";
      EXPECT_EQ(errorOfWriting(root, directory.url("book")), ESTALE);
    }
  }
}

TEST(FileWrapperWriting, AReferenceIsToWhatLiesThereThen) {
  const TemporaryDirectory directory;
  Tree{{"page/Manifest", "1"s}, {"page/Sources/deep/a", "2"s}, {"page/View", "3"s}}.writeTo(directory.path());
  const auto make = [&] {
    auto page = FileWrapper::directory();
    page.addFileWrapper(file("Manifest", "new"));
    page.addFileWrapper(FileWrapper::reference(directory.url("page/Sources")));
    page.addFileWrapper(FileWrapper::reference(directory.url("page/View")));
    return page;
  };
  const auto one = make(), other = make();
  for (int round = 0; round < 2; ++round) {
    one.write(directory.url("page"));
    other.write(directory.url("page"));
  }
  EXPECT_EQ(text(directory.path() / "page/Sources/deep/a") + text(directory.path() / "page/View"), "23");
  std::ofstream(directory.path() / "page/Sources/b") << "4";
  one.write(directory.url("copy"));
  EXPECT_EQ(text(directory.path() / "copy/Sources/b"), "4");
  fs::remove_all(directory.path() / "page/Sources");
  EXPECT_EQ(errorOfWriting(one, directory.url("page")), ESTALE);
  EXPECT_EQ(errorOfWriting(make(), directory.url("page")), ESTALE);
}

TEST(FileWrapperWriting, WhatCouldNotBeReadIsNotReplaced) {
  const TemporaryDirectory directory;
  Tree{{"book/Edits/pack/delta", "a learner's"s}}.writeTo(directory.path());
  ::truncate((directory.path() / "book/Edits/pack/delta").c_str(), (off_t{1} << 30) + 1);
  const FileWrapper root(directory.url("book"));
  const auto pack = *root.child("Edits")->child("pack");
  EXPECT_FALSE(pack.child("delta")->regularFileContents());
  root.write(directory.url("book"));  // carried, not read
  auto edits = *root.child("Edits");
  EXPECT_FALSE(edits.child("pack")->child("delta")->regularFileContents());
  auto fresh = FileWrapper::directory();
  fresh.setPreferredFilename("pack");
  edits.addFileWrapper(fresh);
  EXPECT_EQ(errorOfWriting(root, directory.url("book")), EFBIG);
  EXPECT_GT(fs::file_size(directory.path() / "book/Edits/pack/delta"), std::uintmax_t{1} << 30);
}

TEST(FileWrapperWriting, RefusesWhatIsMountedBelow) {
  const TemporaryDirectory directory;
  Tree{{"book/Edits/drawing", "a learner's"s}, {"volume/drawing", "elsewhere"s}}.writeTo(directory.path());
  const auto volume = directory.path() / "volume", edits = directory.path() / "book/Edits";
  if (::mount(volume.c_str(), edits.c_str(), nullptr, MS_BIND, nullptr) != 0)
    GTEST_SKIP() << "no right to mount";
  auto root = FileWrapper(directory.url("book"));
  root.addFileWrapper(file("new", "1"));
  EXPECT_EQ(errorOfWriting(root, directory.url("book")), EBUSY);
  std::promise<ErrorObject> failure;
  FileManager::asynchronouslyRemoveItem(directory.url("book"), [&](const std::optional<ErrorObject>& error) {
    failure.set_value(error.value_or(ErrorObject::posix(0, "")));
  });
  const auto error = failure.get_future().get();
  EXPECT_EQ(error.code(), EBUSY);
  EXPECT_EQ(text(volume / "drawing"), "elsewhere");
  const fs::path aside(std::get<std::string>(error.userInfo().at(std::string(FilePathKey))));
  EXPECT_EQ(::umount((aside / "Edits").c_str()), 0);
  EXPECT_EQ(text(aside / "Edits/drawing"), "a learner's");
  fs::remove_all(aside);
}

TEST(FileWrapperWriting, AFailureLeavesTheOldDocument) {
  const TemporaryDirectory directory;
  Tree{{"book/a", "old"s}, {"pipes/a", "new"s}}.writeTo(directory.path());
  ASSERT_EQ(::mkfifo((directory.path() / "pipes/z").c_str(), 0600), 0);
  const auto failing = [](std::string_view badName) {
    auto sub = FileWrapper::directory();
    sub.setPreferredFilename("sub");
    sub.addFileWrapper(file(badName, "new"));
    auto root = FileWrapper::directory();
    root.addFileWrapper(file("a", "new"));
    root.addFileWrapper(sub);
    return root;
  };
  for (const auto& name : {std::string(""), std::string("."), std::string(".."), std::string("../../out"),
                           std::string("a\0b", 3), std::string("/etc")}) {
    EXPECT_EQ(errorOfWriting(failing(name), directory.url("book")), EINVAL) << name;
  }
  EXPECT_EQ(errorOfWriting(failing(std::string(300, 'x')), directory.url("book")), ENAMETOOLONG);
  EXPECT_EQ(errorOfWriting(FileWrapper(directory.url("pipes")), directory.url("book")), EINVAL);
  EXPECT_EQ(errorOfWriting(FileWrapper(directory.url("pipes/z")), directory.url("book")), EINVAL);
  EXPECT_EQ(errorOfWriting(failing("x"), directory.url("none/book")), ENOENT);
  auto within = FileWrapper::directory();
  within.setPreferredFilename("within");
  within.addFileWrapper(within);
  EXPECT_EQ(errorOfWriting(within, directory.url("book")), ELOOP);
  within.removeFileWrapper("within");
  EXPECT_EQ(errorOfWriting(FileWrapper(directory.url()), directory.url("inside")), EINVAL);

  FileWrapper vanished(directory.url("pipes"));
  vanished.fileWrappers();
  fs::remove_all(directory.path() / "pipes");
  EXPECT_NE(errorOfWriting(vanished, directory.url("book")), 0);
  EXPECT_EQ(text(directory.path() / "book/a"), "old");
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book"}));
}

/// Runs a function on a thread of little stack.
void onSmallStack(std::function<void()> function) {
  pthread_attr_t attributes;
  ::pthread_attr_init(&attributes);
  ASSERT_EQ(::pthread_attr_setstacksize(&attributes, std::size_t{256} << 10), 0);
  pthread_t thread;
  const auto run = [](void* argument) -> void* {
    (*static_cast<std::function<void()>*>(argument))();
    return nullptr;
  };
  ASSERT_EQ(::pthread_create(&thread, &attributes, run, &function), 0);
  ::pthread_join(thread, nullptr);
}

TEST(FileWrapperWriting, DeeperThanTheStack) {
  constexpr int depth = 700;
  const TemporaryDirectory directory;
  onSmallStack([&] {
    auto deep = file("leaf", "here");
    for (int level = 0; level < depth; ++level) {
      auto above = FileWrapper::directory();
      above.setPreferredFilename("d");
      above.addFileWrapper(std::move(deep));
      deep = std::move(above);
    }
    deep.write(directory.url("deep"));
    FileWrapper root(directory.url("deep"));
    auto node = root;
    for (int level = 1; level < depth; ++level) node = *node.child("d");
    root.write(directory.url("deep"));
    const auto leaf = node.child("leaf");
    EXPECT_TRUE(leaf && leaf->regularFileContents()->view() == "here");
    // Also takes the deep tree away again.
    file("x", "").write(directory.url("deep"));
  });
  EXPECT_EQ(names(directory), (std::vector<std::string>{"deep"}));
}

TEST(FileWrapperWriting, SurvivesAWriterThatIsKilled) {
  const TemporaryDirectory directory;
  const auto book = directory.path() / "book";
  const auto write = [&](const std::string& version) {
    auto root = FileWrapper::directory();
    for (int i = 0; i < 20; ++i) root.addFileWrapper(file("file" + std::to_string(i), version));
    root.write(directory.url("book"));
  };
  write("0");
  for (int round = 0; round < 25; ++round) {
    const auto child = ::fork();
    if (child == 0) {
      for (int version = 0;; ++version) write(std::to_string(version));
    }
    ::usleep(static_cast<useconds_t>(1000 + 700 * round));
    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
    const auto version = text(book / "file0");
    EXPECT_FALSE(version.empty());
    for (int i = 0; i < 20; ++i) ASSERT_EQ(text(book / ("file" + std::to_string(i))), version);
  }
  write("last");
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book"}));
}

TEST(FileWrapperWriting, RecoversFromAReplacementInTwoSteps) {
  const TemporaryDirectory directory;
  Tree{{"book/file", "old"s}}.writeTo(directory.path());
  fs::rename(directory.path() / "book", directory.path() / ".book.displaced");

  FileWrapper root(directory.url("book"));
  EXPECT_EQ(root.preferredFilename(), "book");
  EXPECT_EQ(root.child("file")->regularFileContents()->view(), "old");
  root.addFileWrapper(file("more", "new"));
  root.write(directory.url("book"));
  EXPECT_EQ(text(directory.path() / "book/file") + text(directory.path() / "book/more"), "oldnew");
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book"}));
}

TEST(FileWrapperWriting, ClearsWhatDeadWritersLeftAndNothingElse) {
  const TemporaryDirectory directory;
  const std::string longName(255, 'n');
  Tree{{"book/file", "old"s},
       {".book.stage.abcdef/file", "dead"s},
       {".book.displaced/file", "done with"s},
       {".book.stage.alive1/file", "being built"s},
       {".book.stage.longer-than-that/file", "another's"s},
       {".other.stage.abcdef/file", "another's"s}}
      .writeTo(directory.path());
  const int alive = ::open((directory.path() / ".book.stage.alive1").c_str(), O_RDONLY);
  ASSERT_EQ(::flock(alive, LOCK_EX), 0);
  FileWrapper(directory.url("book")).write(directory.url("book"));
  EXPECT_EQ(names(directory), (std::vector<std::string>{".book.stage.alive1", ".book.stage.longer-than-that",
                                                        ".other.stage.abcdef", "book"}));
  ::close(alive);
  const Tree document{{"file", "1"s}};
  for (int round = 0; round < 2; ++round) document.wrapper().write(directory.url(longName));
  EXPECT_EQ(names(directory).size(), 5u);
}

TEST(FileWrapperWriting, ATreeThatWasReplacedSaysSoAndIsNotWritten) {
  const TemporaryDirectory directory;
  Tree{{"book/file", "old"s}, {"book/other", "old"s}}.writeTo(directory.path());
  const FileWrapper reader(directory.url("book")), writer(directory.url("book"));
  EXPECT_EQ(reader.child("file")->regularFileContents()->view(), "old");
  EXPECT_FALSE(reader.wasReplaced());
  auto other = FileWrapper(directory.url("book"));
  other.addFileWrapper(file("file", "new"));
  other.write(directory.url("book"));
  EXPECT_FALSE(other.wasReplaced());
  EXPECT_TRUE(reader.wasReplaced());
  EXPECT_EQ(reader.child("file")->regularFileContents()->view(), "old");
  EXPECT_FALSE(reader.child("other"));
  EXPECT_EQ(errorOfWriting(writer, directory.url("book")), ESTALE);
  EXPECT_EQ(errorOfWriting(reader, directory.url("elsewhere")), ESTALE);
  EXPECT_EQ(text(directory.path() / "book/file") + text(directory.path() / "book/other"), "newold");
  EXPECT_EQ(names(directory), (std::vector<std::string>{"book"}));
  EXPECT_EQ(errorOfWriting(other, URL::file("/proc")), EBUSY);
}

}  // namespace
}  // namespace MarletFoundation::test
