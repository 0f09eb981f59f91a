/// Reading JSON into values, beside simdjson's own document over the same bytes: a parser that leaves strings
/// and numbers where they stand, so the ratio shows what values of one's own cost.

#include <benchmark/benchmark.h>
#include <simdjson.h>

#include <random>

#include "MarletFoundation/Data/JSON.h"

namespace {

/// About 2 MB: records of strings, numbers and booleans.
const std::string& document() {
  static const std::string text = [] {
    std::mt19937 random(1);
    std::string result = "[";
    for (int record = 0; record < 15'000; ++record) {
      result += record == 0 ? "" : ",";
      result +=
          R"({"name": "Page )" + std::to_string(record) + R"(", "description": "What \"loop\" means: für", )";
      result += R"("passed": )" + std::string(random() % 2 ? "true" : "false");
      result += R"(, "score": )" + std::to_string(random() % 1000) + "." + std::to_string(random() % 100);
      result += R"(, "hints": [)" + std::to_string(random()) + ", null]}";
    }
    return result + "]";
  }();
  return text;
}

void ours(benchmark::State& state) {
  const MarletFoundation::Data data(document());
  for (auto _ : state) benchmark::DoNotOptimize(MarletFoundation::JSON(data));
}

void simdjsonDocument(benchmark::State& state) {
  const simdjson::padded_string text(document());
  for (auto _ : state) {
    simdjson::dom::parser parser;
    benchmark::DoNotOptimize(parser.parse(text).error());
  }
}

BENCHMARK(ours)->Unit(benchmark::kMillisecond);
BENCHMARK(simdjsonDocument)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
