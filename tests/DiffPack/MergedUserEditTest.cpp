#include "MarletFoundation/DiffPack/MergedUserEdit.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "DiffPack/Packs.h"

namespace MarletFoundation::test {
namespace {

const Data data(std::string("carried"));
FileDiff modified(const std::string& path, MarletDiff::DiffDescriptors hunks) {
  return {FileDiff::Modified{path, std::move(hunks)}};
}

class MergedUserEdit : public testing::Test {
 protected:
  MergedUserEdit() {
    Tree{{"Contents/a/plain", std::string("plain")},
         {"Contents/text", std::string("\xef\xbb\xbfone\r\n\U0001F600")},
         {"Contents/latin", std::string("\xe4")},
         {"secret", std::string("secret")}}
        .writeTo(directory_.path());
    const auto contents = directory_.path() / "Contents";
    std::filesystem::create_symlink("../secret", contents / "link");
    std::filesystem::create_directory_symlink("..", contents / "up");
    std::filesystem::create_directory_symlink("a", contents / "b");
    ::mkfifo((contents / "pipe").c_str(), 0600);
  }

  /// What a file comes to: its text, "absent", or the error's domain and code.
  std::string merged(const std::string& path, std::vector<FileDiff> updates = {}) const {
    const DiffPackSnapshot pack(DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook,
                                directory_.url("Contents"), "name", "1", "1", std::move(updates));
    try {
      const auto contents = mergedUserEdit(pack, path);
      return contents ? std::string(contents->view()) : "absent";
    } catch (const ErrorObject& error) {
      return std::string(error.domain()) + " " + std::to_string(error.code());
    }
  }
  static std::string posix(int code) { return "POSIX " + std::to_string(code); }

  const TemporaryDirectory directory_;
  const std::vector<std::string> unreadable = {"missing",
                                               "a",
                                               "a/plain/x",
                                               "link",
                                               "up/secret",
                                               "b/plain",
                                               "..",
                                               "../secret",
                                               "a/../../secret",
                                               "pipe",
                                               "",
                                               directory_.path() / "secret",
                                               std::string("a\0b", 3)};
};

TEST_F(MergedUserEdit, WithoutAnEntryIsTheAuthoredFileIfItCanBeRead) {
  EXPECT_EQ(merged("a/plain"), "plain");
  EXPECT_EQ(merged("latin"), "\xe4");
  EXPECT_EQ(merged("a/plain", {{FileDiff::Removed{"plain"}}, {FileDiff::Removed{"a"}}}), "plain");
  for (const auto& path : unreadable) EXPECT_EQ(merged(path), "absent") << path;
}

TEST_F(MergedUserEdit, FollowsTheFirstEntry) {
  EXPECT_EQ(merged("a/plain", {{FileDiff::Removed{"a/plain"}}}), "absent");
  EXPECT_EQ(merged("a/plain", {{FileDiff::Added{"a/plain", data}}}), "carried");
  EXPECT_EQ(merged("nowhere", {{FileDiff::Replaced{"nowhere", data}}}), "carried");
  EXPECT_EQ(merged("a/plain", {{FileDiff::Added{"a/plain"}}}), "plain");
  EXPECT_EQ(merged("a/plain", {{FileDiff::Replaced{"a/plain"}}}), "plain");
  EXPECT_EQ(merged("a", {{FileDiff::Removed{"x"}},
                         {FileDiff::Added{"a", Data()}},
                         {FileDiff::Added{"Z", data}},
                         {FileDiff::Removed{"a"}},
                         {FileDiff::Replaced{"a", data}}}),
            "");
  std::vector<FileDiff> many(100, {FileDiff::Removed{"a/plain"}});
  many.front() = {FileDiff::Added{"a/plain", data}};
  EXPECT_EQ(merged("a/plain", many), "carried");
  EXPECT_EQ(merged("text", {modified("text", {})}), "\xef\xbb\xbfone\r\n\U0001F600");
  EXPECT_EQ(
      merged("text",
             {modified("text", {{{1, 3}, {}, u"one", u"zwei"}, {{6, 2}, {}, u"\U0001F600", u"\U0001F680"}})}),
      "\xef\xbb\xbfzwei\r\n\U0001F680");
}

TEST_F(MergedUserEdit, ThrowsWhereAnEntryCantBeFollowed) {
  for (const auto& path : unreadable) {
    for (const auto& update :
         {FileDiff{FileDiff::Added{path}}, FileDiff{FileDiff::Replaced{path}}, modified(path, {})}) {
      EXPECT_TRUE(merged(path, {update}).starts_with("POSIX ")) << path;
    }
  }
  EXPECT_EQ(merged("missing", {{FileDiff::Added{"missing"}}}), posix(ENOENT));
  EXPECT_EQ(merged("../secret", {modified("../secret", {})}), posix(EINVAL));
  EXPECT_EQ(merged("latin", {modified("latin", {})}), posix(EILSEQ));
  EXPECT_EQ(merged("text", {modified("text", {{{1, 3}, {}, u"two", u""}})}), "MarletDiff 4");
  EXPECT_EQ(merged("text", {modified("text", {{{7, 0}, {}, u"", u"x"}})}), "MarletDiff 3");
  EXPECT_EQ(merged("text", {modified("text", {{{0, 0}, {}, u"", {char16_t{0xD83D}}}})}), posix(EILSEQ));
}

}  // namespace
}  // namespace MarletFoundation::test
