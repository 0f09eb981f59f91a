// Extracting 1,000 files to a memory file system: the whole command beside bsdtar and unzip, and in this
// process with and without progress. All times are processor time.

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
  processorTimeOf({"bsdtar", "-a", "-cf", archive.string(), "-C", room.string(), "Top"});
}

/// Runs the work with a fresh destination each time; only the work counts.
template <class Work>
void extracting(benchmark::State& state, Work work) {
  const auto destination = room / "out";
  for (auto _ : state) {
    fs::create_directory(destination);
    state.SetIterationTime(work(destination.string()));
    fs::remove_all(destination);
  }
}

template <class Work>
double ownProcessorTime(Work work) {
  const auto now = [] {
    timespec time;
    ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
  };
  const auto start = now();
  work();
  return now() - start;
}

void marletUnzip(benchmark::State& state) {
  extracting(state, [](const std::string& destination) {
    return processorTimeOf({marletProgram(), "unzip", archive.string(), destination});
  });
}
void bsdtar(benchmark::State& state) {
  extracting(state, [](const std::string& destination) {
    return processorTimeOf({"bsdtar", "-xf", archive.string(), "-C", destination});
  });
}
void unzip(benchmark::State& state) {
  extracting(state, [](const std::string& destination) {
    return processorTimeOf({"unzip", "-q", archive.string(), "-d", destination});
  });
}

void copyInProcess(benchmark::State& state, bool withProgress) {
  extracting(state, [&](const std::string& destination) {
    return ownProcessorTime([&] {
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
