#include "MarletDiff/RecursiveFileDiff.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;

/// Two trees on disk and how they differ, one entry a word.
class Trees {
 public:
  fs::path original() const { return directory_.path() / "old"; }
  fs::path updated() const { return directory_.path() / "new"; }

  Trees(const Tree& before, const Tree& after) {
    fs::create_directories(original());
    fs::create_directories(updated());
    before.writeTo(original());
    after.writeTo(updated());
  }

  std::vector<MarletDiff::FileDiffDescriptor> diff() const {
    return MarletDiff::recursiveFileDiff(directory_.url("old"), directory_.url("new"),
                                         MarletDiff::DiffOptions::SmallerHunks);
  }
  std::string changes() const {
    static constexpr char marks[] = {'+', '-', 'M', 'R'};
    std::string words;
    try {
      for (const auto& entry : diff()) (words += marks[entry.change.index()]) += entry.filePath() + " ";
    } catch (const ErrorObject& error) {
      return std::string(error.domain()) + " " + std::to_string(error.code());
    }
    return words;
  }

 private:
  TemporaryDirectory directory_;
};

TEST(RecursiveFileDiff, TellsHowEachFileDiffers) {
  const Trees trees({{"a", "1\n"},
                     {"b/c", "same"},
                     {"b/gone", ""},
                     {"bad",
                      "\xFF"
                      "1"},
                     {"control", "a\x01"},
                     {"d.e", "x"},
                     {"d/f", "1"},
                     {"file", "1"},
                     {"tree/x", "1"},
                     {"tree/y/z", "1"},
                     {"turnsBad", "1"}},
                    {{"a", "2\n"},
                     {"b/c", "same"},
                     {"b/new/deep", ""},
                     {"bad",
                      "\xFF"
                      "2"},
                     {"control", "b\x01"},
                     {"d.e", "xy"},
                     {"d/f", "2"},
                     {"empty/", ""},
                     {"file/inside", "1"},
                     {"tree", "1"},
                     {"turnsBad", "\xC0"}});
  EXPECT_EQ(trees.changes(),
            "Ma -b/gone +b/new/deep Rbad Rcontrol Md/f Md.e -file +file/inside -tree/x -tree/y/z +tree "
            "RturnsBad ");
  const auto modified = std::get<MarletDiff::FileDiffDescriptor::Modified>(trees.diff()[0].change);
  ASSERT_EQ(modified.diff.size(), 1u);
  EXPECT_EQ(modified.diff[0], (MarletDiff::DiffDescriptor{{0, 1}, {0, 1}, u"1", u"2"}));
}

TEST(RecursiveFileDiff, ComparesLinksAsLinks) {
  const Trees trees({{"linked", "same"}, {"to/x", "1"}, {"z", "1"}},
                    {{"linked", "same"}, {"to/x", "2"}, {"z", "1"}});
  const auto link = [&](const char* name, const char* before, const char* after) {
    if (before) fs::create_symlink(before, trees.original() / name);
    if (after) fs::create_symlink(after, trees.updated() / name);
  };
  link("same", "to", "to");
  link("other", "to", "/etc");
  link("added", nullptr, "/etc/passwd");
  link("broken", "nowhere", nullptr);
  link("loop", ".", ".");
  fs::remove(trees.updated() / "linked");
  link("linked", nullptr, "z");
  EXPECT_EQ(trees.changes(), "+added -broken Rlinked Rother Mto/x ");
}

/// The bytes decide, wherever in a file they differ and however they came there.
TEST(RecursiveFileDiff, ComparesLargeFilesToTheEnd) {
  const std::string large(300'000, 'x');
  const Trees trees({{"end", large + "1"}, {"same", large}, {"twin", large}},
                    {{"end", large + "2"}, {"same", large}});
  fs::create_hard_link(trees.original() / "twin", trees.updated() / "twin");
  EXPECT_EQ(trees.changes(), "Mend ");
}

TEST(RecursiveFileDiff, FailsOnWhatItCannotRead) {
  Trees trees({{"d/a", ""}}, {{"d/a", ""}});
  EXPECT_THROW(MarletDiff::recursiveFileDiff(URL::file("/nonexistent"), URL::file("/")), ErrorObject);
  ::mkfifo((trees.updated() / "d" / "pipe").c_str(), 0600);
  EXPECT_EQ(trees.changes(), "POSIX " + std::to_string(EINVAL));
  fs::remove(trees.updated() / "d" / "pipe");
  // A directory deeper than a path can say ends the walk and not the stack.
  const auto here = fs::current_path();
  fs::current_path(trees.updated());
  const std::string name(200, 'n');
  for (int i = 0; i < 30; ++i) {
    fs::create_directory(name);
    fs::current_path(name);
  }
  std::fclose(std::fopen("file", "w"));
  fs::current_path(here);
  EXPECT_EQ(trees.changes(), "POSIX " + std::to_string(ENAMETOOLONG));
}

}  // namespace
}  // namespace MarletFoundation::test
