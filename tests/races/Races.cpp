/// Writers and readers of one book at the same time, in threads and in processes, one process of each round held at its
/// calls to the file system. After each round every write that reported success is there, every reader saw one state,
/// and nothing lies beside the document.
///
/// races LIBRARY SECONDS [SEED]: LIBRARY holds the calls of a process that it is preloaded into.

#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iostream>
#include <map>
#include <random>
#include <set>
#include <thread>

#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;
using MarletDiff::FileDiffDescriptor;

namespace {

constexpr int Processes = 3, ThreadsEach = 4, Kinds = 6;
constexpr auto RoundLength = std::chrono::milliseconds(1500);
const std::string Chapter = "Contents/Chapters/One.marletchapter/";
const std::string Head = "// Authored.\n//#-editable-code\n", Tail = "//#-end-editable-code\n";

std::string pagePath(const std::string& name) { return Chapter + "Pages/" + name + ".marletpage/"; }
std::string text(const FileWrapper& tree, const std::string& path) {
  auto node = std::optional(tree);
  for (const auto& part : fs::path(path)) node = node ? node->child(part.string()) : std::nullopt;
  const auto contents = node ? node->regularFileContents() : std::nullopt;
  return contents ? std::string(contents->view()) : "-";
}

FileWrapper directoryAt(FileWrapper tree, const std::string& path) {
  for (const auto& part : fs::path(path)) {
    auto next = tree.child(part.string());
    if (!next) {
      next = FileWrapper::directory();
      next->setPreferredFilename(part.string());
      tree.addFileWrapper(*next);
    }
    tree = *next;
  }
  return tree;
}

void put(const FileWrapper& tree, std::string path, FileWrapper item) {
  if (path.ends_with('/')) path.pop_back();
  const auto parts = fs::path(path);
  item.setPreferredFilename(parts.filename().string());
  directoryAt(tree, parts.parent_path().string()).addFileWrapper(std::move(item));
}
void put(const FileWrapper& tree, const std::string& path, const std::string& contents) {
  put(tree, path, FileWrapper::regularFile(Data(contents)));
}

FileWrapper propertyList(PropertyListDictionary values) {
  return FileWrapper::regularFile(
      PropertyListSerialization::write(PropertyListValue(std::move(values)), PropertyListFormat::xml));
}

FileWrapper page(const std::string& name, const std::string& source) {
  auto tree = FileWrapper::directory();
  put(tree, "Manifest.plist", propertyList({{"Name", name}, {"LiveViewMode", "HiddenByDefault"}}));
  put(tree, "Contents.swift", source);
  put(tree, "Resources/keep.txt", "kept");
  return tree;
}

void makeBook(const URL& url) {
  auto book = FileWrapper::directory();
  put(book, "Contents/Manifest.plist",
      propertyList({{"Version", "1.0"},
                    {"Name", "Races"},
                    {"ContentIdentifier", "org.example.races"},
                    {"ContentVersion", "1.0"},
                    {"DeploymentTarget", "slateos9.0"},
                    {"Chapters", PropertyListValue::Array{"One.marletchapter"}}}));
  PropertyListValue::Array pages;
  for (int id = 0; id < Processes * ThreadsEach; ++id) {
    for (const auto* prefix : {"L", "P"}) {
      const auto name = prefix + std::to_string(id);
      put(book, pagePath(name), page("0", Head + "0\n" + Tail));
      pages.push_back(name + ".marletpage");
    }
  }
  put(book, Chapter + "Manifest.plist", propertyList({{"Name", "One"}, {"Pages", std::move(pages)}}));
  put(book, "Edits/UserResources/drawing", "a learner's");
  book.write(url);
}

/// One writer of a thread's own things in the book; `k` counts its successes.
struct Writer {
  URL url;
  std::string id;
  std::string scratch;

  std::string learnerSource(const std::string& token) const { return Head + token + "\n" + Tail; }

  void edit(const std::string& token) const {
    auto book = openBook(url);
    const auto pack = book.userEdits
                          ? *book.userEdits
                          : makeUserEditDiffPack(book.snapshot, url.appendingPathComponent("Contents", true));
    const auto edited = updatedUserEditDiffPack(
        pack, {{pagePath("L" + id).substr(9) + "Contents.swift", Data(learnerSource(token))},
               {"Resources/learner-" + id, Data(token)}});
    put(book.document, "Edits/UserEdits.diffpack", edited.fileWrapper());
    book.document.write(url);
  }

  void savePage(const std::string& token) const {
    const auto place = url.appendingPathComponent(pagePath("P" + id), true);
    MarletBookPage live{MarletBookPageSnapshot(FileWrapper(place), place, std::nullopt)};
    live.setName(token);
    live.text() = *utf16FromUTF8(learnerSource(token));
    live.snapshot().fileWrapper().write(place);
  }

  void saveBook(const std::string& token) const {
    const FileWrapper book(url);
    put(book, "Contents/Resources/book-" + id, token);
    put(book, "Contents/Sources/book-" + id, token);
    book.write(url);
  }

  void addPage(const std::string& token) const {
    auto book = openBook(url);
    auto manifest = book.snapshot.chapters[0].manifest();
    auto& pages = std::get<PropertyListDictionary>(manifest.payload)["Pages"];
    const auto name = "N" + id + "-" + token;
    std::get<PropertyListValue::Array>(pages.payload).push_back(name + ".marletpage");
    put(book.document, Chapter + "Manifest.plist",
        propertyList(std::get<PropertyListDictionary>(std::move(manifest.payload))));
    put(book.document, pagePath(name), page(token, "1\n"));
    book.document.write(url);
  }

  void update(const std::string& token) const {
    const auto source = URL::file(scratch + "/update-" + id, true);
    auto files = FileWrapper::directory();
    put(files, "Resources/update-" + id, token);
    put(files, "Sources/update-" + id, token);
    files.write(source);
    std::vector<FileDiffDescriptor> updates{
        {FileDiffDescriptor::Added{"Resources/update-" + id, std::nullopt}},
        {FileDiffDescriptor::Added{"Sources/update-" + id, std::nullopt}}};
    applyUpdateDiffPack(url, DiffPackSnapshot(DiffPackType::UpdatePack, DiffPackDocumentType::MarletBook,
                                              source, "org.example.races", "1.0", "1.0", std::move(updates)));
  }

  void saveStore(const std::string& token) const {
    FileManager::writeFileAtomically(url.appendingPathComponent("Contents/store-" + id, false), Data(token));
  }
};

using Write = void (Writer::*)(const std::string&) const;
constexpr Write Writes[Kinds] = {&Writer::edit,    &Writer::savePage, &Writer::saveBook,
                                 &Writer::addPage, &Writer::update,   &Writer::saveStore};

struct Finding {
  std::string what;
};
void expect(bool holds, const std::string& what) {
  if (!holds) throw Finding{what};
}

/// What holds of each state of the book.
void readOnce(const URL& url, int writers) {
  const auto book = openBook(url);
  for (const auto& chapter : book.snapshot.chapters)
    expect(!chapter.pages.empty(), "a chapter without pages");
  // What nobody has looked at yet goes away with the tree that another writer displaced.
  expect(text(book.document, "Edits/UserResources/drawing") == "a learner's" || !book.document.isUnchanged(),
         "no drawing");
  for (int id = 0; id < writers; ++id) {
    const auto number = std::to_string(id);
    for (const std::string kind : {"book-", "update-"}) {
      const auto one = text(book.document, "Contents/Resources/" + kind + number),
                 other = text(book.document, "Contents/Sources/" + kind + number);
      expect(one == other || !book.document.isUnchanged(),
             kind + number + " is a mixture: " + one + ", " + other);
    }
    const auto page = snapshotForPageWithFilename("P" + number + ".marletpage", "One.marletchapter", url);
    const auto& code = dynamic_cast<const MarletBookPageSnapshot&>(*page);
    const auto source = *utf8FromUTF16(code.text());
    expect(source == Head + code.name() + "\n" + Tail,
           "page P" + number + " is a mixture: " + code.name() + source);
    expect(code.resourcesDirectoryURL().has_value(), "page P" + number + " without resources");
  }
}

/// Runs writers and readers of a process until the round ends; what each achieved last goes to its log.
int work(const URL& url, const std::string& scratch, int process, unsigned seed) {
  std::atomic<int> findings = 0;
  std::vector<std::thread> threads;
  const auto end = std::chrono::steady_clock::now() + RoundLength;
  for (int thread = 0; thread < ThreadsEach; ++thread) {
    const int id = process * ThreadsEach + thread;
    threads.emplace_back([&, id] {
      std::ofstream log(scratch + "/log-" + std::to_string(id));
      const Writer writer{url, std::to_string(id), scratch};
      const int kind = static_cast<int>((seed + static_cast<unsigned>(id)) % (Kinds + 1));
      for (int k = 1; std::chrono::steady_clock::now() < end; ++k) {
        const auto token = std::to_string(k);
        try {
          if (kind == Kinds) {
            readOnce(url, Processes * ThreadsEach);
          } else {
            (writer.*Writes[kind])(token);
          }
          log << kind << " " << token << "\n" << std::flush;
        } catch (const Finding& finding) {
          std::cout << finding.what << std::endl;
          ++findings;
        } catch (const ErrorObject& error) {
          log << "refused " << error.code() << "\n" << std::flush;
          if (error.code() == ESTALE || error.code() == EBUSY) continue;
          std::cout << "kind " << kind << ": " << error.description() << std::endl;
          ++findings;
        } catch (const Error& error) {
          std::cout << "kind " << kind << ": " << error.description() << std::endl;
          ++findings;
        }
      }
    });
  }
  for (auto& thread : threads) thread.join();
  return findings == 0 ? 0 : 1;
}

struct Counts {
  int rounds = 0, done = 0, refused = 0, findings = 0;
};

/// Holds what the logs say was written against the book.
void verify(const URL& url, const std::string& scratch, Counts& counts) {
  const auto expectNow = [&](bool holds, const std::string& what) {
    if (holds) return;
    ++counts.findings;
    std::cout << "round " << counts.rounds << ": " << what << std::endl;
  };
  const auto book = openBook(url);
  std::set<std::string> pages;
  for (const auto& page : book.snapshot.chapters[0].pages) pages.insert(page.filename);
  for (int id = 0; id < Processes * ThreadsEach; ++id) {
    const auto number = std::to_string(id);
    std::ifstream log(scratch + "/log-" + number);
    std::map<std::string, std::string> last;
    for (std::string kind, token; log >> kind >> token;) {
      ++(kind == "refused" ? counts.refused : counts.done);
      last[kind] = token;
      if (kind == "3")
        expectNow(pages.contains("N" + number + "-" + token + ".marletpage"), "no page " + token);
    }
    const auto at = [&](const std::string& path) { return text(book.document, path); };
    const auto pack = book.userEdits;
    const auto learner = [&](const std::string& path) {
      const auto data = pack ? mergedUserEdit(*pack, path) : std::nullopt;
      return data ? std::string(data->view()) : "-";
    };
    for (const auto& [kind, token] : last) {
      const auto lost = "writer " + number + " of kind " + kind + " lost " + token;
      if (kind == "0") {
        expectNow(learner(pagePath("L" + number).substr(9) + "Contents.swift") == Head + token + "\n" + Tail,
                  lost);
        expectNow(learner("Resources/learner-" + number) == token, lost);
      }
      if (kind == "1") {
        expectNow(at(pagePath("P" + number) + "Contents.swift") == Head + token + "\n" + Tail, lost);
        expectNow(at(pagePath("P" + number) + "Resources/keep.txt") == "kept", lost + "'s resources");
      }
      if (kind == "2") expectNow(at("Contents/Sources/book-" + number) == token, lost);
      if (kind == "4") expectNow(at("Contents/Resources/update-" + number) == token, lost);
      if (kind == "5") expectNow(at("Contents/store-" + number) == token, lost);
    }
  }
  expectNow(text(book.document, "Edits/UserResources/drawing") == "a learner's", "the drawing is lost");
  for (const auto& entry : fs::recursive_directory_iterator(fs::path(url.path()).parent_path())) {
    const auto name = entry.path().filename().string();
    expectNow(name.find(".stage.") == std::string::npos && name.find(".displaced") == std::string::npos,
              "left " + entry.path().string());
  }
}

}  // namespace

int main(int count, char** arguments) {
  if (count == 6 && std::string(arguments[1]) == "work") {
    return work(URL::file(arguments[2], true), arguments[3], std::stoi(arguments[4]),
                static_cast<unsigned>(std::stoul(arguments[5])));
  }
  if (count < 3) return 2;
  const std::string library = arguments[1];
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(std::stoi(arguments[2]));
  std::mt19937 random(count > 3 ? static_cast<unsigned>(std::stoul(arguments[3])) : 1u);
  std::string scratch = (fs::temp_directory_path() / "races-XXXXXX").string();
  if (!::mkdtemp(scratch.data())) return 2;
  Counts counts;
  while (std::chrono::steady_clock::now() < end && counts.findings == 0) {
    ++counts.rounds;
    fs::remove_all(scratch);
    fs::create_directories(scratch + "/place");
    const auto url = URL::file(scratch + "/place/Races.marletbook", true);
    makeBook(url);
    const auto seed = std::to_string(random() % 1000);
    for (int process = 0; process < Processes; ++process) {
      if (::fork() != 0) continue;
      if (process == 0) {
        ::setenv("LD_PRELOAD", library.c_str(), 1);
        ::setenv("FAULT", "hold", 1);
        ::setenv("FAULT_EVERY", std::to_string(20 + random() % 400).c_str(), 1);
      }
      ::execl("/proc/self/exe", "races", "work", url.path().c_str(), scratch.c_str(),
              std::to_string(process).c_str(), seed.c_str(), nullptr);
      ::_exit(127);
    }
    for (int status; ::wait(&status) > 0;) {
      if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) ++counts.findings;
    }
    try {
      verify(url, scratch, counts);
    } catch (const Error& error) {
      ++counts.findings;
      std::cout << "the book doesn't open: " << error.description() << std::endl;
    }
  }
  std::cout << counts.rounds << " rounds, " << counts.done << " done, " << counts.refused << " refused, "
            << counts.findings << " findings" << std::endl;
  if (counts.findings == 0) fs::remove_all(scratch);
  return counts.findings == 0 ? 0 : 1;
}
