/// What it costs to change a document on disk as a whole: an update under a learner's edits, which must grow with the
/// book and no faster, and a save of 150 changed files among 5,000 beside rsync's copy with hard links and a final sync.
/// The counter `cpu` is the processor time of this process and of those it started, in seconds a round.

#include <benchmark/benchmark.h>
#include <sys/resource.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>

#include "GeneratedBook.h"
#include "MarletFoundation/MarletFoundation.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;
using MarletDiff::FileDiffDescriptor;

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
  fs::path path = fs::temp_directory_path() / ("marlet-update-bench-" + std::to_string(::getpid()));
  Scratch() { fs::create_directories(path); }
  ~Scratch() { fs::remove_all(path); }
};

void writeText(const fs::path& path, std::string_view text) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << text;
}

/// Every tenth page is changed by the update and by the learner, in different lines.
void applyUpdate(benchmark::State& state) {
  const Scratch scratch;
  const int pages = static_cast<int>(state.range(0));
  const auto book = scratch.path / "Book.marletbook";
  generateBook(book, pages, 0);
  std::string source = "let version = 1\n";
  for (int line = 0; line < 60; ++line) source += "lamp.flash(times: " + std::to_string(line) + ")\n";
  source += "lamp.color = 3\n";
  const auto place = static_cast<std::int64_t>(source.size()) - 2;
  std::vector<FileDiffDescriptor> edits, forward, back;
  for (int page = 0; page < pages; ++page) {
    const auto path = "Chapters/Chapter" + std::to_string(page / 100) + ".marletchapter/Pages/Page" +
                      std::to_string(page) + ".marletpage/Contents.swift";
    writeText(book / "Contents" / path, source);
    if (page % 10 != 0) continue;
    edits.push_back({FileDiffDescriptor::Modified{path, {{{place, 1}, {place, 1}, u"3", u"4"}}}});
    forward.push_back({FileDiffDescriptor::Modified{path, {{{14, 1}, {14, 2}, u"1", u"22"}}}});
    back.push_back({FileDiffDescriptor::Modified{path, {{{14, 2}, {14, 1}, u"22", u"1"}}}});
  }
  const auto url = URL::file(book.string(), true);
  const auto contents = url.appendingPathComponent("Contents", true);
  const auto pack = [&](DiffPackType type, std::vector<FileDiffDescriptor> updates) {
    return DiffPackSnapshot(type, DiffPackDocumentType::MarletBook, contents, "bench.large", "1.0", "1.0",
                            std::move(updates));
  };
  fs::create_directories(book / "Edits");
  pack(DiffPackType::UserEditPack, std::move(edits))
      .fileWrapper()
      .write(url.appendingPathComponent("Edits/UserEdits.diffpack"));
  const auto there = pack(DiffPackType::UpdatePack, std::move(forward));
  const auto andBack = pack(DiffPackType::UpdatePack, std::move(back));
  measure(state, [&] {
    applyUpdateDiffPack(url, there);
    applyUpdateDiffPack(url, andBack);
  });
  state.SetComplexityN(pages);
}
BENCHMARK(applyUpdate)
    ->RangeMultiplier(2)
    ->Range(250, 2000)
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime()
    ->Complexity();

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
