// Texts, merges and trees compared, side by side with libgit2's line diff and merge on the same input. The
// peers that are programs are in `headlines.py`.
#include <benchmark/benchmark.h>
#include <git2.h>

#include <filesystem>
#include <fstream>
#include <random>

#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/Platform/Text.h"

namespace {

using namespace MarletDiff;
using Lines = std::vector<std::string>;

constexpr const char* vocabulary[] = {"let",   "value",   "turtle", "step",  "(",      ")",
                                      "=",     "forward", "func",   "for",   "in",     "range",
                                      "count", "self",    "angle",  "while", "return", "if",
                                      "color", "draw",    "+",      "1",     "\"é\"",  "// turn"};

std::string statement(std::mt19937& random) {
  std::string line(4 * (random() % 4), ' ');
  for (auto words = 3 + random() % 8; words > 0; --words) {
    line += vocabulary[random() % std::size(vocabulary)];
    line += ' ';
  }
  return line + std::to_string(random() % 1000);
}

/// About 1 MB of source, of which a fifth is empty lines and lone braces.
Lines source() {
  std::mt19937 random(1);
  Lines lines;
  for (std::size_t size = 0; size < 1'000'000; size += lines.back().size() + 1) {
    const auto kind = random() % 10;
    lines.push_back(kind == 0 ? "" : kind == 1 ? "    }" : statement(random));
  }
  return lines;
}

/// With a word of every so many lines changed.
Lines changed(Lines lines, std::size_t every, std::size_t from = 0) {
  for (auto i = from; i < lines.size(); i += every) {
    auto& line = lines[i];
    const auto blank = line.rfind(' ');
    line.replace(blank == std::string::npos ? 0 : blank + 1, std::string::npos,
                 "changed" + std::to_string(i));
  }
  return lines;
}

std::string joined(const Lines& lines, char separator = '\n') {
  std::string text;
  for (const auto& line : lines) (text += line) += separator;
  return text;
}

struct Pair {
  std::string original, modified;
  std::u16string wide = *MarletFoundation::utf16FromUTF8(original);
  std::u16string wideModified = *MarletFoundation::utf16FromUTF8(modified);
};

Pair fewLines() { return {joined(source()), joined(changed(source(), 100))}; }
Pair everyThirdLine() { return {joined(source()), joined(changed(source(), 3))}; }

Pair tenSymbols() {
  std::mt19937 random(2);
  const auto text = [&] {
    Lines lines(200'000);
    for (auto& line : lines) line = static_cast<char>('a' + random() % 10);
    return joined(lines);
  };
  const auto original = text();
  return {original, text()};
}

/// One line of 1 MB, with a word in a hundred changed.
Pair longLine() {
  std::mt19937 random(3);
  Lines words;
  for (std::size_t size = 0; size < 1'000'000; size += words.back().size() + 1) {
    words.push_back(vocabulary[random() % std::size(vocabulary)] + std::to_string(random() % 50));
  }
  auto other = words;
  for (auto& word : other) {
    if (random() % 100 == 0) word = "changed" + std::to_string(random() % 1000);
  }
  return {joined(words, ' '), joined(other, ' ')};
}

void ours(benchmark::State& state, Pair (*texts)()) {
  const auto pair = texts();
  std::size_t hunks = 0;
  for (auto _ : state) {
    hunks = diffContent(pair.wide, pair.wideModified, DiffOptions::SmallerHunks).size();
  }
  state.counters["hunks"] = static_cast<double>(hunks);
}

int countHunk(const git_diff_delta*, const git_diff_hunk*, void* count) {
  ++*static_cast<std::size_t*>(count);
  return 0;
}

std::size_t peerHunks(const std::string& original, const std::string& modified) {
  git_diff_options options = GIT_DIFF_OPTIONS_INIT;
  options.context_lines = 0;
  std::size_t hunks = 0;
  git_diff_buffers(original.data(), original.size(), "a", modified.data(), modified.size(), "a", &options,
                   nullptr, nullptr, countHunk, nullptr, &hunks);
  return hunks;
}

void libgit2(benchmark::State& state, Pair (*texts)()) {
  const auto pair = texts();
  std::size_t hunks = 0;
  for (auto _ : state) hunks = peerHunks(pair.original, pair.modified);
  state.counters["hunks"] = static_cast<double>(hunks);
}

/// A diff by characters, the way a line diff makes one: each character on a line of its own.
Pair characterLines(const Pair& pair) {
  const auto spread = [](const std::string& text) {
    std::string lines;
    for (std::size_t i = 0; i < text.size(); ++i) {
      lines += text[i];
      if (i + 1 == text.size() || (text[i + 1] & 0xC0) != 0x80) lines += '\n';
    }
    return lines;
  };
  return {spread(pair.original), spread(pair.modified)};
}
Pair longLineCharacters() { return characterLines(longLine()); }

struct Sides {
  std::string base = joined(source()), left = joined(changed(source(), 100)),
              right = joined(changed(source(), 100, 50));
};

/// What a merge of three texts costs, both diffs with it.
void oursMerge(benchmark::State& state) {
  const Sides sides;
  const auto base = *MarletFoundation::utf16FromUTF8(sides.base);
  const auto left = *MarletFoundation::utf16FromUTF8(sides.left);
  const auto right = *MarletFoundation::utf16FromUTF8(sides.right);
  for (auto _ : state) {
    const auto diff = diffContent(base, left, DiffOptions::SmallerHunks);
    const auto otherDiff = diffContent(base, right, DiffOptions::SmallerHunks);
    benchmark::DoNotOptimize(mergeContent(base, diff, otherDiff));
  }
}

void libgit2Merge(benchmark::State& state) {
  const Sides sides;
  const auto input = [](const std::string& text) {
    git_merge_file_input side = GIT_MERGE_FILE_INPUT_INIT;
    side.ptr = text.data();
    side.size = text.size();
    return side;
  };
  const auto base = input(sides.base), left = input(sides.left), right = input(sides.right);
  for (auto _ : state) {
    git_merge_file_result result{};
    git_merge_file(&result, &base, &left, &right, nullptr);
    git_merge_file_result_free(&result);
  }
}

/// Writes the texts where a script can hand them to programs.
int writeTexts(const std::filesystem::path& directory) {
  const auto write = [&](const std::string& name, const std::string& text) {
    std::ofstream(directory / name, std::ios::binary) << text;
  };
  const std::pair<const char*, Pair> pairs[] = {{"few", fewLines()},
                                                {"third", everyThirdLine()},
                                                {"symbols", tenSymbols()},
                                                {"line", longLine()},
                                                {"characters", longLineCharacters()}};
  for (const auto& [name, pair] : pairs) {
    write(name + std::string(".old"), pair.original);
    write(name + std::string(".new"), pair.modified);
  }
  const Sides sides;
  write("base", sides.base);
  write("left", sides.left);
  write("right", sides.right);
  std::mt19937 random(4);
  for (const auto* tree : {"old", "new"}) {
    for (int i = 0; i < 5000; ++i) {
      const auto inside = directory / tree / std::to_string(i / 50);
      std::filesystem::create_directories(inside);
      std::mt19937 same(static_cast<unsigned>(i));
      std::ofstream file(inside / (std::to_string(i) + ".swift"));
      for (int line = 0; line < 40; ++line) file << statement(same) << '\n';
      if (i % 50 == 0) file << tree << '\n';
    }
  }
  return 0;
}

}  // namespace

#define COMPARE(texts)                   \
  BENCHMARK_CAPTURE(ours, texts, texts); \
  BENCHMARK_CAPTURE(libgit2, texts, texts)
COMPARE(fewLines);
COMPARE(everyThirdLine);
COMPARE(tenSymbols);
BENCHMARK_CAPTURE(ours, longLine, longLine);
BENCHMARK_CAPTURE(libgit2, longLineCharacters, longLineCharacters);
BENCHMARK(oursMerge);
BENCHMARK(libgit2Merge);

// `--write-texts DIRECTORY` writes the input of DiffDriver and its peers.
int main(int argc, char** argv) {
  if (argc == 3 && std::string_view(argv[1]) == "--write-texts") return writeTexts(argv[2]);
  git_libgit2_init();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  return 0;
}
