// Extracting 1,000 files to a memory file system: the whole command beside bsdtar and unzip, and in this
// process with and without progress. Times are by the clock; `processor` is milliseconds of processor time, of all
// threads.

#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <iostream>
#include <random>

#include "MarletFoundation/MarletFoundation.h"
#include "Process.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;

namespace {

fs::path room;
fs::path archive;

/// 1,000 files of 1 to 8 KB of words in 20 directories.
void makeArchive() {
  std::mt19937 random(7);
  for (int i = 0; i < 1000; ++i) {
    const auto directory = room / "Top" / ("directory " + std::to_string(i / 50));
    fs::create_directories(directory);
    std::ofstream file(directory / ("file " + std::to_string(i)));
    const auto words = 100 + random() % 900;
    for (unsigned word = 0; word < words; ++word) file << "word" << random() % 1000 << ' ';
  }
  archive = room / "archive.zip";
  timeOf({"bsdtar", "-a", "-cf", archive.string(), "-C", room.string(), "Top"});
}

/// Runs the work with a fresh destination each time; only the work counts.
template <class Work>
void extracting(benchmark::State& state, Work work) {
  const auto destination = room / "out";
  double processor = 0;
  for (auto _ : state) {
    fs::create_directory(destination);
    const auto time = work(destination.string());
    state.SetIterationTime(time.elapsed);
    processor += time.processor;
    fs::remove_all(destination);
  }
  state.counters["processor"] = benchmark::Counter(1000 * processor, benchmark::Counter::kAvgIterations);
}

template <class Work>
ProcessTime ownTime(Work work) {
  const auto now = [](clockid_t clock) {
    timespec time;
    ::clock_gettime(clock, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
  };
  const auto start = now(CLOCK_MONOTONIC), processorStart = now(CLOCK_PROCESS_CPUTIME_ID);
  work();
  return {now(CLOCK_MONOTONIC) - start, now(CLOCK_PROCESS_CPUTIME_ID) - processorStart};
}

void marletUnzip(benchmark::State& state) {
  extracting(state, [](const std::string& destination) {
    return timeOf({marletProgram(), "unzip", archive.string(), destination});
  });
}
void bsdtar(benchmark::State& state) {
  extracting(state, [](const std::string& destination) {
    return timeOf({"bsdtar", "-xf", archive.string(), "-C", destination});
  });
}
void unzip(benchmark::State& state) {
  extracting(state, [](const std::string& destination) {
    return timeOf({"unzip", "-q", archive.string(), "-d", destination});
  });
}

void copyInProcess(benchmark::State& state, bool withProgress) {
  extracting(state, [&](const std::string& destination) {
    return ownTime([&] {
      const auto progress = Progress::make(100);
      MLFUnzipCopier copier;
      if (withProgress) {
        copier.progressCallback = [&](double fraction, double) {
          progress->setCompletedUnitCount(static_cast<std::int64_t>(fraction * 100));
        };
      }
      if (!copier.unzip(archive.string(), destination, nullptr)) std::exit(1);
    });
  });
}
void withoutProgress(benchmark::State& state) { copyInProcess(state, false); }
void withProgress(benchmark::State& state) { copyInProcess(state, true); }

BENCHMARK(marletUnzip)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(bsdtar)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(unzip)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(withoutProgress)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(withProgress)->UseManualTime()->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  std::string name = "/dev/shm/archive-bench-XXXXXX";
  if (!::mkdtemp(name.data())) return 1;
  room = name;
  makeArchive();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  fs::remove_all(room);
}
