#include <gtest/gtest.h>

#include <fstream>

#include "ArcCopier/Extraction.h"
#include "support/Zip.h"

namespace MarletFoundation::test {
namespace {

using Items = std::vector<ZipItem>;

constexpr std::uint64_t MiB = 1 << 20;

ZipItem good(std::string name) { return {.name = name, .contents = "This is " + name}; }

/// Overwrites bytes of a header.
std::function<void(std::string&)> with(std::size_t offset, std::string bytes) {
  return [=](std::string& header) { header.replace(offset, bytes.size(), bytes); };
}

struct Refused {
  const char* rule;
  std::string archive;
  const char* reason;
};

std::string cutFrom(std::string archive, std::size_t offset, std::size_t size) {
  return archive.erase(offset, size);
}

std::vector<Refused> refusedArchives() {
  const ZipItem a{.name = "a", .contents = "aaaa"}, b{.name = "b", .contents = "bbbb"};
  auto changed = [&](auto change, auto ZipItem::*where) {
    auto item = b;
    item.*where = change;
    return zip({a, item});
  };
  auto contradictory = b, twiceIn64 = b;
  contradictory.isZip64 = twiceIn64.isZip64 = true;
  contradictory.changeCentral = with(46 + 1 + 2, number(16, 2) + number(4, 8) + number(4, 8));
  twiceIn64.changeCentral = with(24, number(5, 4));
  const char* differs = "a local header differs from the directory";
  const char* reaches = "its entries reach into its directory, or it is cut off";
  const char* misplaced = "its directory doesn't lie where it should, or it is cut off";
  const auto whole = zip({a, b});
  return {
      {"overlapping bomb of 10 MB", overlappingBomb(10 * MiB, 200), "its entries overlap"},
      {"entry inside of another", changed(with(42, number(10, 4)), &ZipItem::changeCentral),
       "its entries overlap"},
      {"no entry where the directory says", changed(with(0, "x"), &ZipItem::changeLocal),
       "a local header is missing"},
      {"local name", changed(with(30, "x"), &ZipItem::changeLocal), differs},
      {"local size", changed(with(22, number(5, 4)), &ZipItem::changeLocal), differs},
      {"local compressed size", changed(with(18, number(5, 4)), &ZipItem::changeLocal), differs},
      {"local checksum", changed(with(14, number(0, 4)), &ZipItem::changeLocal), differs},
      {"local method", changed(with(8, number(8, 2)), &ZipItem::changeLocal), differs},
      {"local encryption", changed(with(6, number(1, 2)), &ZipItem::changeLocal), differs},
      {"zip64 field too short", zip({a, contradictory}), "its zip64 fields contradict the others"},
      {"zip64 field beside a size", zip({a, twiceIn64}), "its zip64 fields contradict the others"},
      {"zip64 end with another count",
       zip({a}, {.isZip64 = true, .changeEnd = with(56 + 20 + 8, number(2, 2))}),
       "its zip64 end contradicts the other"},
      {"zip64 end in the wrong place", zip({a}, {.isZip64 = true, .changeEnd = with(56 + 8, number(3, 8))}),
       "its zip64 end doesn't lie where it should"},
      {"cut off at the end", whole.substr(0, whole.size() - 1), "it is no zip archive, or cut off"},
      {"cut off in the middle", cutFrom(whole, 31, 2), misplaced},
      {"more behind the end", whole + "x", "it is no zip archive, or cut off"},
      {"fewer entries than stated", zip({a, b}, {.changeEnd = with(8, number(3, 2) + number(3, 2))}),
       "its directory has fewer entries than it says"},
      {"more entries than stated", zip({a, b}, {.changeEnd = with(8, number(1, 2) + number(1, 2))}),
       "its directory has more entries than it says"},
      {"far more entries than bytes", zip({}, {.changeEnd = with(8, number(9999, 2) + number(9999, 2))}),
       "its directory has fewer entries than it says"},
      {"name that runs out of the directory", changed(with(28, number(200, 2)), &ZipItem::changeCentral),
       "its directory is damaged"},
      {"entry that runs into the directory", changed(with(20, number(40, 4)), &ZipItem::changeCentral),
       differs},
      {"offset behind the directory", changed(with(42, number(9999, 4)), &ZipItem::changeCentral), reaches},
      {"two ends", zip({a}, {.comment = std::string("PK\5\6", 4) + std::string(18, '\0')}),
       "it has two ends"},
      {"second volume", zip({a}, {.changeEnd = with(4, number(1, 2))}), "it is one of several volumes"},
      {"no archive", "not a zip archive, but long enough to be one", "it is no zip archive, or cut off"},
  };
}

TEST(HostileArchive, IsRefusedBeforeAnythingIsWritten) {
  for (const auto& [rule, archive, reason] : refusedArchives()) {
    SCOPED_TRACE(rule);
    Extraction extraction(archive);
    extraction.run();
    EXPECT_EQ(extraction.result, ArcCopierBadArchive);
    EXPECT_EQ(extraction.error, EBADMSG);
    EXPECT_EQ(extraction.problems, (std::map<std::string, std::string>{{"", reason}}));
    EXPECT_FALSE(std::filesystem::exists(extraction.destination()));
    EXPECT_TRUE(extraction.started.empty());
  }
}

struct Faulty {
  ZipItem item;
  const char* reason;
  /// How the path is shown, where not as the name.
  std::string shown = {};
};

std::vector<Faulty> faultyItems() {
  const auto named = [](std::string name) { return ZipItem{.name = std::move(name), .contents = "evil"}; };
  const auto typed = [](std::uint16_t mode) {
    return ZipItem{.name = "x", .contents = "/etc", .mode = mode};
  };
  auto tooLong = zeros("x", 100'000), tooShort = zeros("x", 100'000), damaged = zeros("x", 100'000);
  tooLong.size = 99'999;
  tooShort.size = 100'001;
  damaged.packed->replace(60, 40, 40, '\xFF');
  auto cut = zeros("x", 100'000);
  cut.packed->resize(cut.packed->size() / 2);
  auto masked = named("x");
  masked.flags = 1 << 13;
  const auto long255 = std::string(256, 'n');
  std::string longPath;
  for (int i = 0; i < 500; ++i) longPath += "directory/";
  return {
      {named("/absolute"), "its path is absolute"},
      {named("../parent"), "its path has \"..\""},
      {named("a/../../parent"), "its path has \"..\""},
      {named("a/.."), "its path has \"..\""},
      {named("C:drive"), "its path names a drive"},
      {named("a\\..\\b"), "its path holds a backslash"},
      {named(std::string("nul\0.txt", 8)), "its name holds a NUL", "nul\uFFFD.txt"},
      {named(long255), "its name is too long"},
      {named(longPath + "x"), "its path is too long"},
      {named(""), "it has no name"},
      {{.name = "bad\xFF", .flags = 1 << 11}, "its name is not the UTF-8 that it claims to be", "bad\uFFFD"},
      {typed(0120777), "it is a symbolic link"},
      {typed(0020666), "it is a device or another special file"},
      {typed(0010666), "it is a device or another special file"},
      {{.name = "x/", .contents = "bytes"}, "it is a directory with contents", "x"},
      {named("x/."), "it is a directory with contents"},
      {named("first/good"), "its name was there before"},
      {named("first//./good"), "its name was there before"},
      {named("first/good/below"), "it lies below what is a file"},
      {named("first"), "it is a file where there is a directory"},
      {{.name = "x", .contents = "secret", .flags = 1}, "it is encrypted"},
      {masked, "it is encrypted"},
      {{.name = "x", .contents = "?", .method = 14}, "it is compressed in a way that is not supported"},
      {{.name = "x", .contents = "four", .checksum = 1234}, "its data is damaged"},
      {{.name = "x", .contents = "four", .size = 5}, "its size is wrong"},
      {tooLong, "its data is damaged"},
      {tooShort, "its data is damaged"},
      {damaged, "its data is damaged"},
      {cut, "its data is damaged"},
  };
}

TEST(HostileArchive, FaultyEntriesAreLeftOutAndTheRestIsExtracted) {
  for (const auto& [item, reason, shown] : faultyItems()) {
    SCOPED_TRACE(std::string(reason) + ", " + item.name.substr(0, 40));
    Extraction extraction(zip({good("first/good"), item, good("last")}));
    extraction.run();
    EXPECT_EQ(extraction.result, ArcCopierSomeFilesFailed);
    EXPECT_NE(extraction.error, 0);
    ASSERT_EQ(extraction.problems.size(), 1u);
    EXPECT_EQ(extraction.problems.begin()->second, reason);
    EXPECT_EQ(extraction.problems.begin()->first, shown.empty() ? item.name : shown);
    EXPECT_EQ(extraction.files(),
              (std::map<std::string, std::string>{
                  {"first", "/"}, {"first/good", "This is first/good"}, {"last", "This is last"}}));
    EXPECT_EQ(extraction.finished, (std::vector<std::string>{"first/good", "last"}));
  }
}

TEST(HostileArchive, PassesOverAnyNumberOfFaultyEntries) {
  auto damaged = zeros("", 1000);
  damaged.packed->replace(20, 10, 10, '\xFF');
  Items items;
  for (int i = 0; i < 2000; ++i) items.push_back(damaged), items.back().name = std::to_string(i);
  items.push_back(good("last"));
  Extraction extraction(zip(items));
  extraction.run();
  EXPECT_EQ(extraction.problems.size(), 2000u);
  EXPECT_EQ(extraction.finished, (std::vector<std::string>{"last"}));
}

std::size_t bytesReadSoFar() {
  std::ifstream counts("/proc/self/io");
  std::string name;
  std::size_t count = 0;
  counts >> name >> count;
  return count;
}

TEST(HostileArchive, IsWalkedOnceThoughItsDirectoryIsLargeAndBackwards) {
  ZipItem item{.name = {}, .changeCentral = [](std::string& header) {
                 header.replace(32, 2, number(5000, 2));
                 header += std::string(5000, 'c');
               }};
  Items items;
  for (int i = 0; i < 500; ++i) items.push_back(item), items.back().name = std::to_string(i);
  const auto archive = zip(items, {.isBackwards = true});
  Extraction extraction(archive);
  const auto before = bytesReadSoFar();
  extraction.run();
  EXPECT_EQ(extraction.finished.size(), items.size());
  EXPECT_LT(bytesReadSoFar() - before, 10 * archive.size());
}

TEST(HostileArchive, StopsAtAFaultWhenTheHandlerSaysSo) {
  Extraction extraction(zip({good("a"), {.name = "/b"}, good("c")}));
  extraction.stopsAtErrors = true;
  extraction.run();
  EXPECT_EQ(extraction.result, ArcCopierCancelled);
  EXPECT_EQ(extraction.finished, (std::vector<std::string>{"a"}));
}

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool holdsFreedMemoryBack = true;
#elif defined(__has_feature)
constexpr bool holdsFreedMemoryBack = __has_feature(address_sanitizer) || __has_feature(thread_sanitizer);
#else
constexpr bool holdsFreedMemoryBack = false;
#endif

std::size_t peakMemory() {
  std::ifstream status("/proc/self/status");
  for (std::string line; std::getline(status, line);) {
    if (line.starts_with("VmHWM:")) return static_cast<std::size_t>(std::stoul(line.substr(6))) * 1024;
  }
  return 0;
}

TEST(HostileArchive, GivesBackNoMoreThanItsLimitsAndTakesLittleMemory) {
  const auto bomb = zip({good("a"), zeros("bomb", 24 * MiB), good("z")});
  Extraction extraction(bomb);
  extraction.run();
  EXPECT_EQ(extraction.result, ArcCopierSuccess);

  struct Row {
    ArcCopierLimits limits;
    const char* reason;
  };
  const Row rows[] = {{{100, 1 << 30, 100}, "the archive expands too much"},
                      {{100, 23 * MiB, 200}, "the archive's files are too large"}};
  for (const auto& [limits, reason] : rows) {
    Extraction limited(bomb, limits);
    std::ofstream("/proc/self/clear_refs") << 5;
    const auto before = peakMemory();
    limited.run();
    if (!holdsFreedMemoryBack) {
      EXPECT_LT(peakMemory(), before + 8 * MiB);
    }
    EXPECT_EQ(limited.result, ArcCopierLimitExceeded);
    EXPECT_EQ(limited.error, EFBIG);
    EXPECT_EQ(limited.problems, (std::map<std::string, std::string>{{"", reason}}));
    EXPECT_EQ(limited.files(), (std::map<std::string, std::string>{{"a", "This is a"}}));
  }

  for (const auto& archive : {bomb, zip({good("deep/er/still")})}) {
    Extraction crowded(archive, {2, 1 << 30, 200});
    crowded.run();
    EXPECT_EQ(crowded.result, ArcCopierLimitExceeded);
    EXPECT_FALSE(std::filesystem::exists(crowded.destination()));
  }
}

}  // namespace
}  // namespace MarletFoundation::test
