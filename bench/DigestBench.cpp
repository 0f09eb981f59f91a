// Digests of a file of 512 MiB: ours beside one call of OpenSSL over the mapped file, and the whole command
// beside md5sum and sha1sum. All times are processor time.

#include <benchmark/benchmark.h>
#include <openssl/evp.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <random>

#include "MarletFoundation/MarletFoundation.h"
#include "Process.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;

namespace {

constexpr std::size_t fileSize = 512 << 20;
std::string file;

void makeFile() {
  std::mt19937_64 random(7);
  std::string bytes(fileSize, '\0');
  for (std::size_t i = 0; i < fileSize; i += 8) *reinterpret_cast<std::uint64_t*>(&bytes[i]) = random();
  std::ofstream(file, std::ios::binary) << bytes;
}

void openSSL(benchmark::State& state, const EVP_MD* kind) {
  for (auto _ : state) {
    const auto mapped = FileManager::mapFile(URL::file(file));
    unsigned char digest[EVP_MAX_MD_SIZE];
    unsigned size = 0;
    EVP_Digest(mapped.bytes().data(), mapped.size(), digest, &size, kind, nullptr);
    benchmark::DoNotOptimize(digest);
  }
}
void openSSLMD5(benchmark::State& state) { openSSL(state, EVP_md5()); }
void openSSLSHA1(benchmark::State& state) { openSSL(state, EVP_sha1()); }
void checksumMD5(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(Checksum::MD5ChecksumForFile(URL::file(file)));
}
void dataSHA1(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(Data::mlf_SHA1DigestForURL(URL::file(file)));
}

void program(benchmark::State& state, const std::vector<std::string>& command) {
  for (auto _ : state) state.SetIterationTime(timeOf(command).processor);
}
void marletMD5(benchmark::State& state) { program(state, {marletProgram(), "digest", file}); }
void md5sum(benchmark::State& state) { program(state, {"md5sum", file}); }
void marletSHA1(benchmark::State& state) { program(state, {marletProgram(), "digest", "--sha1", file}); }
void sha1sum(benchmark::State& state) { program(state, {"sha1sum", file}); }

BENCHMARK(openSSLMD5)->Unit(benchmark::kMillisecond);
BENCHMARK(checksumMD5)->Unit(benchmark::kMillisecond);
BENCHMARK(openSSLSHA1)->Unit(benchmark::kMillisecond);
BENCHMARK(dataSHA1)->Unit(benchmark::kMillisecond);
BENCHMARK(marletMD5)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(md5sum)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(marletSHA1)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(sha1sum)->UseManualTime()->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  std::string name = (fs::temp_directory_path() / "digest-bench-XXXXXX").string();
  if (!::mkdtemp(name.data())) return 1;
  file = name + "/file";
  makeFile();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  fs::remove_all(name);
}
