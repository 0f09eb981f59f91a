#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <latch>
#include <thread>

#include "MarletFoundation/MarletFoundation.h"
#include "support/Documents.h"

namespace MarletFoundation::test {
namespace {

/// How opening ended: the second chapter's name, or the error.
std::string outcome(const FileWrapper& tree, const URL& url) {
  try {
    return MarletBookSnapshot(tree, url).chapters.at(1).name;
  } catch (const Error& error) {
    return error.description();
  }
}

}  // namespace

TEST(ConcurrentOpening, ManyThreadsOneBook) {
  const TemporaryDirectory directory;
  goodBook().writeTo(directory.path() / "Book.marletbook");
  const auto url = directory.url("Book.marletbook");
  constexpr int threadCount = 32;
  std::latch start(threadCount);
  std::atomic<int> right = 0;
  std::vector<std::thread> threads;
  for (int i = 0; i < threadCount; ++i) {
    threads.emplace_back([&] {
      start.arrive_and_wait();
      const auto page = snapshotForPageWithFilename("A.marletpage", "One.marletchapter", url);
      right += outcome(FileWrapper(url), url) == "Two" && page->name() == "A";
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(right, threadCount);
}

TEST(ConcurrentOpening, WhatChangesBetweenListingAndReading) {
  const TemporaryDirectory directory;
  const auto place = directory.path() / "Book.marletbook";
  const auto url = directory.url("Book.marletbook");
  const std::string chapter = "Contents/Chapters/Two.marletchapter";
  const struct {
    std::function<void()> change;
    std::string expected;
  } cases[] = {
      {[] {}, "Two"},
      {[&] { std::filesystem::remove(place / chapter / "Manifest.plist"); },
       R"(invalidChapter(filename: "Two.marletchapter", error: missingManifest))"},
      {[&] { std::filesystem::remove_all(place / chapter); },
       R"(invalidChapter(filename: "Two.marletchapter", error: notADirectory))"},
      {[&] { std::filesystem::resize_file(place / chapter / "Manifest.plist", 20); },
       R"(invalidChapter(filename: "Two.marletchapter", error: invalidManifest(Error(domain: )"
       R"(MarletFoundation.PropertyListSerialization, code: 7, "The document ends too early, line 1, byte 0."))))"},
  };
  for (const auto& [change, expected] : cases) {
    std::filesystem::remove_all(place);
    goodBook().writeTo(place);
    const FileWrapper listed(url);
    ASSERT_TRUE(listed.child("Contents")->child("Chapters")->fileWrappers());
    change();
    EXPECT_EQ(outcome(listed, url), expected);
  }
}

}  // namespace MarletFoundation::test
