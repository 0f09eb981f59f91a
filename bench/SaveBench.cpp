/// What it costs to change a document on disk as a whole: a save of 150 changed files among 5,000, beside rsync's copy
/// with hard links and a final sync.
/// The counter `cpu` is the processor time of this process and of those it started, in seconds a round.

#include <benchmark/benchmark.h>
#include <sys/resource.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "MarletFoundation/MarletFoundation.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;

namespace {

constexpr int Files = 5000;
constexpr int ChangedFiles = 150;

double processorSeconds() {
  double seconds = 0;
  for (const int who : {RUSAGE_SELF, RUSAGE_CHILDREN}) {
    struct rusage usage;
    ::getrusage(who, &usage);
    for (const auto& time : {usage.ru_utime, usage.ru_stime})
      seconds += static_cast<double>(time.tv_sec) + 1e-6 * static_cast<double>(time.tv_usec);
  }
  return seconds;
}

template <class Round>
void measure(benchmark::State& state, Round round) {
  const double before = processorSeconds();
  for ([[maybe_unused]] auto _ : state) round();
  state.counters["cpu"] = benchmark::Counter(processorSeconds() - before, benchmark::Counter::kAvgIterations);
}

struct Scratch {
  fs::path path = fs::temp_directory_path() / ("marlet-save-bench-" + std::to_string(::getpid()));
  Scratch() { fs::create_directories(path); }
  ~Scratch() { fs::remove_all(path); }
};

void writeText(const fs::path& path, std::string_view text) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << text;
}

std::string fileName(int file) { return std::to_string(file / 100) + "/file" + std::to_string(file); }

void makeTree(const fs::path& root, int files, std::string_view text) {
  for (int file = 0; file < files; ++file) {
    writeText(root / fileName(file * (Files / files)), std::string(text) + std::to_string(file));
  }
}

void durableSave(benchmark::State& state) {
  const Scratch scratch;
  const auto document = scratch.path / "document";
  makeTree(document, Files, std::string(2000, 'x'));
  const auto url = URL::file(document.string(), true);
  int version = 0;
  measure(state, [&] {
    const FileWrapper root(url);
    ++version;
    for (int file = 0; file < Files; file += Files / ChangedFiles) {
      const fs::path path = fileName(file);
      auto changed = FileWrapper::regularFile(Data(std::string(2000, 'y') + std::to_string(version)));
      changed.setPreferredFilename(path.filename());
      root.child(path.parent_path().string())->addFileWrapper(std::move(changed));
    }
    root.write(url);
  });
}
BENCHMARK(durableSave)->Unit(benchmark::kMillisecond)->UseRealTime();

/// The changed files lie beside the document; the new tree is linked against the old one and takes its place.
void copyWithLinksBySync(benchmark::State& state) {
  if (std::system("rsync --version >/dev/null 2>&1") != 0) {
    state.SkipWithError("There is no rsync.");
    return;
  }
  const Scratch scratch;
  makeTree(scratch.path / "document", Files, std::string(2000, 'x'));
  const std::string enter = "cd '" + scratch.path.string() + "' && ";
  if (std::system((enter + "cp -a document edited").c_str()) != 0) return;
  int version = 0;
  for ([[maybe_unused]] auto _ : state) {
    state.PauseTiming();
    ++version;
    for (int file = 0; file < Files; file += Files / ChangedFiles)
      writeText(scratch.path / "edited" / fileName(file), std::string(2000, 'y') + std::to_string(version));
    state.ResumeTiming();
    const double before = processorSeconds();
    const auto command =
        enter + "rsync -a --link-dest=../document edited/ new && sync -f new && mv document old && " +
        "mv new document && sync -f . && rm -rf old";
    if (std::system(command.c_str()) != 0) state.SkipWithError("rsync failed.");
    state.counters["cpu"] += processorSeconds() - before;
  }
  state.counters["cpu"] = benchmark::Counter(state.counters["cpu"], benchmark::Counter::kAvgIterations);
}
BENCHMARK(copyWithLinksBySync)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
