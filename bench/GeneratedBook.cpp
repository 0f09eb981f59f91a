#include "GeneratedBook.h"

#include <algorithm>
#include <fstream>

#include "MarletFoundation/MarletFoundation.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;
using D = PropertyListDictionary;

namespace {

void write(const fs::path& path, const PropertyListValue& value, PropertyListFormat format) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << PropertyListSerialization::write(value, format).view();
}

void writeHole(const fs::path& path, std::uintmax_t size) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary).flush();
  fs::resize_file(path, size);
}

PropertyListValue pageManifest(int page) {
  return D{{"Name", "Page " + std::to_string(page)},
           {"Description",
            "How the loop that was met on page " + std::to_string(page - 1) + " is told when to stop"},
           {"LiveViewMode", "VisibleByDefault"},
           {"LiveViewEdgeToEdge", false},
           {"PosterReference", "Poster.png"},
           {"Hints", PropertyListValue::Array{D{{"Content", "Count on your fingers first."}}}}};
}

PropertyListValue resultInfo(int page) {
  const D status = page % 3 == 0
                       ? D{{"Status", "Pass"}, {"Message", "Well done!"}}
                       : D{{"Status", "Fail"}, {"Hints", PropertyListValue::Array{"Look at the last turn."}}};
  return D{{"Version", "1.0"},
           {"AssessmentInformation", D{{"Status", status}, {"EverPassed", page % 2 == 0}}}};
}

}  // namespace

void generateBook(const fs::path& book, int pages, std::uintmax_t bulk, std::string_view contentVersion) {
  const auto contents = book / "Contents";
  PropertyListValue::Array chapterNames;
  for (int first = 0; first < pages; first += 100) {
    const auto chapterName = "Chapter" + std::to_string(first / 100) + ".marletchapter";
    const auto chapter = contents / "Chapters" / chapterName;
    PropertyListValue::Array pageNames;
    for (int page = first; page < std::min(pages, first + 100); ++page) {
      const auto pageName = "Page" + std::to_string(page) + ".marletpage";
      const auto directory = chapter / "Pages" / pageName;
      write(directory / "Manifest.plist", pageManifest(page), PropertyListFormat::xml);
      write(directory / "ResultInfo.plist", resultInfo(page), PropertyListFormat::binary);
      writeHole(directory / "Contents.swift", bulk);
      writeHole(directory / "Resources" / "Movie.mov", bulk);
      pageNames.emplace_back(pageName);
    }
    write(chapter / "Manifest.plist", D{{"Name", chapterName}, {"Pages", pageNames}},
          PropertyListFormat::xml);
    chapterNames.emplace_back(chapterName);
  }
  write(contents / "Manifest.plist",
        D{{"Version", "1.0"},
          {"Name", "A large book"},
          {"ContentIdentifier", "bench.large"},
          {"ContentVersion", std::string(contentVersion)},
          {"DeploymentTarget", "slateos10.0"},
          {"Chapters", chapterNames}},
        PropertyListFormat::xml);
}

std::vector<std::string> pageFiles(const fs::path& book) {
  std::vector<std::string> paths;
  for (const auto& chapter : fs::directory_iterator(book / "Contents" / "Chapters")) {
    for (const auto& page : fs::directory_iterator(chapter.path() / "Pages")) {
      paths.push_back(page.path() / "Manifest.plist");
      paths.push_back(page.path() / "ResultInfo.plist");
    }
  }
  std::sort(paths.begin(), paths.end());
  return paths;
}
