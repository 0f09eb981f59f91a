#include "MarletFoundation/Utils/Archive.h"

#include <gtest/gtest.h>

#include <fstream>
#include <thread>

#include "ArcCopier/ArcCopier.h"
#include "MarletFoundation/Platform/Progress.h"
#include "MarletFoundation/Utils/MLFUnzipCopier.h"
#include "support/ChangedHost.h"
#include "support/Failure.h"
#include "support/Tree.h"
#include "support/Zip.h"

namespace MarletFoundation::test {
namespace {

class ArchiveTest : public testing::Test {
 protected:
  void write(const std::string& archive) {
    std::ofstream(directory_.path() / "a.zip", std::ios::binary) << archive;
  }
  std::string unarchive() { return Archive::unarchiveFile(directory_.url("a.zip"), directory_.url("out")); }

  static std::string files(std::size_t count) {
    std::vector<ZipItem> items;
    for (std::size_t i = 0; i < count; ++i) items.push_back({.name = "file " + std::to_string(i)});
    return zip(items);
  }

  TemporaryDirectory directory_;
};

TEST_F(ArchiveTest, ReportsInStepsOfFivePercent) {
  struct Row {
    std::size_t files;
    std::int32_t step;
  };
  for (const auto& [count, step] : {Row{10, 10}, Row{1000, 5}}) {
    write(files(count));
    MLFUnzipCopier copier;
    std::vector<std::int32_t> percentages, expected;
    copier.progressCallback = [&](double fraction, double percentage) {
      EXPECT_EQ(fraction * 100, percentage);
      percentages.push_back(static_cast<std::int32_t>(percentage));
    };
    for (auto percentage = step; percentage <= 100; percentage += step) expected.push_back(percentage);
    std::optional<ErrorObject> error;
    EXPECT_TRUE(copier.unzip((directory_.path() / "a.zip").string(),
                             (directory_.path() / std::to_string(count)).string(), &error));
    EXPECT_EQ(percentages, expected);
    EXPECT_EQ(copier.filenames.size(), count);
    EXPECT_EQ(copier.filesComplete, count);
    EXPECT_FALSE(error);
  }
}

TEST_F(ArchiveTest, GivesTheFirstItemAndReportsIntoTheTree) {
  write(zip({{.name = "Top/", .mode = 040755}, {.name = "Top/a", .contents = "a"}}));
  const auto parent = Progress::make(4);
  std::vector<double> fractions;
  parent->setObserver([&](double fraction) { fractions.push_back(fraction); });
  {
    const Progress::CurrentScope scope(parent, 2);
    EXPECT_EQ(unarchive(), "Top");
  }
  EXPECT_EQ(parent->completedUnitCount(), 2);
  ASSERT_FALSE(fractions.empty());
  EXPECT_EQ(fractions.front(), 0.25);
  EXPECT_EQ(fractions.back(), 0.5);
}

TEST_F(ArchiveTest, FailsInItsOwnWords) {
  write(zip({}));
  EXPECT_EQ(thrown<UnarchiveError>([&] { unarchive(); }), UnarchiveError(UnarchiveErrorCase::UnzipFailed));
  const auto web = *URL::parse("https://example.org");
  EXPECT_THROW(Archive::unarchiveFile(web, directory_.url()), UnarchiveError);
  EXPECT_THROW(Archive::unarchiveFile(directory_.url("a.zip"), web), UnarchiveError);

  write(zip({{.name = "a"}, {.name = "/b"}}));
  EXPECT_EQ(thrown<ErrorObject>([&] { unarchive(); }),
            ErrorObject("com.quorvex.ArcCopier", ArcCopierSomeFilesFailed,
                        {{"Source Path", directory_.url("a.zip").path()},
                         {"Dest Path", directory_.url("out").path()},
                         {"errno", std::int64_t{EINVAL}}}));
}

TEST_F(ArchiveTest, IsCancelledFromAnotherThread) {
  write(zip({zeros("a", 1 << 20), zeros("b", 1 << 20)}));
  const auto parent = Progress::make(1);
  parent->setObserver([&](double) { std::thread([&] { parent->cancel(); }).join(); });
  const Progress::CurrentScope scope(parent, 1);
  EXPECT_EQ(thrown<ErrorObject>([&] { unarchive(); }).code(), ArcCopierCancelled);
  EXPECT_TRUE(std::filesystem::is_empty(directory_.path() / "out"));

  MLFUnzipCopier copier;
  copier.cancel();
  const auto unzip = [&] {
    return copier.unzip((directory_.path() / "a.zip").string(), (directory_.path() / "again").string(),
                        nullptr);
  };
  EXPECT_FALSE(unzip());
  EXPECT_TRUE(unzip()) << "a run is cancelled once";
}

TEST_F(ArchiveTest, HostsSetTheLimits) {
  write(files(3));
  std::int64_t limit = 2;
  const ChangedHost host([&](HostEnvironment& environment) {
    environment.userDefault = [&](std::string_view key) {
      return key == "ArchiveEntryLimit" ? std::optional(limit) : std::nullopt;
    };
  });
  EXPECT_THROW(unarchive(), ErrorObject);
  limit = 0;  // none
  EXPECT_EQ(unarchive(), "file 0");
}

}  // namespace
}  // namespace MarletFoundation::test
