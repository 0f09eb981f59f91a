#include "MarletFoundation/Platform/URL.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <filesystem>

#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

TEST(URL, FilePathsKeepTheirBytes) {
  struct Row {
    std::string path, last, extension, absolute;
  };
  const Row rows[] = {
      {"/", "/", "", "file:///"},
      {"/a/b.txt", "b.txt", "txt", "file:///a/b.txt"},
      {"/a b/%41?#.x y", "%41?#.x y", "x y", "file:///a%20b/%2541%3F%23.x%20y"},
      {"/\xC3\xA9/.hidden", ".hidden", "", "file:///%C3%A9/.hidden"},
      {"/a/name.", "name.", "", "file:///a/name."},
      {"/a/b.tar.gz", "b.tar.gz", "gz", "file:///a/b.tar.gz"},
  };
  for (const auto& row : rows) {
    const auto url = URL::file(row.path);
    EXPECT_EQ(url.path(), row.path);
    EXPECT_EQ(url.lastPathComponent(), row.last) << row.path;
    EXPECT_EQ(url.pathExtension(), row.extension) << row.path;
    EXPECT_EQ(url.absoluteString(), row.absolute);
    EXPECT_EQ(URL::parse(row.absolute), url);
    EXPECT_TRUE(url.isFileURL());
    EXPECT_EQ(url.scheme(), "file");
  }
  EXPECT_EQ(URL::file("x/y").path(), (std::filesystem::current_path() / "x/y").string());
}

TEST(URL, TheDirectoryMarkIsPartOfTheURL) {
  const auto directory = URL::file("/a/b/");
  EXPECT_EQ(directory, URL::file("/a/b", true));
  EXPECT_NE(directory, URL::file("/a/b"));
  EXPECT_EQ(directory.path(), "/a/b");
  EXPECT_EQ(directory.absoluteString(), "file:///a/b/");
  EXPECT_EQ(URL::parse("file:///a/b/"), directory);
  EXPECT_EQ(URL::file("/a").appendingPathComponent("b/"), directory);
  EXPECT_EQ(URL::file("/a/b/c").deletingLastPathComponent(), directory);
  EXPECT_EQ(URL::file("/").deletingLastPathComponent().path(), "/");
}

TEST(URL, JoiningAppendsComponents) {
  const auto base = URL::file("/a/b", true);
  EXPECT_EQ(base.appendingPathComponent("c d/../?e").path(), "/a/b/c d/../?e");
  EXPECT_EQ(base.appendingPathComponent("/c//"), URL::file("/a/b/c", true));
  EXPECT_EQ(base.appendingPathComponent(""), base);
  EXPECT_EQ(base.appendingPathComponent("/"), base);
  EXPECT_EQ(URL::file("/").appendingPathComponent("c").path(), "/c");
  EXPECT_EQ(base.appendingPathExtension("delta").path(), "/a/b.delta");
  EXPECT_EQ(URL::file("/").appendingPathExtension("x").path(), "/");
  EXPECT_EQ(URL::parse("http://a/b/?c#d")->appendingPathExtension("x y").absoluteString(),
            "http://a/b.x%20y/?c#d");
  EXPECT_EQ(URL::parse("http://a/")->appendingPathExtension("x").absoluteString(), "http://a/");
  const auto web = *URL::parse("http://host?q#f");
  EXPECT_EQ(web.appendingPathComponent("a b").absoluteString(), "http://host/a%20b?q#f");
  EXPECT_EQ(web.appendingPathComponent("a/b").deletingLastPathComponent().absoluteString(),
            "http://host/a/?q#f");
}

TEST(URL, OnlyStrictReferencesParse) {
  for (const char* text : {"", "a b", " a", "\xC3\xA9.png", "%zz", "a%", "1a:b", ":a", "http://[::1", "a\\b",
                           "a\n", "<a>", "a\"b", "http://h/^"}) {
    EXPECT_FALSE(URL::parse(text)) << text;
  }
  EXPECT_FALSE(URL::parse(std::string_view("a\0b", 3)));
  const std::pair<const char*, std::optional<std::string>> schemes[] = {
      {"Image.png", std::nullopt}, {"a/b:c", std::nullopt}, {"./a:b", std::nullopt}, {"/abs", std::nullopt},
      {"//host/a", std::nullopt},  {"#f", std::nullopt},    {"http://x/y", "http"},  {"a:b", "a"},
      {"mailto:x@y", "mailto"},    {"file:///x", "file"},   {"C:/x", "C"},
  };
  for (const auto& [text, scheme] : schemes) {
    ASSERT_TRUE(URL::parse(text)) << text;
    EXPECT_EQ(URL::parse(text)->scheme(), scheme) << text;
  }
}

TEST(URL, RelativeReferencesResolveAgainstTheirBase) {
  const auto base = URL::file("/a b/c", true);
  const auto relative = *URL::parse("../d%20e/f?q", &base);
  EXPECT_EQ(relative.absoluteString(), "file:///a%20b/d%20e/f?q");
  EXPECT_EQ(relative.path(), "/a b/d e/f");
  EXPECT_EQ(relative.relativeString(), "../d%20e/f?q");
  EXPECT_EQ(relative.baseURL(), base);
  EXPECT_EQ(relative.scheme(), "file");
  EXPECT_TRUE(relative.isFileURL());
  EXPECT_NE(relative, *URL::parse("../d%20e/f?q"));
  EXPECT_EQ(URL::parse("x", &relative)->absoluteString(), "file:///a%20b/d%20e/x");
  EXPECT_EQ(URL::parse("http://x/y", &base)->baseURL(), std::nullopt);
}

TEST(URL, StandardizingGoesByTheTextAlone) {
  const std::pair<const char*, const char*> rows[] = {
      {"/a/./b//c/../d", "/a/b/d"}, {"/../../a", "/a"}, {"/a/..", "/"}, {"/", "/"}, {"//a", "/a"}};
  for (const auto& [path, expected] : rows) EXPECT_EQ(URL::file(path).standardized().path(), expected);
  EXPECT_EQ(URL::file("/a/../b").standardized().pathComponents(), (std::vector<std::string>{"/", "b"}));
}

TEST(URL, SymlinksOfTheExistingPartAreResolved) {
  const TemporaryDirectory directory;
  std::filesystem::create_directories(directory.path() / "real/inner");
  std::filesystem::create_directory_symlink("real", directory.path() / "link");
  std::filesystem::create_symlink("loop", directory.path() / "loop");
  EXPECT_EQ(directory.url("link/inner/none/x").resolvingSymlinksInPath(), directory.url("real/inner/none/x"));
  EXPECT_EQ(directory.url("link").resolvingSymlinksInPath(), directory.url("real"));
  EXPECT_EQ(directory.url("loop/x").resolvingSymlinksInPath(), directory.url("loop/x"));
}

RC_GTEST_PROP(URL, PrintedFileURLsParseBack, (const std::string& name, bool isDirectory)) {
  RC_PRE(name.find('\0') == std::string::npos);
  const auto url = URL::file("/root", true).appendingPathComponent(name, isDirectory);
  RC_ASSERT(URL::parse(url.absoluteString()) == url);
}

}  // namespace
}  // namespace MarletFoundation::test
