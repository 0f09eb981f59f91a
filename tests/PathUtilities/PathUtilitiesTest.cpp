#include <gtest/gtest.h>

#include <filesystem>

#include "MarletFoundation/PathUtilities/DocumentPath.h"
#include "MarletFoundation/PathUtilities/PathUniquifier.h"
#include "MarletFoundation/PathUtilities/URLExtensions.h"
#include "support/ChangedHost.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

/// Another documents directory for the length of a test.
struct Documents : ChangedHost {
  explicit Documents(const std::optional<URL>& directory)
      : ChangedHost([&](HostEnvironment& host) { host.documentsDirectory = directory; }) {}
};

std::string uniqueString(std::vector<std::string> strings) {
  return mlf_uniqueStringWithDistinguishingStrings(strings);
}

TEST(PathUniquifier, IsTheDigestInLetters) {
  // Made with another implementation of MD5 and base 26.
  EXPECT_EQ(uniqueString({"/nowhere/at/all.marletbook"}), "etfiglwpvqxjtabtnmiexnzbspwf");
  EXPECT_EQ(uniqueString({"/nowhere/", "at/all", "", ".marletbook"}), "etfiglwpvqxjtabtnmiexnzbspwf");
  EXPECT_EQ(pathUniquifier(URL::file("/nowhere/at/all.marletbook")), "etfiglwpvqxjtabtnmiexnzbspwf");
}

TEST(PathUniquifier, OutlivesAMoveOfTheDocumentsDirectory) {
  const TemporaryDirectory directory;
  for (const char* documents : {"one/Documents", "two"}) {
    std::filesystem::create_directories(directory.path() / documents / "A/Book.marletbook");
    const Documents named(directory.url(documents));
    const auto book = directory.url(documents).appendingPathComponent("A/Book.marletbook", true);
    EXPECT_EQ(pathUniquifier(book), "aauzyukyooftldgiglkcpeovonqa");
    EXPECT_EQ(pathUniquifier(directory.url(documents)), uniqueString({"LocalDocuments/"}));
    const auto missing = directory.url(documents).appendingPathComponent("None.marletbook");
    EXPECT_EQ(pathUniquifier(missing), uniqueString({missing.path()}));
  }
  // A link into the documents is one of them; a link out of them isn't.
  const Documents named(directory.url("two"));
  std::filesystem::create_directory_symlink("two/A/Book.marletbook", directory.path() / "in");
  std::filesystem::create_directory_symlink("../one", directory.path() / "two/out");
  EXPECT_EQ(pathUniquifier(directory.url("in")), "aauzyukyooftldgiglkcpeovonqa");
  EXPECT_EQ(pathUniquifier(directory.url("two/out")), uniqueString({directory.url("two/out").path()}));
  const Documents none(std::nullopt);
  EXPECT_EQ(pathUniquifier(directory.url("two/A")), uniqueString({directory.url("two/A").path()}));
}

TEST(PathUniquifier, NeedsAPath) {
  EXPECT_EQ(fatalMessage([] { pathUniquifier(*URL::parse("http://host")); }),
            "URLs must have a path to have a pathUniquifier!");
}

TEST(DocumentPath, IsRelativeToTheContent) {
  const auto content = URL::file("/b/./Contents", true);
  const std::pair<const char*, const char*> rows[] = {
      {"/b/Contents/Chapters/C/Pages/P", "Chapters/C/Pages/P/f"},
      {"/b/x/../Contents//P/", "P/f"},
      {"/b/Contents", "f"},
      {"/b", "f"},
      {"/b/Other/P", "Other/P/f"},
  };
  for (const auto& [page, expected] : rows) {
    EXPECT_EQ(documentRelativePath(URL::file(page), "f", content), expected) << page;
  }
  EXPECT_EQ(documentRelativePath(URL::file("/p"), "f", *URL::parse("http://host")), "/p/f");
}

TEST(URLExtensions, DirectoriesAndRelativeURLs) {
  const TemporaryDirectory directory;
  std::filesystem::create_directory_symlink(".", directory.path() / "link");
  std::filesystem::create_symlink("none", directory.path() / "dangling");
  EXPECT_TRUE(isDirectoryUrl(directory.url()));
  EXPECT_TRUE(isDirectoryUrl(directory.url("link")));
  EXPECT_FALSE(isDirectoryUrl(directory.url("dangling")));
  EXPECT_FALSE(isDirectoryUrl(*URL::parse("http://host/")));
  EXPECT_FALSE(isDirectoryUrl(URL::file(std::string_view("/\0x", 3))));

  const auto base = URL::file("/base", true);
  const auto other = URL::file("/other", true);
  EXPECT_EQ(relative(*URL::parse("a/b", &other), std::nullopt), URL::parse("a/b", &other));
  EXPECT_EQ(relative(*URL::parse("a/b", &other), base)->path(), "/base/a/b");
  EXPECT_EQ(relative(URL::file("/a b"), base), URL::file("/a b"));
}

}  // namespace
}  // namespace MarletFoundation::test
