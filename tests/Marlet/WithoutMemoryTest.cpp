#include <gtest/gtest.h>

#include <fstream>

#include "DiffPack/Packs.h"
#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/Marlet/LegacyTimelineXMLParser.h"
#include "MarletFoundation/MarletFoundation.h"
#include "support/Documents.h"
#include "support/FailingAllocation.h"
#include "support/Zip.h"

namespace MarletFoundation::test {
namespace {

const PropertyListValue list = D{{"Text", "a text that is too long to lie within a string"},
                                 {"Numbers", A{1, 2.5, true, -1}},
                                 {"Nested", A{A{D{}}}}};

/// What a book's snapshot holds, in one text.
std::string contents(const MarletBookSnapshot& book) {
  std::string text = book.name + description(book.manifest());
  for (const auto& chapter : book.chapters) {
    text += chapter.name + description(chapter.manifest());
    for (const auto& page : chapter.pages) {
      const auto& result = page.resultInfoSnapshot;
      text += page.name + (result && result->assessmentInformation() ? "+" : "-");
    }
  }
  return text;
}

}  // namespace

TEST(WithoutMemory, Readers) {
  for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
    const auto written = PropertyListSerialization::write(list, format);
    expectNothingWrongWithoutMemory("reading a list",
                                    [&] { return PropertyListSerialization::read(written); });
    expectNothingWrongWithoutMemory("writing a list",
                                    [&] { return PropertyListSerialization::write(list, format); });
  }
  const Data json(
      std::string(R"({"a text beyond the short ones": [1, 2.5, "a text that is long enough", null]})"));
  expectNothingWrongWithoutMemory("JSON", [&] { return JSON(json); });
  const Data result = PropertyListSerialization::write(
      D{{"Version", "1.0"},
        {"AssessmentInformation",
         D{{"Status", D{{"Status", "Fail"}, {"Hints", A{"Look at the last turn of the loop."}}}},
           {"EverPassed", true}}}},
      PropertyListFormat::xml);
  expectNothingWrongWithoutMemory("a result record", [&] {
    return MarletResultInfoSnapshot(result, MarletResultInfoSnapshot::Format::ResultInfo)
        .assessmentInformation();
  });
  const Data timeline(std::string(
      R"(<?xml version="1.0"?><Timeline version="3.0"><TimelineItems><LoggerValueHistoryTimelineItem )"
      R"(documentLocation="file:///x#CharacterRangeLen=0&amp;StartingLineNumber=7" )"
      R"(selectedRepresentationIndex="0"/></TimelineItems></Timeline>)"));
  expectNothingWrongWithoutMemory("a timeline",
                                  [&] { return LegacyTimelineXMLParser(timeline).parsedResults(); });
}

TEST(WithoutMemory, TagsAndDiffs) {
  const std::u16string source =
      u"//#-editable-code Tap here to write\nlet x = 1\n//#-end-editable-code\n"
      u"//#-code-completion(everything, hide)\n//#-hidden-code\n//#-unknown\n"
      u"let y = /*#-editable-code y*/2/*#-end-editable-code*/\n";
  expectNothingWrongWithoutMemory("tags", [&] { return SourceTag::parseStringForValidTags(source); });
  const std::u16string left = u"one two three\nfour\nfive six\n" + source,
                       right = source + u"seven\neight nine\n";
  const auto diff = [&](std::u16string_view other) {
    return MarletDiff::diffContent(source, other, MarletDiff::DiffOptions::SmallerHunks);
  };
  expectNothingWrongWithoutMemory("a diff", [&] { return diff(left); });
  expectNothingWrongWithoutMemory("a merge",
                                  [&] { return MarletDiff::mergeContent(source, diff(left), diff(right)); });
  const auto pack = goodPack();
  expectNothingWrongWithoutMemory("a pack", [&] {
    return entries(DiffPackSnapshot(pack.wrapper(), URL::file("/nowhere/Contents", true)));
  });
}

TEST(WithoutMemory, DocumentsOnDisk) {
  const TemporaryDirectory directory;
  goodBook().writeTo(directory.path() / "Book.marletbook");
  const auto url = directory.url("Book.marletbook");
  expectNothingWrongWithoutMemory("a book",
                                  [&] { return contents(MarletBookSnapshot(FileWrapper(url), url)); });
  expectNothingWrongWithoutMemory("a page", [&] {
    const auto page = snapshotForPageWithFilename("A.marletpage", "One.marletchapter", url);
    return page->name() + std::to_string(page->fileWrapper().fileWrappers()->size());
  });
  const Tree classic{
      {"contents.wbmarlet",
       R"(<marlet version="6.0" target-platform="slateos"><pages><page name="A page"/></pages></marlet>)"},
      {"Pages/A page.wbmarletpage/Contents.swift", "print(1)\n"},
      {"Resources/shared.png", "s"}};
  classic.writeTo(directory.path() / "Classic.marlet");
  const auto classicURL = directory.url("Classic.marlet");
  expectNothingWrongWithoutMemory("a classic document",
                                  [&] { return MarletSnapshot(FileWrapper(classicURL), classicURL); });
  const auto copy = directory.url("Copy");
  const auto write = [&] {
    FileWrapper(url).write(copy);
    return contents(MarletBookSnapshot(FileWrapper(copy), url));
  };
  expectNothingWrongWithoutMemory("writing", write, 10);
  std::ofstream(directory.path() / "a.zip")
      << zip({{.name = "Top/a", .contents = "a"}, zeros("large", 300'000)});
  int count = 0;
  const auto unarchive = [&] {
    const auto out = directory.url("out" + std::to_string(++count));
    const auto first = Archive::unarchiveFile(directory.url("a.zip"), out);
    return first + std::to_string(std::filesystem::file_size(out.path() + "/large"));
  };
  expectNothingWrongWithoutMemory("an archive", unarchive, 50);
  for (const auto& item : std::filesystem::recursive_directory_iterator(directory.path()))
    EXPECT_FALSE(item.path().filename().string().starts_with(".arc-copier"));
}

}  // namespace MarletFoundation::test
