// Converting between UTF-8 and UTF-16, and ranges between their offsets, beside ICU on the same texts.

#include <benchmark/benchmark.h>
#include <unicode/ustring.h>

#include <random>

#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/SourceEditor/SourceEditorUTF8RangeConverter.h"

namespace {

using namespace MarletFoundation;

constexpr std::size_t size = 10'000'000;
constexpr std::int64_t rangeCount = 100'000;

/// About 10 MB of UTF-8, line by line of words.
std::string textOf(std::initializer_list<const char*> words) {
  std::mt19937 random(1);
  std::string text;
  while (text.size() < size) {
    text += words.begin()[random() % words.size()];
    text += random() % 8 == 0 ? '\n' : ' ';
  }
  return text;
}

const std::string& ascii() {
  static const auto text = textOf({"for", "step", "in", "1...10", "{", "climb(step)", "}", "// up we go"});
  return text;
}
const std::string& accented() {
  static const auto text = textOf({"für", "Schritt", "à", "déjà", "größer", "öffne(tür)", "été", "schön"});
  return text;
}
const std::string& astral() {
  static const auto text = textOf({"😀😀😀", "🚀", "𝒳𝒴", "🐢🐢", "𝔽𝔽𝔽𝔽"});
  return text;
}
/// A source as people write it: code with now and then a word of another script.
const std::string& mixed() {
  static const auto text =
      textOf({"let", "größe", "=", "turtle.forward(10)", "// добро", "\"日本\"", "🐢", "return"});
  return text;
}

/// The text's beginning in pieces of the size of a source file, which are cut between lines: ten files that are in
/// the cache, as they are when they were just read or edited.
std::vector<std::string> filesOf(const std::string& text) {
  std::vector<std::string> files;
  for (std::size_t start = 0; files.size() < 10;) {
    const auto end = std::min(text.find('\n', start + 32768), text.size() - 1) + 1;
    files.push_back(text.substr(start, end - start));
    start = end;
  }
  return files;
}

std::vector<std::u16string> decodedFilesOf(const std::string& text) {
  std::vector<std::u16string> files;
  for (const auto& file : filesOf(text)) files.push_back(*utf16FromUTF8(file));
  return files;
}

void decodeOurs(benchmark::State& state, const std::string& (*text)()) {
  const auto files = filesOf(text());
  for (auto _ : state) {
    for (const auto& file : files) benchmark::DoNotOptimize(utf16FromUTF8(file));
  }
}

void decodeICU(benchmark::State& state, const std::string& (*text)()) {
  const auto files = filesOf(text());
  for (auto _ : state) {
    for (const auto& file : files) {
      std::u16string result(file.size(), u'\0');
      std::int32_t length = 0;
      UErrorCode status = U_ZERO_ERROR;
      u_strFromUTF8(result.data(), static_cast<std::int32_t>(result.size()), &length, file.data(),
                    static_cast<std::int32_t>(file.size()), &status);
      result.resize(static_cast<std::size_t>(length));
      benchmark::DoNotOptimize(result);
    }
  }
}

void encodeOurs(benchmark::State& state, const std::string& (*text)()) {
  const auto files = decodedFilesOf(text());
  for (auto _ : state) {
    for (const auto& file : files) benchmark::DoNotOptimize(utf8FromUTF16(file));
  }
}

void encodeICU(benchmark::State& state, const std::string& (*text)()) {
  const auto files = decodedFilesOf(text());
  for (auto _ : state) {
    for (const auto& file : files) {
      std::string result(file.size() * 3, '\0');
      std::int32_t length = 0;
      UErrorCode status = U_ZERO_ERROR;
      u_strToUTF8(result.data(), static_cast<std::int32_t>(result.size()), &length, file.data(),
                  static_cast<std::int32_t>(file.size()), &status);
      result.resize(static_cast<std::size_t>(length));
      benchmark::DoNotOptimize(result);
    }
  }
}

/// Ranges of a few bytes, in ascending order over the whole text.
void convertRanges(benchmark::State& state, const std::string& (*text)()) {
  const auto string = std::make_shared<const std::u16string>(*utf16FromUTF8(text()));
  const auto stride = static_cast<std::int64_t>(text().size()) / rangeCount;
  for (auto _ : state) {
    UTF8RangeConverter converter(string);
    std::int64_t sum = 0;
    for (std::int64_t i = 0; i < rangeCount; ++i) {
      sum += converter.utf16IndexFromUTF8Index(i * stride);
      sum += converter.utf16IndexFromUTF8Index(i * stride + 8);
    }
    benchmark::DoNotOptimize(sum);
  }
}

/// One pass of ICU over the text, into memory that is there.
void convertOnceWithICU(benchmark::State& state, const std::string& (*text)()) {
  const auto source = *utf16FromUTF8(text());
  std::string result(text().size(), '\0');
  for (auto _ : state) {
    std::int32_t length = 0;
    UErrorCode status = U_ZERO_ERROR;
    u_strToUTF8(result.data(), static_cast<std::int32_t>(result.size()), &length, source.data(),
                static_cast<std::int32_t>(source.size()), &status);
    benchmark::DoNotOptimize(length);
  }
}

}  // namespace

#define COMPARE_IN(unit, ours, peers, text)                   \
  BENCHMARK_CAPTURE(ours, text, text)->Unit(benchmark::unit); \
  BENCHMARK_CAPTURE(peers, text, text)->Unit(benchmark::unit)
COMPARE_IN(kMicrosecond, decodeOurs, decodeICU, ascii);
COMPARE_IN(kMicrosecond, decodeOurs, decodeICU, mixed);
COMPARE_IN(kMicrosecond, decodeOurs, decodeICU, accented);
COMPARE_IN(kMicrosecond, encodeOurs, encodeICU, ascii);
COMPARE_IN(kMicrosecond, encodeOurs, encodeICU, mixed);
COMPARE_IN(kMillisecond, convertRanges, convertOnceWithICU, ascii);
COMPARE_IN(kMillisecond, convertRanges, convertOnceWithICU, accented);
COMPARE_IN(kMillisecond, convertRanges, convertOnceWithICU, astral);

BENCHMARK_MAIN();
