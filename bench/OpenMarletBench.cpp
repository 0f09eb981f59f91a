// Opening a classic document of 2,000 pages, beside a bare loop over the files that it has to read.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "MarletFoundation/MarletFoundation.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;

namespace {

constexpr int pageCount = 2000;
constexpr std::size_t sourceSize = 4096;

fs::path document;
std::vector<std::string> files;

void write(const fs::path& path, const std::string& text) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << text;
  files.push_back(path);
}

void generate() {
  const std::string line = "for step in 1...10 { climb(step) }  // up we go\n";
  std::string source;
  while (source.size() < sourceSize) source += line;
  std::string list;
  for (int page = 0; page < pageCount; ++page) {
    const auto name = "Page" + std::to_string(page);
    list += "<page name='" + name + "'/>";
    write(document / "Pages" / (name + ".wbmarletpage") / "Contents.swift", source);
  }
  write(document / "contents.wbmarlet",
        "<marlet version='6.0' target-platform='slateos'><pages>" + list + "</pages></marlet>");
}

void bareLoop(benchmark::State& state) {
  static char buffer[1 << 18];
  for (auto _ : state) {
    for (const auto& path : files) {
      const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
      benchmark::DoNotOptimize(::read(descriptor, buffer, sizeof buffer));
      ::close(descriptor);
    }
  }
}

void openMarlet(benchmark::State& state) {
  const auto url = URL::file(document.string(), true);
  for (auto _ : state) benchmark::DoNotOptimize(MarletSnapshot(FileWrapper(url), url).pages.size());
}

BENCHMARK(bareLoop)->Unit(benchmark::kMillisecond);
BENCHMARK(openMarlet)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  std::string directory = fs::temp_directory_path() / "marlet-bench-XXXXXX";
  if (!::mkdtemp(directory.data())) return 1;
  document = fs::path(directory) / "Large.marlet";
  generate();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  fs::remove_all(directory);
}
