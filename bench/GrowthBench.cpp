/// How time grows with the input: each operation at three sizes, each eight times the one before. Called as
/// `GrowthBench --once NAME SIZE`, it does one of them once and prints the most memory that it held, in bytes, beside
/// what it held before it began.

#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <functional>
#include <random>

#include "GeneratedBook.h"
#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/MarletFoundation.h"
#include "Process.h"
#include "tools/marlet/JSON.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;
using MarletDiff::DiffOptions;
using MarletDiff::FileDiffDescriptor;

namespace {

/// A directory that goes with the last copy of the work that uses it.
struct Scratch {
  std::string path =
      ((fs::exists("/dev/shm") ? fs::path("/dev/shm") : fs::temp_directory_path()) / "marlet-growth-XXXXXX")
          .string();
  Scratch() {
    if (!::mkdtemp(path.data())) std::exit(1);
  }
  ~Scratch() { fs::remove_all(path); }
  Scratch(const Scratch&) = delete;
};
using SharedScratch = std::shared_ptr<Scratch>;

URL bookIn(const SharedScratch& scratch, const std::string& name = "Book") {
  return URL::file(scratch->path + "/" + name + ".marletbook", true);
}

/// What is made ready for a size and then measured.
using Work = std::function<void()>;

Work opening(int pages) {
  const auto scratch = std::make_shared<Scratch>();
  const auto url = bookIn(scratch);
  generateBook(url.path(), pages, 0);
  return
      [scratch, url] { benchmark::DoNotOptimize(MarletBookSnapshot(FileWrapper(url), url).chapters.size()); };
}

/// Source lines of a few words, a tag on every 20th; with `salt`, other words on a line in a hundred.
std::u16string source(int lines, int salt = 0, int first = 0) {
  std::u16string text;
  for (int line = 0; line < lines; ++line) {
    const bool changed = salt != 0 && line % 100 == first;
    std::mt19937 random(static_cast<unsigned>(line));
    if (line % 40 == 19) text += u"//#-editable-code\n";
    if (line % 40 == 39) text += u"//#-end-editable-code\n";
    for (auto words = 3 + random() % 6; words > 0; --words) {
      constexpr const char16_t* vocabulary[] = {u"let ", u"value ", u"= ", u"turtle.forward ",
                                                u"for ", u"é "};
      text += vocabulary[random() % std::size(vocabulary)];
    }
    for (const char digit : std::to_string(random() % 1000 + (changed ? 1000 * salt : 0)))
      text += static_cast<char16_t>(digit);
    text += u'\n';
  }
  return text;
}

Work scanning(int lines) {
  return [text = source(lines)] { benchmark::DoNotOptimize(SourceTag::parseStringForValidTags(text)); };
}

Work converting(int lines) {
  const auto text = std::make_shared<const std::u16string>(source(lines));
  return [text] {
    UTF8RangeConverter converter(text);
    std::int64_t sum = 0;
    for (std::int64_t index = 0; index < std::ssize(*text); index += 100)
      sum += converter.utf16IndexFromUTF8Index(index);
    benchmark::DoNotOptimize(sum);
  };
}

Work diffing(int lines) {
  return [original = source(lines), modified = source(lines, 1)] {
    benchmark::DoNotOptimize(MarletDiff::diffContent(original, modified, DiffOptions::SmallerHunks));
  };
}

/// Texts in which no line has only one partner, so that the search is cut short by its budget.
Work diffingFewSymbols(int lines) {
  const auto text = [lines](unsigned seed) {
    std::mt19937 random(seed);
    std::u16string result;
    for (int line = 0; line < lines; ++line) (result += static_cast<char16_t>(u'a' + random() % 10)) += u'\n';
    return result;
  };
  return [original = text(1), modified = text(2)] {
    benchmark::DoNotOptimize(MarletDiff::diffContent(original, modified, DiffOptions::SmallerHunks));
  };
}

/// One of several equal lines goes, which may be any of them: each place where it could have stood is weighed.
Work diffingEqualLines(std::u16string_view piece, int pieces, int lines) {
  std::u16string line, text;
  for (int i = 0; i < pieces; ++i) line += piece;
  line += u'\n';
  for (int i = 0; i < lines; ++i) text += line;
  return [original = text, modified = text.substr(line.size())] {
    benchmark::DoNotOptimize(MarletDiff::diffContent(original, modified, DiffOptions::SmallerHunks));
  };
}
Work diffingParagraphs(int pieces) { return diffingEqualLines(u"学校で学ぶ、", pieces, 2); }
Work diffingAccents(int pieces) { return diffingEqualLines(u"é ", pieces, 40); }

/// The two sides change either end of every tenth paragraph, in which nothing is set apart by blanks.
Work mergingParagraphs(int paragraphs) {
  std::mt19937 random(1);
  std::u16string base, left, right;
  for (int i = 0; i < paragraphs; ++i) {
    std::u16string text;
    for (int j = 0; j < 500; ++j)
      text += j % 10 == 9 ? u'、' : static_cast<char16_t>(u'一' + random() % 2000);
    base += text + u'\n';
    left += (i % 10 == 0 ? u"左" : u"") + text + u'\n';
    right += text + (i % 10 == 0 ? u"右\n" : u"\n");
  }
  return [base, left, right] {
    const auto diff = MarletDiff::diffContent(base, left, DiffOptions::SmallerHunks);
    const auto otherDiff = MarletDiff::diffContent(base, right, DiffOptions::SmallerHunks);
    benchmark::DoNotOptimize(MarletDiff::mergeContent(base, diff, otherDiff));
  };
}

Work merging(int lines) {
  return [base = source(lines), left = source(lines, 1), right = source(lines, 2, 50)] {
    const auto diff = MarletDiff::diffContent(base, left, DiffOptions::SmallerHunks);
    const auto otherDiff = MarletDiff::diffContent(base, right, DiffOptions::SmallerHunks);
    benchmark::DoNotOptimize(MarletDiff::mergeContent(base, diff, otherDiff));
  };
}

Work readingReferences(int count) {
  std::string text = "<string>";
  for (int i = 0; i < count; ++i) text += "a &lt; b &amp;&amp; c\n";
  return
      [data = Data(text + "</string>")] { benchmark::DoNotOptimize(PropertyListSerialization::read(data)); };
}

Work writingNumbers(int count) {
  PropertyListValue::Array numbers;
  for (std::int64_t i = 1; i <= count; ++i) numbers.push_back(i << 44);
  return [value = PropertyListValue(std::move(numbers))] {
    benchmark::DoNotOptimize(PropertyListSerialization::write(value, PropertyListFormat::binary));
  };
}

std::vector<std::string> shuffledKeys(int count) {
  std::vector<std::string> keys;
  for (int i = 0; i < count; ++i) keys.push_back("key " + std::to_string(i));
  std::shuffle(keys.begin(), keys.end(), std::mt19937(1));
  return keys;
}

Work fillingDictionary(int count) {
  return [keys = shuffledKeys(count)] {
    PropertyListDictionary dictionary;
    for (const auto& key : keys) dictionary[key] = true;
    for (const auto& key : keys) dictionary.erase(key);
    benchmark::DoNotOptimize(dictionary.size());
  };
}

Work printingKeys(int count) {
  PropertyListDictionary::Entries entries;
  for (const auto& key : shuffledKeys(count)) entries.push_back({SharedString(key), true});
  return [value = PropertyListValue(PropertyListDictionary(std::move(entries)))] {
    benchmark::DoNotOptimize(jsonText(value));
  };
}

/// One chapter whose manifest names its first page so many times.
Work openingRepeats(int times) {
  const auto scratch = std::make_shared<Scratch>();
  const auto url = bookIn(scratch);
  generateBook(url.path(), 1, 0);
  const PropertyListDictionary manifest{
      {"Name", "Repeats"},
      {"Pages",
       PropertyListValue::Array(static_cast<std::size_t>(times), PropertyListValue("Page0.marletpage"))}};
  writePropertyList(PropertyListValue(manifest),
                    URL::file(url.path() + "/Contents/Chapters/Chapter0.marletchapter/Manifest.plist"),
                    PropertyListFormat::binary);
  return
      [scratch, url] { benchmark::DoNotOptimize(MarletBookSnapshot(FileWrapper(url), url).chapters.size()); };
}

std::string sourcePath(int page) {
  return "Chapters/Chapter" + std::to_string(page / 100) + ".marletchapter/Pages/Page" +
         std::to_string(page) + ".marletpage/Contents.swift";
}

void writeSources(const URL& book, int pages, const std::function<std::string(int)>& text) {
  for (int page = 0; page < pages; ++page)
    std::ofstream(book.path() + "/Contents/" + sourcePath(page), std::ios::binary) << text(page);
}

std::string lampSource(int version) {
  auto text = "let version = " + std::to_string(version) + "\n";
  for (int line = 0; line < 60; ++line) text += "lamp.flash(times: " + std::to_string(line) + ")\n";
  return text + "lamp.color = 3\n";
}

/// Makes an update of two books that differ in every tenth page, and writes it.
Work packing(int pages) {
  const auto scratch = std::make_shared<Scratch>();
  const auto original = bookIn(scratch), updated = bookIn(scratch, "Updated");
  const auto pack = URL::file(scratch->path + "/Update.diffpack", true);
  generateBook(original.path(), pages, 0);
  generateBook(updated.path(), pages, 0, "1.0.1");
  writeSources(original, pages, [](int) { return lampSource(1); });
  writeSources(updated, pages, [](int page) { return lampSource(page % 10 == 0 ? 2 : 1); });
  return
      [scratch, original, updated, pack] { makeUpdateDiffPack(original, updated).fileWrapper().write(pack); };
}

/// Every tenth page is changed by the update and by the learner, in different lines; there and back.
Work applying(int pages) {
  const auto scratch = std::make_shared<Scratch>();
  const auto url = bookIn(scratch);
  generateBook(url.path(), pages, 0);
  writeSources(url, pages, [](int) { return lampSource(1); });
  const auto place = static_cast<std::int64_t>(lampSource(1).size()) - 2;
  std::vector<FileDiffDescriptor> edits, forward, back;
  for (int page = 0; page < pages; page += 10) {
    const auto path = sourcePath(page);
    edits.push_back({FileDiffDescriptor::Modified{path, {{{place, 1}, {place, 1}, u"3", u"4"}}}});
    forward.push_back({FileDiffDescriptor::Modified{path, {{{14, 1}, {14, 2}, u"1", u"22"}}}});
    back.push_back({FileDiffDescriptor::Modified{path, {{{14, 2}, {14, 1}, u"22", u"1"}}}});
  }
  const auto pack = [&](DiffPackType type, std::vector<FileDiffDescriptor> updates) {
    return DiffPackSnapshot(type, DiffPackDocumentType::MarletBook,
                            url.appendingPathComponent("Contents", true), "bench.large", "1.0", "1.0",
                            std::move(updates));
  };
  fs::create_directories(url.path() + "/Edits");
  pack(DiffPackType::UserEditPack, std::move(edits))
      .fileWrapper()
      .write(url.appendingPathComponent("Edits/UserEdits.diffpack"));
  return [scratch, url, there = pack(DiffPackType::UpdatePack, std::move(forward)),
          andBack = pack(DiffPackType::UpdatePack, std::move(back))] {
    applyUpdateDiffPack(url, there);
    applyUpdateDiffPack(url, andBack);
  };
}

struct Operation {
  const char* name;
  Work (*prepare)(int size);
  int smallest;
};
constexpr Operation operations[] = {
    {"opening", opening, 250},
    {"scanning", scanning, 16000},
    {"converting", converting, 16000},
    {"diffing", diffing, 16000},
    {"diffingFewSymbols", diffingFewSymbols, 16000},
    {"diffingParagraphs", diffingParagraphs, 1000},
    {"diffingAccents", diffingAccents, 500},
    {"merging", merging, 16000},
    {"mergingParagraphs", mergingParagraphs, 100},
    {"readingReferences", readingReferences, 16000},
    {"writingNumbers", writingNumbers, 16000},
    {"fillingDictionary", fillingDictionary, 16000},
    {"printingKeys", printingKeys, 16000},
    {"openingRepeats", openingRepeats, 2000},
    {"packing", packing, 32},
    {"applying", applying, 32},
};

void measure(benchmark::State& state, Work (*prepare)(int)) {
  const auto work = prepare(static_cast<int>(state.range(0)));
  for (auto _ : state) work();
}

int once(std::string_view name, int size) {
  for (const auto& operation : operations) {
    if (operation.name != name) continue;
    const auto work = operation.prepare(size);
    const auto before = peakMemory();
    work();
    std::printf("%zu %zu\n", peakMemory(), before);
    return 0;
  }
  return 1;
}

}  // namespace

int main(int argc, char** argv) {
  auto environment = HostEnvironment::defaults();
  environment.diagnostics = [](std::string_view) {};
  HostEnvironment::setCurrent(std::move(environment));
  if (argc == 4 && std::string_view(argv[1]) == "--once") return once(argv[2], std::atoi(argv[3]));
  for (const auto& operation : operations) {
    benchmark::RegisterBenchmark(operation.name, measure, operation.prepare)
        ->Arg(operation.smallest)
        ->Arg(8 * operation.smallest)
        ->Arg(64 * operation.smallest)
        ->Unit(benchmark::kMillisecond);
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}
