// Reading and writing property lists, side by side with libplist on the same documents: one large list and
// ten thousand small manifests, in both forms.
#include <benchmark/benchmark.h>
#include <plist/plist.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <random>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "Process.h"

namespace {

using namespace MarletFoundation;
using PropertyListSerialization::read;
using PropertyListSerialization::write;
using Array = PropertyListValue::Array;

constexpr std::size_t smallCount = 10000;

std::string words(std::mt19937& random, std::size_t count) {
  constexpr const char* vocabulary[] = {"loop", "turtle", "condition", "step",   "the",   "a",
                                        "of",   "value",  "für",       "change", "again", "if a < b & c"};
  std::string text;
  for (std::size_t i = 0; i < count; ++i) {
    if (i > 0) text += ' ';
    text += vocabulary[random() % std::size(vocabulary)];
  }
  return text;
}

// A page's manifest, about 600 bytes in XML.
PropertyListValue manifest(unsigned number) {
  std::mt19937 random(number);
  return PropertyListDictionary{{"Name", words(random, 3)},
                                {"Version", "1.0"},
                                {"ContentIdentifier", "com.example.page" + std::to_string(number)},
                                {"ContentVersion", "1." + std::to_string(number % 7)},
                                {"DeploymentTarget", "tablet-4"},
                                {"LiveViewMode", "VisibleByDefault"},
                                {"MaximumSupportedExecutionSpeed", "Fastest"},
                                {"Chapters", Array{"One.chapter", "Two.chapter"}},
                                {"Locked", number % 2 == 0}};
}

// The records of many runs: short texts, numbers, dates and some data.
PropertyListValue largeList() {
  std::mt19937 random(1);
  Array records;
  for (unsigned i = 0; i < 30000; ++i) {
    Array lines;
    for (unsigned line = 0; line < 4; ++line) lines.push_back(random() % 1000);
    records.push_back(PropertyListDictionary{
        {"Identifier", "record-" + std::to_string(i)},
        {"Title", words(random, 4)},
        {"Text", words(random, 20)},
        {"Line", i},
        {"Weight", static_cast<double>(random() % 100000) / 64},
        {"Passed", i % 3 == 0},
        {"Date", Date{static_cast<double>(600000000 + i)}},
        {"Lines", std::move(lines)},
        {"Digest", Data(std::string(16, static_cast<char>(random())))},
    });
  }
  return PropertyListDictionary{{"Records", std::move(records)}, {"Version", "1.0"}};
}

struct Documents {
  std::vector<Data> xml;
  std::vector<Data> binary;

  explicit Documents(const std::vector<PropertyListValue>& values) {
    for (const auto& value : values) {
      xml.push_back(write(value, PropertyListFormat::xml));
      binary.push_back(write(value, PropertyListFormat::binary));
    }
  }

  const std::vector<Data>& in(PropertyListFormat format) const {
    return format == PropertyListFormat::xml ? xml : binary;
  }
};

const Documents& large() {
  static const Documents documents({largeList()});
  return documents;
}

const Documents& small() {
  static const Documents documents([] {
    std::vector<PropertyListValue> values;
    for (unsigned i = 0; i < smallCount; ++i) values.push_back(manifest(i));
    return values;
  }());
  return documents;
}

plist_t peerRead(const Data& data, PropertyListFormat format) {
  plist_t root = nullptr;
  const auto size = static_cast<std::uint32_t>(data.size());
  if (format == PropertyListFormat::xml) {
    plist_from_xml(data.view().data(), size, &root);
  } else {
    plist_from_bin(data.view().data(), size, &root);
  }
  return root;
}

void countBytes(benchmark::State& state, const std::vector<Data>& documents) {
  std::size_t bytes = 0;
  for (const auto& document : documents) bytes += document.size();
  state.SetBytesProcessed(static_cast<std::int64_t>(bytes) * static_cast<std::int64_t>(state.iterations()));
}

// A reading's time includes giving the result back.
void ours(benchmark::State& state, const Documents& (*documents)(), PropertyListFormat format) {
  const auto& list = documents().in(format);
  for (auto _ : state) {
    for (const auto& data : list) benchmark::DoNotOptimize(read(data));
  }
  countBytes(state, list);
}

void peers(benchmark::State& state, const Documents& (*documents)(), PropertyListFormat format) {
  const auto& list = documents().in(format);
  for (auto _ : state) {
    for (const auto& data : list) plist_free(peerRead(data, format));
  }
  countBytes(state, list);
}

// Both write what they read before.
void oursWriting(benchmark::State& state, const Documents& (*documents)(), PropertyListFormat format) {
  std::vector<PropertyListValue> values;
  for (const auto& data : documents().binary) values.push_back(read(data));
  for (auto _ : state) {
    for (const auto& value : values) benchmark::DoNotOptimize(write(value, format));
  }
  countBytes(state, documents().in(format));
}

void peersWriting(benchmark::State& state, const Documents& (*documents)(), PropertyListFormat format) {
  std::vector<plist_t> roots;
  for (const auto& data : documents().binary) roots.push_back(peerRead(data, PropertyListFormat::binary));
  for (auto _ : state) {
    for (const auto root : roots) {
      char* bytes = nullptr;
      std::uint32_t size = 0;
      if (format == PropertyListFormat::xml) {
        plist_to_xml(root, &bytes, &size);
        plist_to_xml_free(bytes);
      } else {
        plist_to_bin(root, &bytes, &size);
        plist_to_bin_free(bytes);
      }
    }
  }
  countBytes(state, documents().in(format));
  for (const auto root : roots) plist_free(root);
}

std::string contents(const char* path) {
  std::ifstream file(path, std::ios::binary | std::ios::ate);
  std::string bytes(static_cast<std::size_t>(file.tellg()), '\0');
  file.seekg(0);
  file.read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
  return bytes;
}

// In a process of its own: what reading a file costs in memory, the file's bytes included.
int measureMemory(const char* path) {
  const auto before = peakMemory();
  const Data data(contents(path));
  const auto value = read(data);
  const auto peak = peakMemory() - before;
  std::printf("%zu bytes of input, %zu bytes at the peak: %.2f times the input\n", data.size(), peak,
              static_cast<double>(peak) / static_cast<double>(data.size()));
  return 0;
}

}  // namespace

#define COMPARE(documents, form)                                                                   \
  BENCHMARK_CAPTURE(ours, read_##form##_##documents, documents, PropertyListFormat::form);         \
  BENCHMARK_CAPTURE(peers, read_##form##_##documents, documents, PropertyListFormat::form);        \
  BENCHMARK_CAPTURE(oursWriting, write_##form##_##documents, documents, PropertyListFormat::form); \
  BENCHMARK_CAPTURE(peersWriting, write_##form##_##documents, documents, PropertyListFormat::form)
COMPARE(large, xml);
COMPARE(small, xml);
COMPARE(large, binary);
COMPARE(small, binary);

// `--memory FILE` measures one reading, `--write-large FILE` makes the file for it.
int main(int argc, char** argv) {
  if (argc == 3 && std::string_view(argv[1]) == "--memory") return measureMemory(argv[2]);
  if (argc == 3 && std::string_view(argv[1]) == "--write-large") {
    std::ofstream(argv[2], std::ios::binary) << large().xml[0].view();
    return 0;
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  return 0;
}
