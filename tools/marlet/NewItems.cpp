#include "NewItems.h"

#include <cerrno>

#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

void add(FileWrapper& parent, const std::string& name, FileWrapper child) {
  child.setPreferredFilename(name);
  parent.addFileWrapper(std::move(child));
}

}  // namespace

FileWrapper xmlFile(const PropertyListValue& value) {
  return FileWrapper::regularFile(PropertyListSerialization::write(value, PropertyListFormat::xml));
}

FileWrapper newBook(const std::string& filename, const std::string& name, const std::string& identifier) {
  const MarletBookSnapshot book(name, filename, std::nullopt, identifier, Version({1, 0}), std::nullopt,
                                Target::targetWithIdentifier("slateos"), std::nullopt, std::nullopt,
                                std::nullopt, std::nullopt, {}, {});
  if (!book.target) throw ErrorObject::posix(ENOENT, "Targets");
  auto contents = FileWrapper::directory();
  auto chapters = FileWrapper::directory();
  add(contents, "Manifest.plist", xmlFile(book.manifest()));
  auto chapter = newChapter("Start", "Start");
  auto pages = *chapter.child("Pages");
  addListed(chapter, "Pages", pages, newCodePage("Hello.marletpage", "Hello"));
  addListed(contents, "Chapters", chapters, std::move(chapter));
  add(contents, "Chapters", std::move(chapters));
  auto root = FileWrapper::directory();
  add(root, "Contents", std::move(contents));
  return root;
}

FileWrapper newChapter(const std::string& filename, const std::string& name) {
  const MarletChapterSnapshot chapter(name, filename, std::nullopt, std::nullopt, std::nullopt, std::nullopt,
                                      {});
  auto directory = FileWrapper::directory();
  add(directory, "Manifest.plist", xmlFile(chapter.manifest()));
  add(directory, "Pages", FileWrapper::directory());
  directory.setPreferredFilename(filename);
  return directory;
}

FileWrapper newCodePage(const std::string& filename, const std::string& name) {
  auto directory =
      MarletBookPageSnapshot(name, std::nullopt, std::nullopt, filename, u"print(\"Hello!\")\n", {},
                             std::nullopt, std::nullopt, std::nullopt, LiveViewMode::HiddenByDefault, true,
                             std::nullopt, MarletLoggingMode::Normal, {})
          .fileWrapper();
  directory.setPreferredFilename(filename);
  return directory;
}

FileWrapper newCutscenePage(const std::string& filename, const std::string& name) {
  auto directory = CutsceneBookPageSnapshot(name, filename, "Cutscene.html", std::nullopt, std::nullopt,
                                            std::nullopt, std::nullopt)
                       .fileWrapper();
  auto resources = FileWrapper::directory();
  add(resources, "Cutscene.html",
      FileWrapper::regularFile(Data(std::string("<!DOCTYPE html>\n<title>Cutscene</title>\n"))));
  add(directory, "Resources", std::move(resources));
  directory.setPreferredFilename(filename);
  return directory;
}

void addListed(FileWrapper& parent, const std::string& key, FileWrapper& directory, FileWrapper item) {
  auto manifest =
      fromPropertyListData<PropertyListValue>(*parent.child("Manifest.plist")->regularFileContents());
  auto& entries = std::get<PropertyListDictionary>(manifest.payload);
  std::get<PropertyListValue::Array>(entries[key].payload).emplace_back(*item.preferredFilename());
  directory.addFileWrapper(std::move(item));
  add(parent, "Manifest.plist", xmlFile(manifest));
}
