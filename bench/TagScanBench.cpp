// Finding tags beside a loop over the units that looks for "#-" behind "//" or "/*", and beside `memchr` over the
// same bytes. Texts are of 100 million units, with a tag every 40 lines or with none. `linear…` runs at three
// sizes, whose time for a unit is to be the same.
#include <benchmark/benchmark.h>

#include <cstring>
#include <string>

#include "MarletFoundation/SourceAnnotations/SourceTag.h"
#include "MarletFoundation/SourceAnnotations/TagCandidates.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t longText = 100'000'000;
constexpr std::size_t cachedText = 50'000;

/// Lines of code; a field opens or ends on every 40th.
std::u16string source(std::size_t units, bool withTags) {
  constexpr std::u16string_view lines[] = {
      u"    for index in 0..<values.count where values[index] > threshold {\n",
      u"        let result = transform(values[index], by: \\.description) ?? \"none\"\n",
      u"        // Keep what the reader asked for, and nothing else.\n",
      u"        results.append(Result(name: result, weight: 0.5 * Double(index)))\n",
      u"    }\n",
      u"\n",
  };
  std::u16string text;
  text.reserve(units + 100);
  for (std::size_t line = 0; text.size() < units; ++line) {
    if (withTags && line % 80 == 39) text += u"    //#-editable-code\n";
    if (withTags && line % 80 == 79) text += u"    //#-end-editable-code\n";
    text += lines[line % std::size(lines)];
  }
  return text;
}

/// 0: without tags; 1: with tags; 2: without tags, and so short that it stays in the cache, since memory's own
/// speed hides the loops' over the long ones.
const std::u16string& sourceOf(const benchmark::State& state) {
  static const std::u16string sources[] = {source(longText, false), source(longText, true),
                                           source(cachedText, false)};
  return sources[state.range(0)];
}

void setRate(benchmark::State& state, std::size_t units) {
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(units));
}

[[gnu::noinline]] std::size_t naiveCount(std::u16string_view text) {
  std::size_t count = 0;
  for (std::size_t i = 0; i + 3 < text.size(); ++i) {
    if (text[i] == u'/' && (text[i + 1] == u'/' || text[i + 1] == u'*') && text[i + 2] == u'#' &&
        text[i + 3] == u'-')
      ++count;
  }
  return count;
}

void naiveLoop(benchmark::State& state) {
  const auto& text = sourceOf(state);
  for (auto _ : state) benchmark::DoNotOptimize(naiveCount(text));
  setRate(state, text.size());
}

/// A byte that the text doesn't hold, so that every byte is looked at once.
void memchrOfBytes(benchmark::State& state) {
  const auto& text = sourceOf(state);
  for (auto _ : state) benchmark::DoNotOptimize(std::memchr(text.data(), 0x7F, text.size() * sizeof text[0]));
  setRate(state, text.size());
}

void candidates(benchmark::State& state) {
  const auto& text = sourceOf(state);
  for (auto _ : state) {
    std::size_t count = 0;
    for (auto at = nextTagCandidate(text, 0); at != text.npos; at = nextTagCandidate(text, at + 4)) ++count;
    benchmark::DoNotOptimize(count);
  }
  setRate(state, text.size());
}

void parseStringForTags(benchmark::State& state) {
  const auto& text = sourceOf(state);
  for (auto _ : state) benchmark::DoNotOptimize(SourceTag::parseStringForTags(text));
  setRate(state, text.size());
}

BENCHMARK(naiveLoop)->DenseRange(0, 2)->Unit(benchmark::kMicrosecond);
BENCHMARK(memchrOfBytes)->DenseRange(0, 2)->Unit(benchmark::kMicrosecond);
BENCHMARK(candidates)->DenseRange(0, 2)->Unit(benchmark::kMicrosecond);
BENCHMARK(parseStringForTags)->DenseRange(0, 2)->Unit(benchmark::kMicrosecond);

void pageOf300Lines(benchmark::State& state) {
  const auto text = source(300 * 44, true);
  for (auto _ : state) benchmark::DoNotOptimize(SourceTag::parseStringForValidTags(text));
}
BENCHMARK(pageOf300Lines)->Unit(benchmark::kMicrosecond);

void linear(benchmark::State& state, const std::u16string& text) {
  for (auto _ : state) benchmark::DoNotOptimize(SourceTag::parseStringForValidTags(text));
  setRate(state, text.size());
}

std::u16string repeated(std::u16string_view piece, std::int64_t count) {
  std::u16string text;
  for (std::int64_t i = 0; i < count; ++i) text += piece;
  return text;
}

void linearText(benchmark::State& state) {
  linear(state, source(static_cast<std::size_t>(state.range(0)) * 100, true));
}
void linearTags(benchmark::State& state) {
  linear(state, repeated(u"a = /*#-editable-code x*/1/*#-end-editable-code*/\n", state.range(0)));
}
void linearNesting(benchmark::State& state) {
  linear(state, repeated(u"//#-copy-source(x)\n", state.range(0)) +
                    repeated(u"//#-end-copy-source\n", state.range(0)));
}
void linearOpenTags(benchmark::State& state) {
  linear(state, repeated(u"//#-hidden-code\n", state.range(0)));
}
void linearSharedEnd(benchmark::State& state) {
  linear(state, repeated(u"/*#-editable-code ", state.range(0)) + u"*/");
}
BENCHMARK(linearText)->RangeMultiplier(8)->Range(4'096, 262'144)->Unit(benchmark::kMillisecond);
BENCHMARK(linearTags)->RangeMultiplier(8)->Range(4'096, 262'144)->Unit(benchmark::kMillisecond);
BENCHMARK(linearNesting)->RangeMultiplier(8)->Range(4'096, 262'144)->Unit(benchmark::kMillisecond);
BENCHMARK(linearOpenTags)->RangeMultiplier(8)->Range(4'096, 262'144)->Unit(benchmark::kMillisecond);
BENCHMARK(linearSharedEnd)->RangeMultiplier(8)->Range(4'096, 262'144)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace MarletFoundation

BENCHMARK_MAIN();
