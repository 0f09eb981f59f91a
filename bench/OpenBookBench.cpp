// Opening a book of 10,000 pages, beside a bare loop over the 20,000 files that it has to read, and beside
// that loop with libplist parsing what it read. Called as `OpenBookBench --generate DIRECTORY` or `--open
// DIRECTORY`, it does just that, for counting system calls and memory from outside.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <plist/plist.h>
#include <stdlib.h>
#include <unistd.h>

#include <iostream>

#include "GeneratedBook.h"
#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

constexpr int pageCount = 10000;
constexpr std::uintmax_t bulk = 100 << 20;

std::filesystem::path book;
std::vector<std::string> files;

struct OpenBook {
  URL url;
  FileWrapper tree{url};
  MarletBookSnapshot snapshot{tree, url};

  explicit OpenBook(const std::filesystem::path& path) : url(URL::file(path.string(), true)) {}
};

void openBook(benchmark::State& state) {
  std::optional<OpenBook> opened;
  for (auto _ : state) {
    opened.emplace(book);
    state.PauseTiming();
    opened.reset();
    state.ResumeTiming();
  }
}

void openAndCloseBook(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(OpenBook(book).snapshot.chapters.size());
}

template <class Use>
void readFiles(Use use) {
  static char buffer[1 << 16];
  for (const auto& path : files) {
    const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    const auto count = ::read(descriptor, buffer, sizeof buffer);
    ::close(descriptor);
    use(buffer, count);
  }
}

void bareLoop(benchmark::State& state) {
  for (auto _ : state) readFiles([](const char* bytes, ssize_t) { benchmark::DoNotOptimize(bytes); });
}

void bareLoopWithLibplist(benchmark::State& state) {
  for (auto _ : state) {
    readFiles([](const char* bytes, ssize_t count) {
      plist_t node = nullptr;
      plist_from_memory(bytes, static_cast<std::uint32_t>(count), &node);
      plist_free(node);
    });
  }
}

BENCHMARK(bareLoop)->Unit(benchmark::kMillisecond);
BENCHMARK(openBook)->Unit(benchmark::kMillisecond);
BENCHMARK(openAndCloseBook)->Unit(benchmark::kMillisecond);
BENCHMARK(bareLoopWithLibplist)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  auto environment = HostEnvironment::defaults();
  environment.diagnostics = [](std::string_view) {};
  HostEnvironment::setCurrent(std::move(environment));
  const std::string mode = argc == 3 ? argv[1] : "";
  if (mode == "--generate") {
    generateBook(argv[2], pageCount, bulk);
    return 0;
  }
  if (mode == "--open") return OpenBook(argv[2]).snapshot.chapters.empty();

  std::string directory = std::filesystem::temp_directory_path() / "marlet-bench-XXXXXX";
  if (!::mkdtemp(directory.data())) return 1;
  book = std::filesystem::path(directory) / "Large.marletbook";
  generateBook(book, pageCount, bulk);
  files = pageFiles(book);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  std::filesystem::remove_all(directory);
}
