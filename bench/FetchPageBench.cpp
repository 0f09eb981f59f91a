// Fetching one page of a book of 10,000, with book and pack passed in, beside reading that page's files bare;
// without them passed in, beside opening the book once. And opening books of which every page was edited,
// which has to grow as the number of pages does.

#include <benchmark/benchmark.h>
#include <stdlib.h>

#include "GeneratedBook.h"
#include "MarletFoundation/MarletFoundation.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;

namespace {

constexpr int pageCount = 10000;
constexpr std::uintmax_t sourceSize = 4096;

fs::path directory;
fs::path bookPath() { return directory / "Large.marletbook"; }
URL bookURL(const fs::path& path) { return URL::file(path.string(), true); }

std::string pageName(std::int64_t page) { return "Page" + std::to_string(page) + ".marletpage"; }
std::string chapterName(std::int64_t page) {
  return "Chapter" + std::to_string(page / 100) + ".marletchapter";
}

/// Some other page each time.
std::int64_t nextPage(std::int64_t page) { return (page + 7919) % pageCount; }

/// A learner's pack with an edit of every page.
void writePack(const fs::path& book, int pages) {
  std::vector<MarletDiff::FileDiffDescriptor> updates;
  for (int page = 0; page < pages; ++page) {
    updates.push_back({MarletDiff::FileDiffDescriptor::Replaced{
        "Chapters/" + chapterName(page) + "/Pages/" + pageName(page) + "/Contents.swift",
        Data(std::string("print(1)\n"))}});
  }
  fs::create_directories(book / "Edits");
  const auto url = bookURL(book);
  DiffPackSnapshot(DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook,
                   url.appendingPathComponent("Contents", true), "bench.large", "1.0", "1.0",
                   FileDiffDescriptors(std::move(updates)))
      .fileWrapper()
      .write(url.appendingPathComponent("Edits").appendingPathComponent("UserEdits.diffpack"));
}

void bareFiles(benchmark::State& state) {
  std::int64_t page = 0;
  for (auto _ : state) {
    page = nextPage(page);
    const auto path = bookPath() / "Contents/Chapters" / chapterName(page) / "Pages" / pageName(page);
    for (const auto* name : {"Manifest.plist", "Contents.swift", "ResultInfo.plist"})
      benchmark::DoNotOptimize(FileManager::readFile(URL::file((path / name).string())).size());
  }
}

void fetchPage(benchmark::State& state) {
  const auto url = bookURL(bookPath());
  std::optional<DiffPackSnapshot> none;
  const MarletBookSnapshot book(FileWrapper(url), url, none);
  const std::optional<DiffPackSnapshot> pack(
      std::in_place, DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook,
      url.appendingPathComponent("Contents", true), "bench.large", "1.0", "1.0", FileDiffDescriptors());
  std::int64_t page = 0;
  for (auto _ : state) {
    page = nextPage(page);
    benchmark::DoNotOptimize(
        snapshotForPageWithFilename(pageName(page), chapterName(page), url, &book, pack));
  }
}

void openBook(benchmark::State& state) {
  const auto url = bookURL(bookPath());
  for (auto _ : state) benchmark::DoNotOptimize(MarletBookSnapshot(FileWrapper(url), url).chapters.size());
}

void fetchPageOpeningTheBook(benchmark::State& state) {
  for (auto _ : state)
    benchmark::DoNotOptimize(
        snapshotForPageWithFilename(pageName(4711), chapterName(4711), bookURL(bookPath())));
}

void openEditedBook(benchmark::State& state) {
  const auto url = bookURL(directory / ("Edited" + std::to_string(state.range(0)) + ".marletbook"));
  for (auto _ : state) {
    std::optional<DiffPackSnapshot> pack;
    benchmark::DoNotOptimize(MarletBookSnapshot(FileWrapper(url), url, pack).chapters.size());
  }
}

BENCHMARK(bareFiles)->Unit(benchmark::kMicrosecond);
BENCHMARK(fetchPage)->Unit(benchmark::kMicrosecond);
BENCHMARK(openBook)->Unit(benchmark::kMillisecond);
BENCHMARK(fetchPageOpeningTheBook)->Unit(benchmark::kMillisecond);
BENCHMARK(openEditedBook)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  auto environment = HostEnvironment::defaults();
  environment.diagnostics = [](std::string_view) {};
  HostEnvironment::setCurrent(std::move(environment));
  std::string name = fs::temp_directory_path() / "marlet-bench-XXXXXX";
  if (!::mkdtemp(name.data())) return 1;
  directory = name;
  generateBook(bookPath(), pageCount, sourceSize);
  for (const int pages : {1000, 10000}) {
    const auto book = directory / ("Edited" + std::to_string(pages) + ".marletbook");
    generateBook(book, pages, sourceSize);
    writePack(book, pages);
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  fs::remove_all(directory);
}
