#include <gtest/gtest.h>
#include <sys/stat.h>

#include <fstream>

#include "ArcCopier/Extraction.h"
#include "support/Zip.h"

namespace fs = std::filesystem;

namespace MarletFoundation::test {
namespace {

using Files = std::map<std::string, std::string>;

TEST(ArcCopier, ExtractsWhatGoodArchivesHold) {
  struct Row {
    const char* kind;
    std::string archive;
    Files files;
  };
  const auto plain = zeros("zeros", 100'000);
  const Row rows[] = {
      {"empty", zip({}), {}},
      {"directories, before and behind what is in them",
       zip({{.name = "a/b/c", .contents = "c"}, {.name = "a/", .mode = 040755}, {.name = "d/", .mode = 0}}),
       {{"a", "/"}, {"a/b", "/"}, {"a/b/c", "c"}, {"d", "/"}}},
      {"paths from here",
       zip({{.name = "./", .mode = 040755}, {.name = "./a", .contents = "a"}}),
       {{"a", "a"}}},
      {"names in capitals",
       zip({{.name = "a", .contents = "small"}, {.name = "A", .contents = "large"}}),
       {{"A", "large"}, {"a", "small"}}},
      {"comment", zip({{.name = "a"}}, {.comment = "made by hand"}), {{"a", ""}}},
      {"zip64",
       zip({{.name = "a", .contents = "a", .isZip64 = true}, {.name = "b"}}, {.isZip64 = true}),
       {{"a", "a"}, {"b", ""}}},
      {"data descriptors",
       zip({{.name = "a", .contents = "stored", .flags = 8}, {.name = "b", .flags = 8}}),
       {{"a", "stored"}, {"b", ""}}},
      {"deflated", zip({plain}), {{"zeros", std::string(100'000, '\0')}}},
      {"marked UTF-8", zip({{.name = "h\u00E9", .flags = 1 << 11}}), {{"h\u00E9", ""}}},
      {"unmarked UTF-8", zip({{.name = "h\u00E9"}}), {{"h\u00E9", ""}}},
      {"code page 437", zip({{.name = "h\x82llo \xE1\xFF"}}), {{"h\u00E9llo \u00DF\u00A0", ""}}},
  };
  for (const auto& [kind, archive, files] : rows) {
    SCOPED_TRACE(kind);
    Extraction extraction(archive);
    extraction.run();
    EXPECT_EQ(extraction.result, ArcCopierSuccess);
    EXPECT_EQ(extraction.files(), files);
    EXPECT_EQ(extraction.started, extraction.finished);
  }
}

TEST(ArcCopier, DirectoriesStartLikeFilesWithoutTheirSlash) {
  Extraction extraction(zip({{.name = "Top/", .mode = 040755}, {.name = "Top/a"}, {.name = "Top/b/"}}));
  extraction.run();
  EXPECT_EQ(extraction.started, (std::vector<std::string>{"Top", "Top/a", "Top/b"}));
}

TEST(ArcCopier, KeepsPermissionsAndDropsSpecialBits) {
  const auto mask = ::umask(022);
  Extraction extraction(zip({{.name = "script", .contents = "#!", .mode = 0106755},
                             {.name = "unknown", .mode = 0},
                             {.name = "closed/", .mode = 041500}}));
  extraction.run();
  ::umask(mask);
  EXPECT_EQ(extraction.result, ArcCopierSuccess);
  const auto permissions = [&](const char* name) {
    return static_cast<unsigned>(fs::status(extraction.destination() / name).permissions());
  };
  EXPECT_EQ(permissions("script"), 0755u);
  EXPECT_EQ(permissions("unknown"), 0644u);
  EXPECT_EQ(permissions("closed"), 0700u);
}

TEST(ArcCopier, WhatIsThereStaysAndLinksAreNotFollowed) {
  Extraction extraction(zip({{.name = "kept", .contents = "new"},
                             {.name = "directory", .contents = "new"},
                             {.name = "other/a", .contents = "a"},
                             {.name = "kept/below", .contents = "new"},
                             {.name = "link", .contents = "new"},
                             {.name = "out/direct", .contents = "new"},
                             {.name = "out/deep/indirect", .contents = "new"},
                             {.name = "out/", .mode = 040755},
                             {.name = "dangling/", .mode = 040755}}));
  const auto outside = TemporaryDirectory();
  const auto destination = extraction.destination();
  fs::create_directory(outside.path() / "deep");
  fs::create_directories(destination / "directory");
  fs::create_directories(destination / "other");
  std::ofstream(destination / "kept") << "old";
  fs::create_symlink(outside.path() / "nothing", destination / "link");
  fs::create_symlink(outside.path(), destination / "out");
  fs::create_symlink(outside.path() / "nothing", destination / "dangling");
  extraction.run();
  EXPECT_EQ(extraction.result, ArcCopierSomeFilesFailed);
  EXPECT_TRUE(fs::is_empty(outside.path() / "deep"));
  EXPECT_TRUE(fs::remove(outside.path() / "deep") && fs::is_empty(outside.path()));
  EXPECT_EQ(extraction.files(), (Files{{"dangling", "->"},
                                       {"directory", "/"},
                                       {"kept", "old"},
                                       {"link", "->"},
                                       {"other", "/"},
                                       {"other/a", "a"},
                                       {"out", "->"}}));
  EXPECT_EQ(extraction.conflicts, (std::vector<std::string>{"kept", "directory", "link", "out", "dangling"}));
  const auto* reason = "a file or a link is there already where it needs a directory";
  EXPECT_EQ(extraction.problems, (Files{{"kept/below", "it lies below what is a file"},
                                        {"out/deep/indirect", reason},
                                        {"out/direct", reason}}));
}

TEST(ArcCopier, WhatTurnsUpMeanwhileStaysToo) {
  Extraction extraction(zip({zeros("large", 1 << 20)}));
  extraction.meanwhile = [&] { std::ofstream(extraction.destination() / "large") << "theirs"; };
  extraction.run();
  EXPECT_EQ(extraction.conflicts, std::vector<std::string>{"large"});
  EXPECT_EQ(extraction.files(), (Files{{"large", "theirs"}}));
}

TEST(ArcCopier, CancelledFilesLeaveNothing) {
  Extraction extraction(zip({{.name = "a"}, zeros("b", 10 << 20), {.name = "c"}}));
  extraction.cancelAt = 1 << 20;
  extraction.run();
  EXPECT_EQ(extraction.result, ArcCopierCancelled);
  EXPECT_EQ(extraction.error, ECANCELED);
  EXPECT_EQ(extraction.started, (std::vector<std::string>{"a", "b"}));
  EXPECT_EQ(extraction.files(), (Files{{"a", ""}}));
}

TEST(ArcCopier, RefusesOptionsItDoesNotKnow) {
  const auto copier = ArcCopierNew();
  const ArcCopierOption unknown[] = {{"extractPKZip", 1}, {"extractCPIO", 1}, {nullptr, 0}};
  const ArcCopierOption nothing[] = {{nullptr, 0}};
  EXPECT_EQ(ArcCopierCopyWithOptions(copier, "a", "b", unknown), ArcCopierBadOptions);
  EXPECT_EQ(ArcCopierCopyWithOptions(copier, "a", "b", nothing), ArcCopierBadOptions);
  EXPECT_EQ(ArcCopierCopyWithOptions(copier, "a", "b", nullptr), ArcCopierBadOptions);
  std::uint64_t count = 7;
  EXPECT_EQ(ArcCopierCountFilesInArchive(copier, "/nowhere", &count, 0), ArcCopierBadArchive);
  EXPECT_EQ(errno, ENOENT);
  EXPECT_EQ(count, 7u);
  ArcCopierFree(copier);
}

}  // namespace
}  // namespace MarletFoundation::test
